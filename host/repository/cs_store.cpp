// The repository file: an SQLite database that Commit builds beside the old file and renames
// into place, and that Restore reads back after checking its format, its structure and the
// checksum of its content. docs/repository.md documents the schema.
#include <sqlite3.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <unordered_map>
#include <variant>
#include <vector>

#include "host/design/ndm.h"
#include "host/design/ndm_lookup.h"
#include "host/port/atomic_file.h"
#include "host/port/file.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

const Cs_ConstraintType* Cs_FindConstraintType(const char* name);
std::unique_ptr<Cs_Constraint> Cs_MakeConstraint(const Cs_ConstraintType& type);

namespace {

constexpr const char* kFormat = "lun-repository";
constexpr int kVersion = 3;

Cs_CommitFaultHook g_fault_hook = nullptr;

constexpr const char* kSchema = R"(
CREATE TABLE meta (key TEXT PRIMARY KEY, value TEXT);
CREATE TABLE source (id INTEGER PRIMARY KEY, file TEXT, syntax INTEGER, hash INTEGER, size INTEGER,
                     was_read INTEGER);
CREATE TABLE constraints (id INTEGER PRIMARY KEY, source_id INTEGER REFERENCES source(id), line INTEGER,
                          type TEXT, scope TEXT, target TEXT, attribute TEXT, value TEXT, flag INTEGER,
                          statement TEXT, parent_id INTEGER REFERENCES constraints(id), block TEXT,
                          entry TEXT, stored TEXT);
CREATE TABLE path (constraint_id INTEGER REFERENCES constraints(id), grp TEXT);
CREATE TABLE association (constraint_id INTEGER REFERENCES constraints(id), object_kind TEXT, object TEXT,
                          other_id INTEGER REFERENCES constraints(id));
CREATE TABLE conflict (constraint_id INTEGER REFERENCES constraints(id), type INTEGER, object_kind TEXT,
                       object TEXT, by_id INTEGER REFERENCES constraints(id));
CREATE TABLE status (source_id INTEGER REFERENCES source(id), status_id INTEGER, severity INTEGER,
                     number INTEGER, message TEXT, file TEXT, line INTEGER,
                     constraint_id INTEGER REFERENCES constraints(id));
CREATE INDEX constraints_by_target ON constraints(target);
CREATE INDEX association_by_object ON association(object);
)";

// A column value: NULL, an integer or a byte text.
using Value = std::variant<std::monostate, int64_t, std::string>;
using Row = std::vector<Value>;

// A 64-bit checksum of the rows in the order they are written and read back: each value
// (its kind, and its number or the hash of its text) is mixed in turn.
struct Checksum {
    uint64_t h = 0x9E3779B97F4A7C15ULL;
    void Mix(uint64_t v) {
        h ^= v + 0x9E3779B97F4A7C15ULL + (h << 6) + (h >> 2);
        h *= 0xBF58476D1CE4E5B9ULL;
        h ^= h >> 31;
    }
    void Add(const Row& row) {
        for (const Value& v : row) {
            Mix(v.index());
            if (auto* i = std::get_if<int64_t>(&v)) Mix(static_cast<uint64_t>(*i));
            if (auto* s = std::get_if<std::string>(&v)) Mix(Ndm_NamePool::Hash(*s) ^ s->size());
        }
        Mix(0xff);
    }
};

// Rows read back: their cells in one array and their texts in one buffer, so that reading
// costs no allocation per row or text.
class Table {
public:
    struct Cell {
        int64_t number = 0;
        uint32_t offset = 0, size = 0;
        uint8_t kind = 0;  // the index a Value of the cell would have: 0 null, 1 number, 2 text
    };
    struct CellRef {
        const Table* table;
        const Cell* cell;
    };
    class RowRef {
    public:
        RowRef(const Table* table, size_t row) : table_(table), row_(row) {}
        CellRef operator[](size_t column) const { return {table_, &table_->cells_[row_ * table_->columns_ + column]}; }
        size_t size() const { return table_->columns_; }

