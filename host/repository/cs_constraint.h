// The constraints a repository holds: one object per constraint of a statement, knowing where
// it was read, what it resolved to, and which later constraints override it.
#pragma once

#include <cstdint>
#include <deque>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "host/port/string_base.h"

class Ndm_PropertyHolder;
class Cs_Constraint;
class Cs_ConstraintMgr;
namespace Cs_Rows {
class Builder;
}

// A kind of constraint; each typed class has one, compared by identity.
class Cs_ConstraintType {
public:
    explicit constexpr Cs_ConstraintType(const char* name) : name_(name) {}
    Cs_ConstraintType(const Cs_ConstraintType&) = delete;
    Cs_ConstraintType& operator=(const Cs_ConstraintType&) = delete;
    bool operator==(const Cs_ConstraintType& other) const { return this == &other; }
    // The class's name without the "Cs_Constraint_" prefix, e.g. "Locate".
    const char* GetName() const { return name_; }

private:
    const char* name_;
};

// Where something was read: a file name (null when unknown) and a line (from 1; 0 for a whole
// file). Does not own the file name.
class Cs_SourceFile {
public:
    Cs_SourceFile(const char* file = nullptr, int line = 0) : file_(file), line_(line) {}  // NOLINT
    const char* GetFile() const { return file_; }
    int GetLine() const { return line_; }

private:
    const char* file_;
    int line_;
};

class Cs_ConstraintSourceInfo {
public:
    explicit Cs_ConstraintSourceInfo(Cs_SourceFile source = {}) : source_(source) {}
    // The file and line, or null when the constraint was not read from a file.
    const Cs_SourceFile* GetSourceFile() const { return source_.GetFile() ? &source_ : nullptr; }

private:
    Cs_SourceFile source_;
};

// One constraint overriding another.
class Cs_Conflict {
public:
    enum CONFLICTTYPE { OVERRIDE = 1 };
    Cs_Conflict(CONFLICTTYPE type, Ndm_PropertyHolder* entity, const Cs_Constraint* by)
        : type_(type), entity_(entity), by_(by) {}
    CONFLICTTYPE GetType() const { return type_; }
    // The design object both constraints set, or null for design-wide constraints.
    Ndm_PropertyHolder* GetDesignEntity() const { return entity_; }
    // The later constraint that wins.
    const Cs_Constraint* GetConflictingConstraint() const { return by_; }

private:
    CONFLICTTYPE type_;
    Ndm_PropertyHolder* entity_;
    const Cs_Constraint* by_;
};

// A shared deque: copies see the same elements (what GetConstraints hands out).
template <class T, class Container = std::deque<T>>
class Cs_SharedContainerT {
public:
    Cs_SharedContainerT() : items_(std::make_shared<Container>()) {}
    void push_back(T item) { items_->push_back(std::move(item)); }
    typename Container::const_iterator begin() const { return items_->begin(); }
    typename Container::const_iterator end() const { return items_->end(); }
    size_t size() const { return items_->size(); }
    bool empty() const { return items_->empty(); }
    const T& operator[](size_t i) const { return (*items_)[i]; }

private:
    std::shared_ptr<Container> items_;
};

// What a statement is about.
enum class Cs_Scope : uint8_t {
    Instance,   // INST: design objects are blocks
    Net,        // NET: design objects are networks (or signals outside every network)
    Pin,        // PIN: design objects are pins
    Design,     // CONFIG and the other design-wide settings
    TimeSpec,   // TIMESPEC, OFFSET, ENABLE, DISABLE and TIMEGRP ... OFFSET
    TimeGroup,  // TIMEGRP definitions
    AreaGroup,  // AREA_GROUP attributes
    Set,        // SET attributes
    Comment,    // comment lines
};

// The statement word of a scope ("INST", "NET", ...).
const char* Cs_ScopeWord(Cs_Scope scope);

// The constraint block a design-wide constraint is stored on: TIMESPEC and TIMEGRP blocks keep
// timing entries, the CONFIG block settings.
enum class Cs_Block : uint8_t { None, TimeSpec, TimeGroup, Config };

// The block's TYPE ("TIMESPEC", "TIMEGRP", "CONFIG"; "" for None).
const char* Cs_BlockWord(Cs_Block block);

class Cs_Constraint {
public:
    virtual ~Cs_Constraint();
    Cs_Constraint(const Cs_Constraint&) = delete;
    Cs_Constraint& operator=(const Cs_Constraint&) = delete;

