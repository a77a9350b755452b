// The repository file: an SQLite database that Commit builds beside the old file, seals and
// renames into place. It keeps the content twice: as tables a user queries, and as one snapshot
// value that Restore decodes when the seal shows the file is as committed; otherwise Restore
// reads the tables and checks them against the checksum of their content. docs/repository.md
// documents the schema.
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

#include "host/repository/cs_rows.h"

const Cs_ConstraintType* Cs_FindConstraintType(const char* name);

namespace {

constexpr const char* kFormat = "lun-repository";
constexpr int kVersion = 4;

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
CREATE TABLE snapshot (data BLOB);
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
    std::string_view Text(const Cell& c) const { return {(kept_ ? kept_ : texts_.data()) + c.offset, c.size}; }
    // Moves the texts into pool, where they stay (terminated) after the table is gone.
    void KeepTextsIn(Ndm_NamePool& pool) {
        kept_ = pool.Keep(texts_.size());
        std::memcpy(kept_, texts_.data(), texts_.size());
        std::string().swap(texts_);
    }
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
                    texts_.push_back('\0');
                }
            }
            cells_.push_back(cell);
        }
    }

private:
    size_t columns_;
    std::vector<Cell> cells_;
    std::string texts_;
    char* kept_ = nullptr;
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
std::pair<Cs_Rows::Object, std::string> ObjectName(const Ndm_PropertyHolder* o) {
    using Cs_Rows::Object;
    switch (o->GetKind()) {
        case Ndm_ObjKind::Block: return {Object::Block, static_cast<const Ndm_Block*>(o)->GetFullName()};
        case Ndm_ObjKind::Network: {
            const Ndm_Signal* top = static_cast<const Ndm_Network*>(o)->GetTopSignal();
            return {Object::Network, top ? top->GetFullName() : std::string()};
        }
        case Ndm_ObjKind::Signal: return {Object::Signal, static_cast<const Ndm_Signal*>(o)->GetFullName()};
        case Ndm_ObjKind::Pin: return {Object::Pin, static_cast<const Ndm_Pin*>(o)->GetFullName()};
        default: return {Object::Design, o->GetName() ? o->GetName() : ""};
    }
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
    bool InsertBlob(const char* sql, const std::string& blob, std::string& error) {
        sqlite3_stmt* st = Prepare(sql, error);
        if (!st) return false;
        sqlite3_bind_blob64(st, 1, blob.data(), blob.size(), SQLITE_STATIC);
        if (sqlite3_step(st) == SQLITE_DONE) return true;
        error = sqlite3_errmsg(db_);
        return false;
    }
    // Hands the first column of the first row of a query to take, as bytes; false when there
    // is none.
    template <class Take>
    bool SelectBlob(const char* sql, Take&& take, std::string& error) {
        sqlite3_stmt* st = Prepare(sql, error);
        if (!st || sqlite3_step(st) != SQLITE_ROW) return false;
        const void* data = sqlite3_column_blob(st, 0);
        take(static_cast<const char*>(data), static_cast<size_t>(sqlite3_column_bytes(st, 0)));
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


// Writes the rows into the tables, summing them up in the checksum the table reader checks.
class TableWriter : public Cs_Rows::Sink {
public:
    explicit TableWriter(Db& db) : db_(db) {}
    bool Add(const Cs_Rows::Source& r) override {
        return Insert("INSERT INTO source VALUES (?,?,?,?,?,?)",
                      {++sources_, Text(r.file), r.syntax, static_cast<int64_t>(r.hash), static_cast<int64_t>(r.size),
                       int64_t{r.read}});
    }
    bool Add(const Cs_Rows::Constraint& r) override {
        const bool block = r.block != Cs_Block::None;
        return Insert("INSERT INTO constraints VALUES (?,?,?,?,?,?,?,?,?,?,?,?,?,?)",
                      {r.id, Id(r.source), r.line, std::string(r.type->GetName()), std::string(Cs_ScopeWord(r.scope)),
                       Text(r.target), Text(r.key), Text(r.value), int64_t{r.flag}, Text(r.statement), Id(r.parent),
                       block ? Value(std::string(Cs_BlockWord(r.block))) : Value(), block ? Text(r.entry) : Value(),
                       block ? Text(r.stored) : Value()});
    }
    bool Add(const Cs_Rows::Path& r) override {
        return Insert("INSERT INTO path VALUES (?,?)", {r.constraint, Text(r.group)});
    }
    bool Add(const Cs_Rows::Association& r) override {
        const bool other = r.kind == Cs_Rows::Object::Constraint;
        return Insert("INSERT INTO association VALUES (?,?,?,?)",
                      {r.constraint, std::string(Cs_Rows::ObjectWord(r.kind)), other ? Value() : Text(r.object),
                       other ? Id(r.other) : Value()});
    }
    bool Add(const Cs_Rows::Conflict& r) override {
        const bool object = r.kind != Cs_Rows::Object::None;
        return Insert("INSERT INTO conflict VALUES (?,?,?,?,?)",
                      {r.constraint, r.type, object ? Value(std::string(Cs_Rows::ObjectWord(r.kind))) : Value(),
                       object ? Text(r.object) : Value(), Id(r.by)});
    }
    bool Add(const Cs_Rows::Status& r) override {
        const bool file = !r.file.empty();
        return Insert("INSERT INTO status VALUES (?,?,?,?,?,?,?,?)",
                      {Id(r.source), r.id, r.severity, r.number, Text(r.message), file ? Text(r.file) : Value(),
                       file ? Value(r.line) : Value(), Id(r.constraint)});
    }
    uint64_t checksum() const { return sum_.h; }

private:
    static Value Text(std::string_view text) { return std::string(text); }
    static Value Id(int64_t id) { return id ? Value(id) : Value(); }
    bool Insert(const char* sql, const Row& row) { return db_.Insert(sql, row, &sum_, why_); }
    Db& db_;
    Checksum sum_;
    int64_t sources_ = 0;
};

// Hands every row to both sinks.
class BothSinks : public Cs_Rows::Sink {
public:
    BothSinks(Cs_Rows::Sink& a, Cs_Rows::Sink& b) : a_(a), b_(b) {}
    bool Add(const Cs_Rows::Source& r) override { return Both(r); }
    bool Add(const Cs_Rows::Constraint& r) override { return Both(r); }
    bool Add(const Cs_Rows::Path& r) override { return Both(r); }
    bool Add(const Cs_Rows::Association& r) override { return Both(r); }
    bool Add(const Cs_Rows::Conflict& r) override { return Both(r); }
    bool Add(const Cs_Rows::Status& r) override { return Both(r); }

private:
    template <class R>
    bool Both(const R& r) {
        if (a_.Add(r) && b_.Add(r)) return true;
        why_ = !a_.why().empty() ? a_.why() : b_.why();
        return false;
    }
    Cs_Rows::Sink& a_;
    Cs_Rows::Sink& b_;
};

// Reads the tables back into rows after checking them against the checksum of their content.
bool ReadTables(Db& db, const std::string& checksum, Ndm_NamePool& pool, Cs_Rows::Sink& sink, std::string& why) {
    std::string error;
    Table sources(6), constraints(14), paths(2), assocs(4), conflicts(5), statuses(8);
    // Rows of the per-constraint tables come back in the order they were written, which
    // interleaves them per constraint; read them that way so that the checksum agrees.
    if (!db.Select("SELECT * FROM source ORDER BY rowid", sources, error) ||
        !db.Select("SELECT * FROM constraints ORDER BY rowid", constraints, error) ||
        !db.Select("SELECT * FROM path ORDER BY rowid", paths, error) ||
        !db.Select("SELECT * FROM association ORDER BY rowid", assocs, error) ||
        !db.Select("SELECT * FROM conflict ORDER BY rowid", conflicts, error) ||
        !db.Select("SELECT * FROM status ORDER BY rowid", statuses, error)) {
        why = "it is damaged (" + error + ")";
        return false;
    }
    // The checksum covers the rows in writing order: the sources, each constraint with its
    // paths, associations and conflicts, then the statuses.
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
        if (p != paths.size() || a != assocs.size() || k != conflicts.size() || checksum != hex) {
            why = "it is damaged (its content does not match its checksum)";
            return false;
        }
    }
    for (Table* t : {&sources, &constraints, &paths, &assocs, &conflicts, &statuses}) t->KeepTextsIn(pool);
    auto feed = [&](const auto& row) {
        if (sink.Add(row)) return true;
        why = sink.why();
        return false;
    };
    auto damaged = [&](const char* what) {
        why = std::string("it is damaged (") + what + ")";
        return false;
    };
    for (Table::RowRef r : sources)
        if (!feed(Cs_Rows::Source{Str(r[1]), Int(r[2]), static_cast<uint64_t>(Int(r[3])),
                                  static_cast<uint64_t>(Int(r[4])), Int(r[5]) != 0}))
            return false;
    size_t p = 0, a = 0, k = 0;
    for (Table::RowRef r : constraints) {
        Cs_Rows::Constraint c;
        c.id = Int(r[0]);
        c.source = Int(r[1]);
        c.line = Int(r[2]);
        c.type = Cs_FindConstraintType(std::string(Str(r[3])).c_str());
        if (!c.type || !ScopeFrom(Str(r[4]), c.scope)) return damaged("unknown constraint kind");
        c.target = Str(r[5]);
        c.key = Str(r[6]);
        c.value = Str(r[7]);
        c.flag = Int(r[8]) != 0;
        c.statement = Str(r[9]);
        c.parent = Int(r[10]);
        if (!IsNull(r[11])) {
            if (!BlockFrom(Str(r[11]), c.block)) return damaged("unknown constraint block");
            c.entry = Str(r[12]);
            c.stored = Str(r[13]);
        }
        if (!feed(c)) return false;
        for (; p < paths.size() && Int(paths[p][0]) == c.id; ++p)
            if (!feed(Cs_Rows::Path{c.id, Str(paths[p][1])})) return false;
        for (; a < assocs.size() && Int(assocs[a][0]) == c.id; ++a) {
            Cs_Rows::Association row{c.id, Cs_Rows::Object::None, Str(assocs[a][2]), Int(assocs[a][3])};
            if (!Cs_Rows::ObjectFrom(Str(assocs[a][1]), row.kind)) return damaged("unknown kind of object");
            if (!feed(row)) return false;
        }
        for (; k < conflicts.size() && Int(conflicts[k][0]) == c.id; ++k) {
            Table::RowRef x = conflicts[k];
            Cs_Rows::Conflict row{c.id, Int(x[1]), Cs_Rows::Object::None, Str(x[3]), Int(x[4])};
            if (!IsNull(x[2]) && !Cs_Rows::ObjectFrom(Str(x[2]), row.kind)) return damaged("unknown kind of object");
            if (!feed(row)) return false;
        }
    }
    for (Table::RowRef r : statuses)
        if (!feed(Cs_Rows::Status{Int(r[0]), Int(r[1]), Int(r[2]), Int(r[3]), Str(r[4]), Str(r[5]), Int(r[6]),
                                  Int(r[7])}))
            return false;
    return true;
}

}  // namespace