    private:
        const Table* table_;
        size_t row_;
    };
    struct Iterator {
        const Table* table;
        size_t row;
        RowRef operator*() const { return {table, row}; }
        Iterator& operator++() {
            ++row;
            return *this;
        }
        bool operator!=(const Iterator& other) const { return row != other.row; }
    };

    explicit Table(size_t columns) : columns_(columns) {}
    size_t size() const { return columns_ ? cells_.size() / columns_ : 0; }
    RowRef operator[](size_t row) const { return {this, row}; }
    Iterator begin() const { return {this, 0}; }
    Iterator end() const { return {this, size()}; }
    std::string_view Text(const Cell& c) const { return {texts_.data() + c.offset, c.size}; }
    // Appends the current row of a statement.
    void Add(sqlite3_stmt* st) {
        for (size_t i = 0; i < columns_; ++i) {
            const int col = static_cast<int>(i);
            Cell cell;
            switch (sqlite3_column_type(st, col)) {
                case SQLITE_NULL: break;
                case SQLITE_INTEGER:
                    cell.kind = 1;
                    cell.number = sqlite3_column_int64(st, col);
                    break;
                default: {
                    const char* text = reinterpret_cast<const char*>(sqlite3_column_text(st, col));
                    cell.kind = 2;
                    cell.offset = static_cast<uint32_t>(texts_.size());
                    cell.size = static_cast<uint32_t>(sqlite3_column_bytes(st, col));
                    if (text) texts_.append(text, cell.size);
                }
            }
            cells_.push_back(cell);
        }
    }

private:
    size_t columns_;
    std::vector<Cell> cells_;
    std::string texts_;
};

int64_t Int(Table::CellRef v) { return v.cell->kind == 1 ? v.cell->number : 0; }
std::string_view Str(Table::CellRef v) { return v.cell->kind == 2 ? v.table->Text(*v.cell) : std::string_view(); }
bool IsNull(Table::CellRef v) { return v.cell->kind == 0; }

void AddToChecksum(Checksum& sum, Table::RowRef row) {
    for (size_t i = 0; i < row.size(); ++i) {
        Table::CellRef v = row[i];
        sum.Mix(v.cell->kind);
        if (v.cell->kind == 1) sum.Mix(static_cast<uint64_t>(v.cell->number));
        if (v.cell->kind == 2) sum.Mix(Ndm_NamePool::Hash(Str(v)) ^ v.cell->size);
    }
    sum.Mix(0xff);
}

const char* ScopeName(Cs_Scope s) { return Cs_ScopeWord(s); }
bool ScopeFrom(std::string_view word, Cs_Scope& out) {
    for (Cs_Scope s : {Cs_Scope::Instance, Cs_Scope::Net, Cs_Scope::Pin, Cs_Scope::Design, Cs_Scope::TimeSpec,
                       Cs_Scope::TimeGroup, Cs_Scope::AreaGroup, Cs_Scope::Set, Cs_Scope::Comment})
        if (word == Cs_ScopeWord(s)) {
            out = s;
            return true;
        }
    return false;
}

bool BlockFrom(std::string_view word, Cs_Block& out) {
    for (Cs_Block b : {Cs_Block::TimeSpec, Cs_Block::TimeGroup, Cs_Block::Config})
        if (word == Cs_BlockWord(b)) {
            out = b;
            return true;
        }
    return false;
}

// A design object as (kind, full name); networks by their top signal's full name.
std::pair<const char*, std::string> ObjectName(const Ndm_PropertyHolder* o) {
    switch (o->GetKind()) {
        case Ndm_ObjKind::Block: return {"block", static_cast<const Ndm_Block*>(o)->GetFullName()};
        case Ndm_ObjKind::Network: {
            const Ndm_Signal* top = static_cast<const Ndm_Network*>(o)->GetTopSignal();
            return {"network", top ? top->GetFullName() : std::string()};
        }
        case Ndm_ObjKind::Signal: return {"signal", static_cast<const Ndm_Signal*>(o)->GetFullName()};
        case Ndm_ObjKind::Pin: return {"pin", static_cast<const Ndm_Pin*>(o)->GetFullName()};
        default: return {"design", o->GetName() ? o->GetName() : ""};
    }
}

