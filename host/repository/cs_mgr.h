// Cs_ConstraintMgr: a design's constraints as data. It reads constraint files (sources) into
// constraints that know their file and line, resolves them against a bound design exactly as
// the annotators find names, records overrides and associations, and keeps everything in a
// repository file (SQLite) that Commit writes and Restore reads back. See docs/repository.md.
#pragma once

#include <deque>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "host/design/name_pool.h"
#include "host/design/ndm_constraint_blocks.h"
#include "host/port/string_base.h"
#include "host/repository/cs_constraint.h"
#include "host/repository/cs_region.h"
#include "host/repository/cs_status.h"

class Ndm_Design;
class Pr_FileText;
namespace Cs_Rows {
class Builder;
}
class Ndm_Property;

// For tests: called at each step of a commit ("open", "write", "sync", "close", "rename"); false
// makes that step fail as an I/O error would. Null (the default) for normal runs.
using Cs_CommitFaultHook = bool (*)(const char* step);
void Cs_SetCommitFaultHook(Cs_CommitFaultHook hook);

class Cs_ConstraintMgr {
public:
    // Which constraints GetConstraints hands out.
    enum EFFECTIVETYPE {
        ALL = 1,     // every constraint, comments included
        ACTIVE = 2,  // every constraint but comments
    };

    // What ReplaceConstraintsFromProps took in; converts to the outcome.
    class PropReplaceResults {
    public:
        // The properties taken into the repository, in the order met.
        const Cs_SharedContainerT<Ndm_Property*>& ConstraintProperties() const { return properties_; }
        operator Cs_ReturnCode() const { return outcome_; }  // NOLINT: converts by design

    private:
        friend class Cs_ConstraintMgr;
        Cs_SharedContainerT<Ndm_Property*> properties_;
        Cs_ReturnCode outcome_;
    };

    Cs_ConstraintMgr();
    virtual ~Cs_ConstraintMgr();
    Cs_ConstraintMgr(const Cs_ConstraintMgr&) = delete;
    Cs_ConstraintMgr& operator=(const Cs_ConstraintMgr&) = delete;

    // ---- design
    // Binds the design (null unbinds) and resolves every constraint against its view EXPANDED
    // (else its first view).
    Cs_ReturnCode SetDesign(const Ndm_Design* design);
    const Ndm_Design* GetDesign() const { return design_; }

    // ---- sources
    // The operations on sources answer what reading the files found (unreadable files,
    // statements the parser cannot read); what the resolution that follows found is
    // GetFindings' to tell.
    // Registers file as a source and reads it, adding its constraints after the others.
    Cs_ReturnCode LoadConstraints(const Port::StringBase<char>& file, int syntax);
    // Replaces the constraints read from file by its current content (registering it when new).
    Cs_ReturnCode ReplaceConstraintsFromFile(const Port::StringBase<char>& file, int syntax);
    // Registers a source without reading it; UpdateConstraintsFromSource reads it.
    Cs_ReturnCode AddConstraintSource(const Port::StringBase<char>& file, int syntax);
    // Forgets a source and its constraints.
    Cs_ReturnCode RemoveConstraintSource(const Port::StringBase<char>& file);
    // While on, source changes only record what is to be done; turning it off resolves once.
    void SetBulkConstraintMode(bool on);
    // Reads every source not read yet or changed on disk since it was read, in source order.
    Cs_ReturnCode UpdateConstraintsFromSource();
    std::vector<Cs_FileInfo*> GetConstraintSources() const;
    // Sources whose content differs from what was read (content hash and size), or that can no
    // longer be read, or that were never read.
    std::vector<Cs_FileInfo*> GetOutOfDateConstraintSources() const;

    // ---- constraints
    // Parses text (a statement or a few) as constraints of no file; returns the parse
    // statuses. parent is recorded as the constraints' associated constraint when given.
    Cs_ReturnCode CreateConstraints(const Port::StringBase<char>& text, int syntax, Cs_Constraint* parent);
    Cs_SharedContainerT<Cs_Constraint*> GetConstraints(int effective) const;
    Cs_SharedContainerT<Cs_Constraint*> GetConstraints(const Cs_Filter_ConstraintType& filter, int effective) const;
    size_t GetNumConstraints() const;
    // What the repository found about its content: the parse statuses of every source, then
    // the statuses of the last resolution.
    Cs_ReturnCode GetFindings() const;
    // The statuses of the last resolution only.
    const Cs_ReturnCode& GetResolutionFindings() const { return resolution_; }
    // Empties the repository: constraints and sources (the design stays bound).
    void DeleteAllConstraints();
    // A new, empty repository for the same design, owned by the caller.
    Cs_ConstraintMgr* CreateScratchPad() const;

    // ---- persistence (cs_store.cpp)
    // Writes the whole repository to file, atomically: the new file is built beside the old
    // one and renamed into place when complete and synced (Port::AtomicFile). Nothing is
    // written when file holds what the repository holds already: it was restored from or
    // committed to it, nothing changed since, and the file is the one seen then.
    Cs_ReturnCode Commit(const Port::StringBase<char>& file) const;
    // Replaces the repository by the content of file; on failure the repository is left as it
    // was and the status names the file and the reason. What the constraints resolved to is
    // taken from the file when the bound design is the one it was committed for (the same
    // Ndm_Design::GetSourceStamp, not empty); otherwise every constraint is resolved again.
    Cs_ReturnCode Restore(const Port::StringBase<char>& file);
    // The outcome of the last Commit or Restore: a host that only learns whether they worked
    // finds the reason here.
    const Cs_ReturnCode& GetStoreOutcome() const { return store_outcome_; }