    virtual const Cs_ConstraintType& GetType() const = 0;
    Cs_Scope GetScope() const { return scope_; }
    // The name the statement gives: the object name or pattern of INST, NET, PIN, the group,
    // TIMESPEC, area-group or set name; empty for design-wide settings and comments.
    const char* GetTarget() const { return target_; }
    // The attribute as a property name (LOC, TNM_NET, PERIOD, the TIMESPEC name, ...).
    const char* GetAttribute() const { return key_; }
    // The value text, as the file-reading road stores it.
    const char* GetValueText() const { return value_; }
    // True for a keyword without value (a flag such as PULLUP).
    bool IsFlag() const { return flag_; }
    // The whole statement it came from, blanks folded.
    const char* GetStatementText() const { return statement_; }
    // Where the file-reading road stores a design-wide constraint: the constraint block, and
    // the name and value text of the timing entry or setting it gets there. None (and empty
    // texts) for the constraints of objects, for comments, and for what the annotator stores
    // nothing of (a statement it refuses, the later values of an AREA_GROUP or SET attribute,
    // which the first value's text carries).
    Cs_Block GetBlock() const { return block_; }
    const char* GetEntryName() const { return extra_ ? extra_->entry : ""; }
    const char* GetStoredText() const { return extra_ ? extra_->stored : ""; }

    const Cs_ConstraintSourceInfo* GetSourceInfo() const { return &source_; }
    // The constraint as a user recognises it, with its file and line:
    // NET "clk" LOC = P10 (board.ucf line 8). Long texts are shortened.
    std::string GetMsgName() const;

    // Constraints that name no design object by nature: design-wide settings, timing
    // statements and groups, area groups, sets and comments.
    bool IsAssociationExempt() const;

    // Resolution results (Cs_ConstraintMgr::SetDesign, UpdateConstraintsFromSource).
    // The design objects: one is kept in the constraint, more in a list the constraints of one
    // statement share.
    std::span<Ndm_PropertyHolder* const> GetAssociatedDesignObjs() const {
        if (lazy_) FindPending();
        if (many_) return *many_;
        return one_ ? std::span<Ndm_PropertyHolder* const>(&one_, 1) : std::span<Ndm_PropertyHolder* const>();
    }
    const std::vector<const Cs_Constraint*>& GetAssociatedConstraints() const {
        return extra_ ? extra_->constraints : kNone.constraints;
    }
    // The group names a TIMESPEC's paths run through (FROM, THRU, TO), as written.
    const std::vector<const char*>& GetAssociatedPaths() const { return extra_ ? extra_->paths : kNone.paths; }
    const std::vector<Cs_Conflict>& GetConflicts() const {
        if (lazy_) FindPending();
        return extra_ ? extra_->conflicts : kNone.conflicts;
    }

protected:
    Cs_Constraint() = default;

private:
    friend class Cs_ConstraintMgr;
    friend class Cs_Loader;
    friend class Cs_Store;
    friend class Cs_Rows::Builder;

    // What only some constraints have, kept aside so that the many constraints of objects
    // stay small: links to other constraints, group names, overrides, a stored entry.
    struct Extra {
        std::vector<const Cs_Constraint*> constraints;
        const Cs_Constraint* parent = nullptr;  // given to CreateConstraints
        std::vector<const char*> paths;
        std::vector<Cs_Conflict> conflicts;
        const char* entry = "";  // texts are owned by the repository
        const char* stored = "";
    };
    static const Extra kNone;
    Extra& More() {
        if (!extra_) extra_ = std::make_unique<Extra>();
        return *extra_;
    }
    const Cs_Constraint* Parent() const { return extra_ ? extra_->parent : nullptr; }

    Cs_Scope scope_ = Cs_Scope::Design;
    bool flag_ = false;
    Cs_Block block_ = Cs_Block::None;
    bool lazy_ = false;  // restored, its objects still to be looked up by pending_
    const char* target_ = "";  // texts are owned by the repository
    const char* key_ = "";
    const char* value_ = "";
    const char* statement_ = "";
    Cs_ConstraintSourceInfo source_;
    Ndm_PropertyHolder* one_ = nullptr;
    union {
        const std::vector<Ndm_PropertyHolder*>* many_ = nullptr;  // owned by the repository
        Cs_ConstraintMgr* pending_;  // while lazy_: the repository that looks its objects up
    };
    std::unique_ptr<Extra> extra_;
    void FindPending() const;
};