// The object of the view named (kind, full name), or null.
Ndm_PropertyHolder* FindObject(Ndm_View* view, std::string_view kind, std::string_view full_name) {
    if (!view || !view->GetBlock()) return nullptr;
    Ndm_Block* top = view->GetBlock();
    Ndm_LookupReport silent;
    const std::string name(full_name);
    const std::string path = std::string(top->GetName()) + "/" + name;
    if (kind == "block") return name.empty() ? top : Ndm_Lookup::FindBlockPath(top, path, true, silent);
    if (kind == "network" || kind == "signal") {
        Ndm_Signal* s = name.find('/') == std::string::npos ? top->GetSignalByName(name.c_str())
                                                            : Ndm_Lookup::FindSignalPath(top, path.c_str(), true, silent);
        if (!s) return nullptr;
        if (kind == "signal") return s;
        return s->GetNetwork();
    }
    if (kind == "pin") {
        if (Ndm_Pin* p = top->GetPinByName(name.c_str())) return p;
        return Ndm_Lookup::FindPinPath(top, path.c_str(), true, silent);
    }
    return nullptr;
}


class Db {
public:
    ~Db() {
        for (auto& [sql, st] : statements_) sqlite3_finalize(st);
        if (db_) sqlite3_close(db_);
    }
    bool Open(const std::string& path, int flags, std::string& error) {
        // One thread uses a connection: no locking around every call.
        if (sqlite3_open_v2(path.c_str(), &db_, flags | SQLITE_OPEN_NOMUTEX, nullptr) != SQLITE_OK) {
            error = db_ ? sqlite3_errmsg(db_) : "cannot open";
            return false;
        }
        sqlite3_extended_result_codes(db_, 1);
        return true;
    }
    bool Exec(const char* sql, std::string& error) {
        char* message = nullptr;
        if (sqlite3_exec(db_, sql, nullptr, nullptr, &message) == SQLITE_OK) return true;
        error = message ? message : sqlite3_errmsg(db_);
        sqlite3_free(message);
        return false;
    }
    sqlite3_stmt* Prepare(const char* sql, std::string& error) {
        auto it = statements_.find(sql);
        if (it != statements_.end()) {
            sqlite3_reset(it->second);
            return it->second;
        }
        sqlite3_stmt* st = nullptr;
        if (int rc = sqlite3_prepare_v2(db_, sql, -1, &st, nullptr); rc != SQLITE_OK) {
            error = sqlite3_errmsg(db_);
            code_ = rc;
            return nullptr;
        }
        statements_[sql] = st;
        return st;
    }
    // Inserts one row; the checksum sees it unless sum is null.
    bool Insert(const char* sql, const Row& row, Checksum* sum, std::string& error) {
        sqlite3_stmt* st = Prepare(sql, error);
        if (!st) return false;
        for (size_t i = 0; i < row.size(); ++i) {
            const int col = static_cast<int>(i) + 1;
            if (auto* n = std::get_if<int64_t>(&row[i]))
                sqlite3_bind_int64(st, col, *n);
            else if (auto* s = std::get_if<std::string>(&row[i]))
                sqlite3_bind_text(st, col, s->data(), static_cast<int>(s->size()), SQLITE_TRANSIENT);
            else
                sqlite3_bind_null(st, col);
        }
        if (sqlite3_step(st) != SQLITE_DONE) {
            error = sqlite3_errmsg(db_);
            return false;
        }
        if (sum) sum->Add(row);
        return true;
    }
    // Reads every row of a query.
    bool Select(const char* sql, Table& rows, std::string& error) {
        sqlite3_stmt* st = Prepare(sql, error);
        if (!st) return false;
        int rc;
        while ((rc = sqlite3_step(st)) == SQLITE_ROW) rows.Add(st);
        if (rc != SQLITE_DONE) {
            error = sqlite3_errmsg(db_);
            code_ = rc;
            return false;
        }
        return true;
    }
    // The primary result code of the last failed step (SQLITE_CORRUPT, SQLITE_NOTADB, ...).
    int code() const { return code_ & 0xff; }

private:
    int code_ = SQLITE_OK;
    sqlite3* db_ = nullptr;
    std::map<std::string, sqlite3_stmt*> statements_;
};