    // ---- write-back and take-in
    // Writes every typed constraint onto the region's view as the annotators store it: the
    // constraints of objects as properties of the objects they resolved to, design-wide ones
    // as timing entries and settings of the constraint blocks (made when missing).
    Cs_ReturnCode WriteConstraintProps(const Cs_DesignRegion& region) const;
    // The constraint blocks handed out during one write, for the constraints of UCFs and of NCFs.
    struct ConstraintBlocks {
        Ndm_ConstraintBlocks ucf{true};
        Ndm_ConstraintBlocks ncf{false};
    };
    // The constraint block of view (null: the bound design's work view) that a design-wide
    // constraint is stored on (Cs_Constraint::GetBlock), found or made as the annotator of its
    // source's file kind finds or makes it; null for other constraints and without a view.
    Ndm_Block* GetConstraintBlock(const Cs_Constraint& c, const Ndm_View* view, ConstraintBlocks& blocks) const;
    // Takes the constraint properties of the region's objects into the repository.
    PropReplaceResults ReplaceConstraintsFromProps(const Cs_DesignRegion& region);

    // ---- what was committed
    // The full names of the objects a constraint resolved to, and of those later constraints
    // override it on, as committed. Restore keeps them while no design is bound (a bound
    // design answers with its objects), so that a repository can be listed without its design;
    // null for a constraint without any.
    struct CommittedNames {
        std::vector<std::string> objects;                                      // full names
        std::vector<std::pair<const Cs_Constraint*, std::string>> overrides;  // by, on which object
    };
    const CommittedNames* GetCommittedNames(const Cs_Constraint& c) const {
        auto it = committed_.find(&c);
        return it == committed_.end() ? nullptr : &it->second;
    }

    // Bytes held by the repository's texts (arena and index), for reports.
    size_t GetTextBytes() const { return texts_->bytes(); }

    // Interned copy of a text, owned by the repository.
    const char* Text(std::string_view text) { return texts_->Intern(text); }

private:
    friend class Cs_Loader;
    friend class Cs_Store;
    friend class Cs_Rows::Builder;
    friend class Cs_Constraint;
    using Constraints = std::vector<std::unique_ptr<Cs_Constraint>>;
    struct Source {
        std::unique_ptr<Cs_FileInfo> info;
        Constraints constraints;  // in file order
        Cs_ReturnCode parse;      // statuses of the last read
    };

    Source* FindSource(const std::string& name);
    Source& AddSource(const std::string& name, int syntax);
    // Reads one source, replacing its constraints; text is its content when already read.
    Cs_ReturnCode ReadSource(Source& source, std::shared_ptr<const Pr_FileText> text = nullptr);
    // Whether a source differs from what was read; text gets its current content.
    static bool IsStale(const Source& source, std::shared_ptr<const Pr_FileText>& text);
    // After sources changed: resolves again unless in bulk mode.
    void Changed();
    // Resolution of every constraint (cs_resolve.cpp).
    Cs_ReturnCode Resolve();
    // Gives c the objects found (emptied); lists of more than one are kept by the repository.
    void SetObjects(Cs_Constraint& c, std::vector<Ndm_PropertyHolder*>& found);
    // Whether c was read from an NCF (the others are read as UCFs).
    bool IsFromNcf(const Cs_Constraint& c) const;
    template <class F>
    void ForEach(F&& f) const {
        for (const Source& s : sources_)
            for (const auto& c : s.constraints) f(*c);
        for (const auto& c : loose_) f(*c);
    }

    const Ndm_Design* design_ = nullptr;
    std::vector<Source> sources_;
    Constraints loose_;  // constraints of no file (CreateConstraints, take-in), after the sources
    Cs_ReturnCode resolution_;  // statuses of the last resolution
    std::unique_ptr<Ndm_NamePool> texts_;
    std::deque<std::vector<Ndm_PropertyHolder*>> object_lists_;  // the constraints' lists of objects
    bool bulk_ = false;
    bool bulk_changed_ = false;
    mutable Cs_ReturnCode store_outcome_;
    // The repository file that holds exactly what the repository holds, with the identity
    // (device, inode, size, time) it had then; empty after any change.
    mutable std::string same_as_file_;
    mutable std::string same_as_identity_;
    void Unchanged(const std::string& file) const;
    std::unordered_map<const Cs_Constraint*, CommittedNames> committed_;
    // The design objects of restored constraints, by full name, looked up when first asked for
    // (cs_restore.cpp): a restore then costs what the repository holds, not what the design does.
    struct PendingObject {
        Cs_Constraint* constraint;
        const char* name;                    // kept by texts_
        uint8_t kind;                        // a Cs_Rows::Object
        uint8_t conflict;                    // 0: an object it resolved to; else a conflict's type
        const Cs_Constraint* by = nullptr;   // the conflict's winner
    };
    std::vector<PendingObject> pending_;
    // Looks up every pending object (a constraint asked for its objects or conflicts).
    void FindPendingObjects();
    // Before constraints go: forgets what is pending for them.
    void ForgetPending(const Constraints& going);
};
