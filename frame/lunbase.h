// Ta_LunBase: the base annotator, bound to one constraint file. It runs the parser over a
// design view, attaches constraints as properties through the property filter (with the
// filter's verdict turned into messages and the FROM_UCF/FROM_NCF bookkeeping), and finds or
// creates the TIMESPEC, TIMEGRP and CONFIG constraint blocks.
#pragma once

#include <cstdint>
#include <string>

#include "host/design/ndm.h"
#include "host/design/ndm_constraint_blocks.h"
#include "host/parser/pr_logical.h"

class Ndh_PropInFilter;
class Ndh_PropFiltResult;

// Kind of constraint file.
enum CP_FILE_TYPE : int32_t { CP_NCF = 0, CP_UCF = 1 };

class Ta_LunBase : public Pr_Logical_Parser {
public:
    // Binds the annotator to a constraint file of the given kind; filter_file is the property
    // definition file, or null for the default "ucf.pfd". A null filename is fatal.
    Ta_LunBase(const char* filename, CP_FILE_TYPE type, const char* filter_file);
    Ta_LunBase(const Ta_LunBase& other);
    Ta_LunBase& operator=(const Ta_LunBase& other);
    ~Ta_LunBase() override;

    // Runs the file over the view; 1 when the parse failed, 0 when it succeeded.
    unsigned char annotate(Ndm_View* view);
    // The stored copy of the file name.
    const char* get_constraint_filename() const { return constraint_filename; }
    // Whether a comment line showed the file was written by the constraint converter.
    unsigned char is_file_from_csttrans() const { return file_from_csttrans ? 1 : 0; }
    // Turns on the per-statement trace lines; nothing turns them off.
    void set_debug_callbacks() { debug_callbacks = true; }
    bool get_second_pass() const { return second_pass; }
    void set_second_pass(bool on) { second_pass = on; }
    bool is_case_sensitive() const { return case_sensitive; }
    void set_case_sensitive(bool on) { case_sensitive = on; }

    bool cb_comment(const char* text, const Pr_Logical_ConstraintHandle* handle) override;

    // Second-pass test alone: 1 when the first pass already annotated the object.
    unsigned char AlreadyAnnotated(const char* name, Ndm_PropertyHolder* object);

protected:
    // Attach one constraint through the filter: string, boolean (from the name), integer and
    // floating-point forms. 1 on success; 0 only when the name is not a known constraint.
    unsigned char AttachConstraint(const char* name, const char* value, Ndm_PropertyHolder* object,
                                   const Pr_Logical_ConstraintHandle* handle);
    unsigned char AttachConstraint(const char* name, Ndm_PropertyHolder* object,
                                   const Pr_Logical_ConstraintHandle* handle);
    unsigned char AttachConstraint(const char* name, int value, Ndm_PropertyHolder* object,
                                   const Pr_Logical_ConstraintHandle* handle);
    unsigned char AttachConstraint(const char* name, double value, Ndm_PropertyHolder* object,
                                   const Pr_Logical_ConstraintHandle* handle);
    // Records name (upper-cased) in FROM_UCF or FROM_NCF by file kind; always 1.
    unsigned char AddConstraintToList(const char* name, Ndm_PropertyHolder* object);
    // Turns a filter verdict into messages; 0 only for an unknown constraint name.
    unsigned char ConstraintDRC(const Ndh_PropFiltResult& result, const char* name,
                                const Pr_Logical_ConstraintHandle* handle);
    // New buffer holding text between double quotes; the caller releases it with delete[].
    char* AddQuotesToString(const char* text);

    // The constraint block of type for this annotator, found or created; never null.
    Ndm_Block* GetConstraintBlock(const char* type);
    // Pre-order search from block for a usable block of type, or null.
    Ndm_Block* FindConstraintBlock(Ndm_Block* block, const char* type);
    // Adds one timing entry to a TIMESPEC or TIMEGRP block; 0 for any other block.
    unsigned char AttachTimeConstraint(const char* name, const char* value, Ndm_PropertyHolder* block);
    // "RISING", "FALLING", "TRANSHI", "TRANSLO", "" for 4, null otherwise.
    const char* GetEdgeString(PR_EDGE edge);
    // "BASE", "STRING", "STRING_LIST_TYPE", "INIT_", "OFFSET", "PERIOD", null otherwise.
    const char* GetConstraintName(Pr_Logical_ConstraintType type);

    char* constraint_filename;
    Ndm_View* view;
    char* filter_filename;
    Ndh_PropInFilter* prop_filter;
    CP_FILE_TYPE file_type;
    bool case_sensitive;
    bool debug_callbacks;
    bool file_from_csttrans;
    bool second_pass;

private:
    template <class MakeEntry>
    unsigned char Attach(const char* name, Ndm_PropertyHolder* object,
                         const Pr_Logical_ConstraintHandle* handle, MakeEntry make_entry);
    void CopyFrom(const Ta_LunBase& other);
    void Release();

    // The constraint blocks of this kind of file; those handed out in this run are remembered.
    Ndm_ConstraintBlocks blocks_{true};
};

// Turns a filter verdict for the constraint name into the messages of an attachment, located
// at file and line and issued for module ("lunbase" for the annotators); 0 only for an
// unknown name.
unsigned char Ta_LunReportVerdict(const Ndh_PropFiltResult& result, const char* name, const char* file, int line,
                                  const char* module);