std::shared_ptr<Cs_Status> Problem(const char* verb, const std::string& path, const std::string& why) {
    return std::make_shared<Cs_Status_Parse>(Cs_StatusID::REPOSITORY_ERROR, 90,
                                             Port_Format("Cannot %s repository file '%s': %s.", verb, path.c_str(),
                                                         why.c_str()),
                                             path, 0);
}

bool Step(const char* step) { return !g_fault_hook || g_fault_hook(step); }


}  // namespace

void Cs_SetCommitFaultHook(Cs_CommitFaultHook hook) {
    g_fault_hook = hook;
    Port::SetSaveFaultHook(hook);  // the steps of the save itself
}

class Cs_Store {
public:
    static Cs_ReturnCode Commit(const Cs_ConstraintMgr& mgr, const std::string& path);
    static Cs_ReturnCode Restore(Cs_ConstraintMgr& mgr, const std::string& path);
};

Cs_ReturnCode Cs_Store::Commit(const Cs_ConstraintMgr& mgr, const std::string& path) {
    Cs_ReturnCode outcome;
    // SQLite writes the new file under the temporary name; the save moves it into place.
    Port::AtomicFile file(path, Port::AtomicFile::kByCaller);
    const std::string& temp = file.temp_path();
    auto fail = [&](const std::string& why) {
        outcome.Add(Problem("write", path, why));
        return outcome;
    };
    if (!file.error().empty()) return fail(file.error());
    std::string error;
    {
        Db db;
        if (!Step("open") || !db.Open(temp, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, error))
            return fail(error.empty() ? "cannot create " + temp : error);
        if (!db.Exec("PRAGMA journal_mode=OFF; PRAGMA synchronous=OFF; PRAGMA foreign_keys=OFF;", error) ||
            !db.Exec(kSchema, error) || !db.Exec("BEGIN", error))
            return fail(error);
        Checksum sum;
        std::unordered_map<const Cs_Constraint*, int64_t> ids;
        int64_t next = 0;
        mgr.ForEach([&](const Cs_Constraint& c) { ids[&c] = ++next; });
        auto id_of = [&](const Cs_Constraint* c) -> Value {
            auto it = c ? ids.find(c) : ids.end();
            return it == ids.end() ? Value() : Value(it->second);
        };
        std::unordered_map<std::string, int64_t> source_ids;
        int64_t source_id = 0;
        bool ok = Step("write");
        for (const auto& s : mgr.sources_) {
            const Cs_FileInfo& info = *s.info;
            source_ids[info.GetFileName()] = ++source_id;
            ok = ok && db.Insert("INSERT INTO source VALUES (?,?,?,?,?,?)",
                                 {source_id, std::string(info.GetFileName()), int64_t{info.GetSyntax()},
                                  static_cast<int64_t>(info.GetHash()), static_cast<int64_t>(info.GetSize()),
                                  int64_t{info.WasRead()}},
                                 &sum, error);
        }
        mgr.ForEach([&](const Cs_Constraint& c) {
            if (!ok) return;
            const Cs_SourceFile* where = c.GetSourceInfo()->GetSourceFile();
            Value src;
            if (where && source_ids.count(where->GetFile())) src.emplace<int64_t>(source_ids[where->GetFile()]);
            int64_t id = ids[&c];
            Value block, entry, stored;
            if (c.GetBlock() != Cs_Block::None) {
                block = std::string(Cs_BlockWord(c.GetBlock()));
                entry = std::string(c.GetEntryName());
                stored = std::string(c.GetStoredText());
            }
            ok = db.Insert("INSERT INTO constraints VALUES (?,?,?,?,?,?,?,?,?,?,?,?,?,?)",
                           {id, src, int64_t{where ? where->GetLine() : 0}, std::string(c.GetType().GetName()),
                            std::string(ScopeName(c.GetScope())), std::string(c.GetTarget()),
                            std::string(c.GetAttribute()), std::string(c.GetValueText()), int64_t{c.IsFlag()},
                            std::string(c.GetStatementText()), id_of(c.Parent()), block, entry, stored},
                           &sum, error);
            for (const char* g : c.GetAssociatedPaths())
                ok = ok && db.Insert("INSERT INTO path VALUES (?,?)", {id, std::string(g)}, &sum, error);
            for (const Ndm_PropertyHolder* o : c.GetAssociatedDesignObjs()) {
                auto [kind, name] = ObjectName(o);
                ok = ok && db.Insert("INSERT INTO association VALUES (?,?,?,?)",
                                     {id, std::string(kind), name, Value()}, &sum, error);
            }
            for (const Cs_Constraint* other : c.GetAssociatedConstraints()) {
                if (other == c.Parent()) continue;
                ok = ok && db.Insert("INSERT INTO association VALUES (?,?,?,?)",
                                     {id, std::string("constraint"), Value(), id_of(other)}, &sum, error);
            }
            for (const Cs_Conflict& k : c.GetConflicts()) {
                Value kind, name;
                if (k.GetDesignEntity()) {
                    auto [kk, nn] = ObjectName(k.GetDesignEntity());
                    kind = std::string(kk);
                    name = nn;
                }
                ok = ok && db.Insert("INSERT INTO conflict VALUES (?,?,?,?,?)",
                                     {id, int64_t{k.GetType()}, kind, name, id_of(k.GetConflictingConstraint())},
                                     &sum, error);
            }
        });
        auto status_row = [&](const Cs_Status& st, Value source) {
            Value file, line, constraint;
            if (auto* p = dynamic_cast<const Cs_Status_Parse*>(&st)) {
                file = std::string(p->GetSourceFile()->GetFile() ? p->GetSourceFile()->GetFile() : "");
                line = int64_t{p->GetSourceFile()->GetLine()};
            }
            if (auto* r = dynamic_cast<const Cs_Status_Resolution*>(&st)) {
                constraint = id_of(r->GetConstraint());
                const Cs_SourceFile* at = r->GetConstraint() ? r->GetConstraint()->GetSourceInfo()->GetSourceFile() : nullptr;
                if (at) {
                    file = std::string(at->GetFile());
                    line = int64_t{at->GetLine()};
                }
            }
            ok = ok && db.Insert("INSERT INTO status VALUES (?,?,?,?,?,?,?,?)",
                                 {source, int64_t{static_cast<int>(st.GetID())}, int64_t{st.GetSeverity()},
                                  int64_t{st.GetLocalizedMsgNum()}, st.GetMessage(), file, line, constraint},
                                 &sum, error);
        };
        for (const auto& s : mgr.sources_)
            for (const auto& st : s.parse) status_row(*st, source_ids[s.info->GetFileName()]);
        for (const auto& st : mgr.resolution_) status_row(*st, Value());
        const Ndm_Design* design = mgr.GetDesign();
        char hex[32];
        std::snprintf(hex, sizeof hex, "%016llx", static_cast<unsigned long long>(sum.h));
        ok = ok && db.Insert("INSERT INTO meta VALUES (?,?)", {std::string("format"), std::string(kFormat)}, nullptr, error) &&
             db.Insert("INSERT INTO meta VALUES (?,?)", {std::string("version"), std::to_string(kVersion)}, nullptr, error) &&
             db.Insert("INSERT INTO meta VALUES (?,?)",
                       {std::string("design"), std::string(design && design->GetName() ? design->GetName() : "")},
                       nullptr, error) &&
             db.Insert("INSERT INTO meta VALUES (?,?)",
                       {std::string("design_stamp"), design ? design->GetSourceStamp() : std::string()}, nullptr,
                       error) &&
             db.Insert("INSERT INTO meta VALUES (?,?)", {std::string("content_checksum"), std::string(hex)}, nullptr,
                       error);
        if (!ok) return fail(error.empty() ? "writing was interrupted" : error);
        if (!db.Exec("COMMIT", error)) return fail(error);
    }
    if (!file.Commit()) return fail(file.error());
    return outcome;
}

