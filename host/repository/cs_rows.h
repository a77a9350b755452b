// The repository's content as the rows of its file, in writing order: the sources; each
// constraint followed by its paths, associations and conflicts; then the statuses. Commit
// produces them once and hands them to both forms the file keeps (the tables a user queries,
// and the snapshot Restore reads); Restore reads them back from either and builds the
// repository from them. Internal to the repository.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include <vector>

#include "host/repository/cs_constraint.h"

class Cs_ConstraintMgr;
class Ndm_View;

namespace Cs_Rows {

// Ids count from 1 in writing order; 0 stands for none. Texts handed to a sink by a reader are
// terminated and live as long as the pool the reader keeps them in.
struct Source {
    std::string_view file;
    int64_t syntax = 0;
    uint64_t hash = 0, size = 0;
    bool read = false;
};
struct Constraint {
    int64_t id = 0, source = 0, line = 0;
    const Cs_ConstraintType* type = nullptr;
    Cs_Scope scope = Cs_Scope::Design;
    std::string_view target, key, value;
    bool flag = false;
    std::string_view statement;
    int64_t parent = 0;
    Cs_Block block = Cs_Block::None;
    std::string_view entry, stored;  // with a block only
};
struct Path {
    int64_t constraint = 0;
    std::string_view group;
};
// The kinds of design objects an association or a conflict names (by full name).
enum class Object : uint8_t { None, Block, Network, Signal, Pin, Design, Constraint };
const char* ObjectWord(Object kind);  // "block", ..., "constraint"; null for None
bool ObjectFrom(std::string_view word, Object& out);
struct Association {
    int64_t constraint = 0;
    Object kind = Object::None;  // Constraint: another constraint, by id
    std::string_view object;
    int64_t other = 0;
};
struct Conflict {
    int64_t constraint = 0, type = 0;
    Object kind = Object::None;  // None: between design-wide constraints
    std::string_view object;
    int64_t by = 0;
};
struct Status {
    int64_t source = 0;  // the source of a parse status; 0 for the resolution's
    int64_t id = 0, severity = 0, number = 0;
    std::string_view message, file;  // no file: empty
    int64_t line = 0;
    int64_t constraint = 0;  // a resolution status's constraint
};

// Receives rows in writing order; false stops whoever feeds it (why() then says why).
class Sink {
public:
    virtual ~Sink() = default;
    virtual bool Add(const Source& row) = 0;
    virtual bool Add(const Constraint& row) = 0;
    virtual bool Add(const Path& row) = 0;
    virtual bool Add(const Association& row) = 0;
    virtual bool Add(const Conflict& row) = 0;
    virtual bool Add(const Status& row) = 0;
    const std::string& why() const { return why_; }

protected:
    std::string why_;
};

// Builds a repository from rows: into staged, for target, whose bound design decides what the
// rows' object names come to. With no design they are kept as names (GetCommittedNames); for
// the design they were committed for, they are looked up when first asked for; for another
// design they are dropped (target resolves again).
class Builder : public Sink {
public:
    Builder(Cs_ConstraintMgr& target, Cs_ConstraintMgr& staged, bool same_design);
    bool Add(const Source& row) override;
    bool Add(const Constraint& row) override;
    bool Add(const Path& row) override;
    bool Add(const Association& row) override;
    bool Add(const Conflict& row) override;
    bool Add(const Status& row) override;
    // Links the constraints to the constraints they name; false when the rows were inconsistent.
    bool Finish();

private:
    Cs_Constraint* ById(int64_t id) const;
    bool Fail(const char* why);
    Cs_ConstraintMgr& target_;
    Cs_ConstraintMgr& staged_;
    bool view_;
    bool same_design_;
    std::vector<Cs_Constraint*> constraints_;  // by id - 1
    std::vector<const char*> source_files_;    // by id - 1, interned
    // A constraint naming another by id, settled when all are built.
    struct Link {
        enum What : uint8_t { Parent, Associated, Conflict, Override, PendingConflict } what;
        Cs_Constraint* from;
        int64_t to;
        int64_t conflict_type = 0;
        std::string_view object;  // Override: the object's name
        size_t pending = 0;       // PendingConflict: its place in the pending objects
    };
    std::vector<Link> links_;
};

// The constraint types by number, as the snapshot keeps them; -1 and null outside.
int TypeNumber(const Cs_ConstraintType& type);
const Cs_ConstraintType* TypeAt(int64_t number);

// The snapshot: every row in one compact binary value, which Restore decodes without stepping
// through the tables.
class SnapshotWriter : public Sink {
public:
    SnapshotWriter();
    ~SnapshotWriter() override;
    bool Add(const Source& row) override;
    bool Add(const Constraint& row) override;
    bool Add(const Path& row) override;
    bool Add(const Association& row) override;
    bool Add(const Conflict& row) override;
    bool Add(const Status& row) override;
    // The encoded snapshot.
    std::string Finish();

private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

// Decodes a snapshot that lies in memory owned by the caller for as long as the texts handed to
// sink are used; false when it is malformed (error says how) or the sink stopped.
bool ReadSnapshot(const char* data, size_t size, Sink& sink, std::string& error);

// The seal of a repository file: a checksum of all its bytes but the four it is kept in (the
// header's user version field, at offset 60). Commit seals the file it wrote; a file whose seal
// holds is byte for byte what was committed, and Restore may trust its snapshot.
constexpr size_t kSealOffset = 60;
uint32_t Seal(const unsigned char* data, size_t size);
// Seals the file at path; false with error on failure.
bool SealFile(const std::string& path, std::string& error);
// Whether the file at path is sealed and its seal holds.
bool SealHolds(const std::string& path);

}  // namespace Cs_Rows