#define LUN_CS_CONSTRAINT_CLASS(Name)                                                  \
    class Cs_Constraint_##Name : public Cs_Constraint {                                 \
    public:                                                                            \
        static const Cs_ConstraintType& Type();                                        \
        const Cs_ConstraintType& GetType() const override { return Type(); }           \
    }

// Typed constraints. An attribute the repository has no class for is kept as an unsupported
// constraint (key and value).
LUN_CS_CONSTRAINT_CLASS(Locate);       // LOC
LUN_CS_CONSTRAINT_CLASS(IOStandard);   // IOSTANDARD
LUN_CS_CONSTRAINT_CLASS(Drive);        // DRIVE
LUN_CS_CONSTRAINT_CLASS(Slew);         // SLEW
LUN_CS_CONSTRAINT_CLASS(MaxDelay);     // MAXDELAY
LUN_CS_CONSTRAINT_CLASS(TimingName);   // TNM, TNM_NET, TPSYNC, TPTHRU: group memberships
LUN_CS_CONSTRAINT_CLASS(Period);       // PERIOD on a net or instance
LUN_CS_CONSTRAINT_CLASS(Offset);       // OFFSET on a net or pin, and the global OFFSET forms
LUN_CS_CONSTRAINT_CLASS(TimeSpec);     // TIMESPEC: PERIOD, FROM-TO, TIG, DROP_SPEC; ENABLE, DISABLE
LUN_CS_CONSTRAINT_CLASS(TimeGrp);      // TIMEGRP definitions and TIMEGRP ... AREA_GROUP
LUN_CS_CONSTRAINT_CLASS(Prohibit);     // PROHIBIT
LUN_CS_CONSTRAINT_CLASS(AreaGroup);    // AREA_GROUP on an instance, and AREA_GROUP attributes
LUN_CS_CONSTRAINT_CLASS(Set);          // SET attributes
LUN_CS_CONSTRAINT_CLASS(Global);       // VOLTAGE, TEMPERATURE, VREF and other CONFIG settings
LUN_CS_CONSTRAINT_CLASS(Comment);      // a comment line
#undef LUN_CS_CONSTRAINT_CLASS

// The device stepping (CONFIG STEPPING).
class Cs_Constraint_Stepping : public Cs_Constraint {
public:
    static const Cs_ConstraintType& Type();
    const Cs_ConstraintType& GetType() const override { return Type(); }
    const char* GetValue() const { return GetValueText(); }
};

// An attribute kept as text: its key and value. A statement the parser cannot read is kept as
// one with the key "INVALID_CONSTRAINT:" and the statement's text as the value.
class Cs_Constraint_Unsupported : public Cs_Constraint {
public:
    static const Cs_ConstraintType& Type();
    const Cs_ConstraintType& GetType() const override { return Type(); }
    Port::StringBase<char> GetKey() const { return GetAttribute(); }
    Port::StringBase<char> GetValue() const { return GetValueText(); }
};

// The timing group a constraint defines: the group of a TNM, TNM_NET, TPSYNC or TPTHRU (its
// value after any qualifier: "FFS : grp" defines grp), the group of a TIMEGRP definition; empty
// for every other constraint.
std::string_view Cs_DefinedGroup(const Cs_Constraint& c);

// Selects the constraints of one type.
class Cs_Filter_ConstraintType {
public:
    explicit Cs_Filter_ConstraintType(const Cs_ConstraintType& type) : type_(&type) {}
    bool Accepts(const Cs_Constraint& c) const { return c.GetType() == *type_; }

private:
    const Cs_ConstraintType* type_;
};

// A constraint file the repository read: its name, and the content hash and size it had.
class Cs_FileInfo {
public:
    Cs_FileInfo(std::string name, int syntax) : name_(std::move(name)), syntax_(syntax) {}
    const char* GetFileName() const { return name_.c_str(); }
    int GetSyntax() const { return syntax_; }
    uint64_t GetHash() const { return hash_; }
    uint64_t GetSize() const { return size_; }
    bool WasRead() const { return read_; }
    // True when this repository read the file itself; false for a source restored from a
    // repository file and not read again since.
    bool ReadHere() const { return read_here_; }

private:
    friend class Cs_ConstraintMgr;
    friend class Cs_Store;
    friend class Cs_Rows::Builder;
    std::string name_;
    int syntax_;
    uint64_t hash_ = 0;
    uint64_t size_ = 0;
    bool read_ = false;
    bool read_here_ = false;
};

// Syntaxes a file can be read in.
struct Cs_ConstraintSyntax {
    enum SYNTAX { TEXT = 1, NCF = 3, UCF = 4 };
};