Cs_ReturnCode Cs_Store::Restore(Cs_ConstraintMgr& mgr, const std::string& path) {
    Cs_ReturnCode outcome;
    auto fail = [&](const std::string& why) {
        outcome.Add(Problem("restore", path, why));
        return outcome;
    };
    if (::access(path.c_str(), R_OK) != 0) return fail(std::strerror(errno));
    std::string error;
    Db db;
    // Read-only and immutable: restoring never changes the file, not even a lock byte.
    std::string uri = "file:";
    for (char c : path) {
        if (c == '?' || c == '#' || c == '%') {
            char buf[4];
            std::snprintf(buf, sizeof buf, "%%%02X", static_cast<unsigned char>(c));
            uri += buf;
        } else {
            uri += c;
        }
    }
    uri += "?immutable=1";
    if (!db.Open(uri, SQLITE_OPEN_READONLY | SQLITE_OPEN_URI, error)) return fail(error);
    db.Exec("PRAGMA mmap_size=1073741824;", error);  // pages read in place where the system allows
    Table meta(2);
    if (!db.Select("SELECT key, value FROM meta", meta, error)) {
        if (db.code() == SQLITE_CORRUPT) return fail("it is damaged (" + error + ")");
        return fail("it is not a repository file (" + error + ")");
    }
    std::map<std::string, std::string> info;
    for (Table::RowRef r : meta) info[std::string(Str(r[0]))] = Str(r[1]);
    if (info["format"] != kFormat) return fail("it is not a repository file");
    int version = std::atoi(info["version"].c_str());
    if (version > kVersion)
        return fail(Port_Format("it was written in format %d by a newer version; this program reads format %d",
                                version, kVersion));
    if (version < 1) return fail("its format version is missing");
    if (version < kVersion)
        return fail(Port_Format("it was written in format %d by an older version; this program reads format %d",
                                version, kVersion));
    // No structure check of its own: a damaged page fails the reads below, and the checksum of
    // every row read finds any other change.
    Table sources(6), constraints(14), paths(2), assocs(4), conflicts(5), statuses(8);
    if (!db.Select("SELECT * FROM source ORDER BY rowid", sources, error) ||
        !db.Select("SELECT * FROM constraints ORDER BY rowid", constraints, error))
        return fail("it is damaged (" + error + ")");
    // Rows of the per-constraint tables come back in the order they were written, which
    // interleaves them per constraint; read them that way so that the checksum agrees.
    if (!db.Select("SELECT * FROM path ORDER BY rowid", paths, error) ||
        !db.Select("SELECT * FROM association ORDER BY rowid", assocs, error) ||
        !db.Select("SELECT * FROM conflict ORDER BY rowid", conflicts, error) ||
        !db.Select("SELECT * FROM status ORDER BY rowid", statuses, error))
        return fail("it is damaged (" + error + ")");
    // The checksum covers the rows in writing order: each constraint, then its paths,
    // associations and conflicts, then the statuses.
    {
        Checksum again;
        for (Table::RowRef r : sources) AddToChecksum(again, r);
        size_t p = 0, a = 0, k = 0;
        for (Table::RowRef c : constraints) {
            AddToChecksum(again, c);
            int64_t id = Int(c[0]);
            while (p < paths.size() && Int(paths[p][0]) == id) AddToChecksum(again, paths[p++]);
            while (a < assocs.size() && Int(assocs[a][0]) == id) AddToChecksum(again, assocs[a++]);
            while (k < conflicts.size() && Int(conflicts[k][0]) == id) AddToChecksum(again, conflicts[k++]);
        }
        for (Table::RowRef r : statuses) AddToChecksum(again, r);
        char hex[32];
        std::snprintf(hex, sizeof hex, "%016llx", static_cast<unsigned long long>(again.h));
        if (p != paths.size() || a != assocs.size() || k != conflicts.size() || info["content_checksum"] != hex)
            return fail("it is damaged (its content does not match its checksum)");
    }

    // Build the new content aside; the repository changes only when everything was read.
    Cs_ConstraintMgr staged;
    std::unordered_map<int64_t, size_t> source_index;
    for (Table::RowRef r : sources) {
        Cs_ConstraintMgr::Source& s = staged.AddSource(std::string(Str(r[1])), static_cast<int>(Int(r[2])));
        s.info->hash_ = static_cast<uint64_t>(Int(r[3]));
        s.info->size_ = static_cast<uint64_t>(Int(r[4]));
        s.info->read_ = Int(r[5]) != 0;
        source_index[Int(r[0])] = staged.sources_.size() - 1;
    }
    std::unordered_map<int64_t, Cs_Constraint*> by_id;
    std::vector<std::pair<Cs_Constraint*, int64_t>> parents;
    for (Table::RowRef r : constraints) {
        const Cs_ConstraintType* type = Cs_FindConstraintType(std::string(Str(r[3])).c_str());
        Cs_Scope scope;
        if (!type || !ScopeFrom(Str(r[4]), scope)) return fail("it is damaged (unknown constraint kind)");
        std::unique_ptr<Cs_Constraint> c = Cs_MakeConstraint(*type);
        c->scope_ = scope;
        c->target_ = staged.Text(Str(r[5]));
        c->key_ = staged.Text(Str(r[6]));
        c->value_ = staged.Text(Str(r[7]));
        c->flag_ = Int(r[8]) != 0;
        c->statement_ = staged.Text(Str(r[9]));
        if (!IsNull(r[11]) && !BlockFrom(Str(r[11]), c->block_)) return fail("it is damaged (unknown constraint block)");
        if (!IsNull(r[11])) {
            c->More().entry = staged.Text(Str(r[12]));
            c->More().stored = staged.Text(Str(r[13]));
        }
        const char* file = nullptr;
        Cs_ConstraintMgr::Constraints* list = &staged.loose_;
        if (!IsNull(r[1])) {
            auto it = source_index.find(Int(r[1]));
            if (it == source_index.end()) return fail("it is damaged (a constraint of an unknown source)");
            Cs_ConstraintMgr::Source& s = staged.sources_[it->second];
            file = staged.Text(s.info->GetFileName());
            list = &s.constraints;
        }
        c->source_ = Cs_ConstraintSourceInfo(Cs_SourceFile(file, static_cast<int>(Int(r[2]))));
        if (!IsNull(r[10])) parents.emplace_back(c.get(), Int(r[10]));
        by_id[Int(r[0])] = c.get();
        list->push_back(std::move(c));
    }
    auto constraint = [&](Table::CellRef v) -> Cs_Constraint* {
        auto it = IsNull(v) ? by_id.end() : by_id.find(Int(v));
        return it == by_id.end() ? nullptr : it->second;
    };
    for (auto& [c, parent] : parents) {
        auto it = by_id.find(parent);
        if (it == by_id.end()) continue;
        c->More().parent = it->second;
        c->More().constraints.push_back(it->second);
    }
    Ndm_View* view = mgr.design_ ? mgr.design_->GetWorkView() : nullptr;
    for (Table::RowRef r : paths)
        if (Cs_Constraint* c = constraint(r[0])) c->More().paths.push_back(staged.Text(Str(r[1])));
    // What the constraints resolved to counts only for the design it was committed for; with no
    // design bound the names are kept for listings.
    const std::string& stamp = mgr.design_ ? mgr.design_->GetSourceStamp() : info["design_stamp"];
    const bool same_design = !stamp.empty() && stamp == info["design_stamp"];
    // The rows of one constraint come together; the constraints of one statement that found
    // the same objects share one list, as after a resolution.
    Cs_Constraint* filling = nullptr;
    const Cs_Constraint* filled = nullptr;
    std::vector<Ndm_PropertyHolder*> found;
    auto flush = [&] {
        if (!filling) return;
        const auto before = filled ? filled->GetAssociatedDesignObjs() : std::span<Ndm_PropertyHolder* const>();
        if (filled && found.size() > 1 && filled->GetStatementText() == filling->GetStatementText() &&
            std::equal(found.begin(), found.end(), before.begin(), before.end())) {
            filling->many_ = filled->many_;
            found.clear();
        } else {
            staged.SetObjects(*filling, found);
        }
        filled = filling;
        filling = nullptr;
    };
    for (Table::RowRef r : assocs) {
        Cs_Constraint* c = constraint(r[0]);
        if (!c) return fail("it is damaged (an association of an unknown constraint)");
        if (c != filling) flush();
        if (Str(r[1]) == "constraint") {
            if (Cs_Constraint* other = constraint(r[3])) c->More().constraints.push_back(other);
        } else if (!view) {
            staged.committed_[c].objects.emplace_back(Str(r[2]));
        } else if (!same_design) {
            continue;
        } else if (Ndm_PropertyHolder* o = FindObject(view, Str(r[1]), Str(r[2]))) {
            filling = c;
            found.push_back(o);
        }
    }
    flush();
    for (Table::RowRef r : conflicts) {
        Cs_Constraint* c = constraint(r[0]);
        if (!c) return fail("it is damaged (a conflict of an unknown constraint)");
        if (!IsNull(r[2]) && !view) {
            staged.committed_[c].overrides.emplace_back(constraint(r[4]), std::string(Str(r[3])));
            continue;
        }
        if (!IsNull(r[2]) && !same_design) continue;
        Ndm_PropertyHolder* entity = IsNull(r[2]) ? nullptr : FindObject(view, Str(r[2]), Str(r[3]));
        if (!IsNull(r[2]) && !entity) continue;  // an object the bound design no longer has
        c->More().conflicts.emplace_back(static_cast<Cs_Conflict::CONFLICTTYPE>(Int(r[1])), entity, constraint(r[4]));
    }
    for (Table::RowRef r : statuses) {
        auto id = static_cast<Cs_StatusID>(Int(r[1]));
        auto severity = static_cast<Cs_Status::SEVERITY>(Int(r[2]));
        int number = static_cast<int>(Int(r[3]));
        std::shared_ptr<Cs_Status> st;
        if (IsNull(r[7])) {
            auto parse =
                std::make_shared<Cs_Status_Parse>(id, number, std::string(Str(r[4])), std::string(Str(r[5])),
                                                  static_cast<int>(Int(r[6])));
            parse->SetSeverity(severity);
            st = parse;
        } else {
            st = std::make_shared<Cs_Status_Resolution>(id, severity, number, std::string(Str(r[4])), constraint(r[7]));
        }
        if (!IsNull(r[0])) {
            auto it = source_index.find(Int(r[0]));
            if (it == source_index.end()) return fail("it is damaged (a status of an unknown source)");
            staged.sources_[it->second].parse.Add(st);
        } else {
            staged.resolution_.Add(st);
        }
    }
    mgr.sources_ = std::move(staged.sources_);
    mgr.loose_ = std::move(staged.loose_);
    mgr.resolution_ = std::move(staged.resolution_);
    mgr.committed_ = std::move(staged.committed_);
    mgr.texts_ = std::move(staged.texts_);
    mgr.object_lists_ = std::move(staged.object_lists_);
    staged.texts_ = std::make_unique<Ndm_NamePool>();
    if (view && !same_design)
        mgr.Resolve();  // what the file holds is no longer what the repository holds
    else
        mgr.Unchanged(path);
    return outcome;
}


void Cs_ConstraintMgr::Unchanged(const std::string& file) const {
    same_as_file_ = file;
    same_as_identity_ = Port::File::Identity(file.c_str());
}

Cs_ReturnCode Cs_ConstraintMgr::Commit(const Port::StringBase<char>& file) const {
    const std::string path = file.str();
    if (!same_as_file_.empty() && same_as_file_ == path && same_as_identity_ == Port::File::Identity(path.c_str()))
        return store_outcome_ = Cs_ReturnCode();
    store_outcome_ = Cs_Store::Commit(*this, path);
    if (store_outcome_) Unchanged(path);
    return store_outcome_;
}

Cs_ReturnCode Cs_ConstraintMgr::Restore(const Port::StringBase<char>& file) {
    return store_outcome_ = Cs_Store::Restore(*this, file.str());
}
