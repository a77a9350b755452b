// Ta_LunCSHelper: the repository road. The host constructs one bridge with the project (OVI)
// file and a flow name; the bridge owns the process-wide repository manager, knows where the
// repository file lives, binds and restores the repository, loads constraint files into it,
// attaches what the repository keeps as plain attributes, reports its findings by the DRC level,
// commits it, and writes its constraints back onto the netlist. docs/repository-road.md tells
// the whole road.
#pragma once

#include <cstdint>

#include "host/filter/prop_filter.h"
#include "host/port/string_base.h"
#include "host/repository/cs_mgr.h"
#include "host/util/fname_group.h"

class Ndm_Design;
class Ndm_PropertyHolder;
class Ndm_View;

class Ta_LunCSHelper {
public:
    // Bridge modes, read from "ZEP_QUILLMAP_CS" by GetMode; the host acts on them.
    // 32 bits wide: the host also meets the unnamed value 4, and 0 before the mode is read.
    enum MODE : int32_t { NO_CS = 1, CREATE_BCD = 2, WRITE_BACK = 3 };
    // DRC levels, from "ZEP_QUILLMAP_CONSTRAINT_DRC".
    enum DRC_LEVEL { NONE = 0, WARN_ONLY = 10, NORMAL = 20, STRICT = 30 };

    // ---- DRC level and status reporting
    // The DRC level, read afresh on every call; an unknown value is fatal.
    static int GetDrcLevel();
    // Reports a repository outcome by the DRC level.
    static bool Drc(Cs_ReturnCode& outcome);
    // Reports one parse status: a warning below NORMAL, an error from NORMAL on.
    static bool PrintParseError(const Cs_Status_Parse* status, int level);

    // ---- modes, set-up and commit
    // Creates the process-wide repository manager (a second bridge while one lives throws
    // Util::IllegalMethodCalledException), the filter on "ucf.prp" and the repository path.
    Ta_LunCSHelper(const Port::StringBase<char>& ovi_file, const Port::StringBase<char>& flow);
    // Copies share the manager and the filter with their source; each is released once.
    Ta_LunCSHelper(const Ta_LunCSHelper& other);
    Ta_LunCSHelper& operator=(const Ta_LunCSHelper& other);
    ~Ta_LunCSHelper();
    Cs_ConstraintMgr* GetConstraintsMgr() { return m_cmgr; }
    void SetOviFlow() { m_oviFlow = true; }
    // The mode; "ZEP_QUILLMAP_CS" is read once per bridge.
    MODE GetMode();
    // Binds design; in the OVI flow restores the repository and re-reads changed sources.
    bool Init(Ndm_Design* design);
    // Writes the repository file and the file-name properties of the view EXPANDED.
    bool Commit();
    // Where the repository file lives.
    const Port::StringBase<char>& GetBcdPath() const { return m_bcdPath; }
    // Where the repository file of a project file lives (the constructor's rule, without
    // creating anything): the path less its last four characters, "_qdb/cst.qbcd"; for an empty
    // path "zepk_auto_0_qdb/cst.qbcd".
    static Port::StringBase<char> RepositoryPath(const Port::StringBase<char>& ovi_file);

    // ---- diagnostics
    static void AssociationDrc(const Cs_ReturnCode& outcome, bool allowUnmatchedIO, bool allowUnmatchedMaxDelay);
    static void ReportNoAssociations(Cs_SharedContainerT<Cs_Constraint*>& constraints, bool allowUnmatchedIO,
                                     bool allowUnmatchedMaxDelay);
    bool ReportConflicts();
    static bool InvalidConstraintDrc(Cs_Constraint_Unsupported* constraint);

    // ---- annotation through the repository
    bool Annotate(Util_FNameGroup* files, int count, bool useFilter);
    bool AnnotateSpecificUnsupportedType(Util_FNameGroup* files, int count, const Port::StringBase<char>& key);
    bool GetPartAndSteppingFromUCF(Util_FNameGroup* files, int count, Port::StringBase<char>& part,
                                   Port::StringBase<char>& stepping);
    bool AttachUnsupportedConstraint(Cs_Constraint_Unsupported* constraint, const Cs_SourceFile* sourceFile,
                                     Ndm_PropertyHolder* object);
    bool AttachConstraint(const char* name, const char* value, Ndm_PropertyHolder* object,
                          const Cs_SourceFile* sourceFile);
    static bool Check_Buffer_Type(Cs_Constraint_Unsupported* constraint, const Cs_SourceFile* sourceFile,
                                  Ndm_PropertyHolder* object, const char* fileKind);
    bool AddConstraintToList(const char* name, Ndm_PropertyHolder* object);
    // The verdict messages of an attachment, located at the constraint's file and line; a
    // constraint read from no file is shown as file "<not avail>", line -999.
    bool ConstraintDRC(const Ndh_PropFiltResult& result, const char* name, const Cs_SourceFile* sourceFile);

    // ---- write-back to the netlist
    bool WriteConstraintsToNgd(bool expanded);
    void WriteConstraintProps(Ndm_View* view);
    void ReplaceConstraintFromProps(Ndm_View* view, bool deleteProperties);
    static void CreatePortString(const wchar_t* text, Port::StringBase<char>& target);

private:
    void Share(const Ta_LunCSHelper& other);
    void Release();

    Cs_ConstraintMgr* m_cmgr = nullptr;
    Ndm_Design* m_design = nullptr;
    Ndh_PropInFilter* m_filter = nullptr;
    Port::StringBase<char> m_oviFile;
    Port::StringBase<char> m_bcdPath;
    MODE m_mode = static_cast<MODE>(0);
    bool m_oviFlow = false;
    bool m_attachBufferType = true;
    // Users of m_filter: the bridge and its copies.
    std::shared_ptr<Ndh_PropInFilter> filter_owner_;
};