void Cs_SetCommitFaultHook(Cs_CommitFaultHook hook) {
    g_fault_hook = hook;
    Port::SetSaveFaultHook(hook);  // the steps of the save itself
}

class Cs_Store {
public:
    // Hands the repository's rows to sink in writing order.
    static bool Collect(const Cs_ConstraintMgr& mgr, Cs_Rows::Sink& sink);
    static Cs_ReturnCode Commit(const Cs_ConstraintMgr& mgr, const std::string& path);
    static Cs_ReturnCode Restore(Cs_ConstraintMgr& mgr, const std::string& path);
};

bool Cs_Store::Collect(const Cs_ConstraintMgr& mgr, Cs_Rows::Sink& sink) {
    std::unordered_map<const Cs_Constraint*, int64_t> ids;
    int64_t next = 0;
    mgr.ForEach([&](const Cs_Constraint& c) { ids[&c] = ++next; });
    auto id_of = [&](const Cs_Constraint* c) -> int64_t {
        auto it = c ? ids.find(c) : ids.end();
        return it == ids.end() ? 0 : it->second;
    };
    std::unordered_map<std::string_view, int64_t> source_ids;
    for (const auto& s : mgr.sources_) {
        const Cs_FileInfo& info = *s.info;
        source_ids[info.GetFileName()] = static_cast<int64_t>(source_ids.size()) + 1;
        if (!sink.Add(Cs_Rows::Source{info.GetFileName(), info.GetSyntax(), info.GetHash(), info.GetSize(),
                                      info.WasRead()}))
            return false;
    }
    bool ok = true;
    mgr.ForEach([&](const Cs_Constraint& c) {
        if (!ok) return;
        const Cs_SourceFile* where = c.GetSourceInfo()->GetSourceFile();
        auto src = where ? source_ids.find(where->GetFile()) : source_ids.end();
        Cs_Rows::Constraint row;
        row.id = ids[&c];
        row.source = src == source_ids.end() ? 0 : src->second;
        row.line = where ? where->GetLine() : 0;
        row.type = &c.GetType();
        row.scope = c.GetScope();
        row.target = c.GetTarget();
        row.key = c.GetAttribute();
        row.value = c.GetValueText();
        row.flag = c.IsFlag();
        row.statement = c.GetStatementText();
        row.parent = id_of(c.Parent());
        row.block = c.GetBlock();
        row.entry = c.GetEntryName();
        row.stored = c.GetStoredText();
        ok = sink.Add(row);
        for (const char* g : c.GetAssociatedPaths()) ok = ok && sink.Add(Cs_Rows::Path{row.id, g});
        for (const Ndm_PropertyHolder* o : c.GetAssociatedDesignObjs()) {
            auto [kind, name] = ObjectName(o);
            ok = ok && sink.Add(Cs_Rows::Association{row.id, kind, name, 0});
        }
        for (const Cs_Constraint* other : c.GetAssociatedConstraints())
            if (other != c.Parent())
                ok = ok && sink.Add(Cs_Rows::Association{row.id, Cs_Rows::Object::Constraint, {}, id_of(other)});
        for (const Cs_Conflict& k : c.GetConflicts()) {
            std::pair<Cs_Rows::Object, std::string> object{Cs_Rows::Object::None, ""};
            if (k.GetDesignEntity()) object = ObjectName(k.GetDesignEntity());
            ok = ok && sink.Add(Cs_Rows::Conflict{row.id, int64_t{k.GetType()}, object.first, object.second,
                                                  id_of(k.GetConflictingConstraint())});
        }
    });
    if (!ok) return false;
    auto status_row = [&](const Cs_Status& st, int64_t source) {
        Cs_Rows::Status row;
        row.source = source;
        row.id = static_cast<int>(st.GetID());
        row.severity = st.GetSeverity();
        row.number = st.GetLocalizedMsgNum();
        row.message = st.GetMessage();
        if (auto* p = dynamic_cast<const Cs_Status_Parse*>(&st)) {
            row.file = p->GetSourceFile()->GetFile() ? p->GetSourceFile()->GetFile() : "";
            row.line = p->GetSourceFile()->GetLine();
        }
        if (auto* r = dynamic_cast<const Cs_Status_Resolution*>(&st)) {
            row.constraint = id_of(r->GetConstraint());
            const Cs_SourceFile* at = r->GetConstraint() ? r->GetConstraint()->GetSourceInfo()->GetSourceFile() : nullptr;
            if (at) {
                row.file = at->GetFile();
                row.line = at->GetLine();
            }
        }
        return sink.Add(row);
    };
    for (const auto& s : mgr.sources_)
        for (const auto& st : s.parse)
            if (!status_row(*st, source_ids[s.info->GetFileName()])) return false;
    for (const auto& st : mgr.resolution_)
        if (!status_row(*st, 0)) return false;
    return true;
}

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
        TableWriter tables(db);
        Cs_Rows::SnapshotWriter snapshot;
        BothSinks both(tables, snapshot);
        if (!Step("write") || !Collect(mgr, both))
            return fail(both.why().empty() ? "writing was interrupted" : both.why());
        const Ndm_Design* design = mgr.GetDesign();
        char hex[32];
        std::snprintf(hex, sizeof hex, "%016llx", static_cast<unsigned long long>(tables.checksum()));
        const std::pair<const char*, std::string> meta[] = {
            {"format", kFormat},
            {"version", std::to_string(kVersion)},
            {"design", design && design->GetName() ? design->GetName() : ""},
            {"design_stamp", design ? design->GetSourceStamp() : std::string()},
            {"content_checksum", hex},
        };
        bool ok = true;
        for (const auto& [key, value] : meta)
            ok = ok && db.Insert("INSERT INTO meta VALUES (?,?)", {std::string(key), value}, nullptr, error);
        ok = ok && db.InsertBlob("INSERT INTO snapshot VALUES (?)", snapshot.Finish(), error);
        if (!ok) return fail(error.empty() ? "writing was interrupted" : error);
        if (!db.Exec("COMMIT", error)) return fail(error);
    }
    if (!Step("seal") || !Cs_Rows::SealFile(temp, error)) return fail(error.empty() ? "cannot seal " + temp : error);
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

    // Build the new content aside; the repository changes only when everything was read. What
    // the constraints resolved to counts only for the design it was committed for; with no
    // design bound the names are kept for listings.
    Cs_ConstraintMgr staged;
    Ndm_View* view = mgr.design_ ? mgr.design_->GetWorkView() : nullptr;
    const std::string& stamp = mgr.design_ ? mgr.design_->GetSourceStamp() : info["design_stamp"];
    const bool same_design = !stamp.empty() && stamp == info["design_stamp"];
    Cs_Rows::Builder builder(mgr, staged, same_design);
    // A sealed file is byte for byte what was committed: its snapshot holds the content. A file
    // changed since (a user's index, a vacuum, damage) is read from its tables, which the
    // checksum of their content guards.
    std::string why;
    bool read = false;
    if (Cs_Rows::SealHolds(path)) {
        const char* kept = nullptr;
        size_t size = 0;
        read = db.SelectBlob(
            "SELECT data FROM snapshot",
            [&](const char* data, size_t n) {
                char* copy = staged.texts_->Keep(n);  // the snapshot's texts stay in use
                if (n) std::memcpy(copy, data, n);
                kept = copy;
                size = n;
            },
            error);
        if (read && !Cs_Rows::ReadSnapshot(kept, size, builder, why)) return fail(why);
    }
    if (!read && !ReadTables(db, info["content_checksum"], *staged.texts_, builder, why)) return fail(why);
    builder.Finish();

    mgr.sources_ = std::move(staged.sources_);
    mgr.loose_ = std::move(staged.loose_);
    mgr.resolution_ = std::move(staged.resolution_);
    mgr.committed_ = std::move(staged.committed_);
    mgr.texts_ = std::move(staged.texts_);
    mgr.object_lists_ = std::move(staged.object_lists_);
    mgr.pending_ = std::move(staged.pending_);
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
