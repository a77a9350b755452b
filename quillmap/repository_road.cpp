// quillmap annotate --project: the constraint files go through the constraint repository and
// its bridge, which keeps them in a repository file beside the project file. docs/repository-road.md
// tells the whole road.
#include <unistd.h>

#include <cstdlib>
#include <optional>
#include <string>

#include "bridge/luncshelper.h"
#include "host/design/native_format.h"
#include "host/design/ndm.h"
#include "host/port/file.h"
#include "host/port/msgman.h"
#include "host/util/shared_resource.h"
#include "quillmap/app.h"

namespace {

// The repository's folder, removed again when the run wrote nothing into it.
class RepositoryFolder {
public:
    explicit RepositoryFolder(std::string file) : file_(std::move(file)) {}
    ~RepositoryFolder() {
        if (Port::File::exist(file_.c_str())) return;
        size_t slash = file_.rfind('/');
        if (slash != std::string::npos) ::rmdir(file_.substr(0, slash).c_str());  // only when empty
    }

private:
    std::string file_;
};

// Whether every file can be read now (a restored repository still holds what a file that has
// gone away gave; reading the files again reports it).
bool AllReadable(const std::vector<std::string>& files) {
    for (const std::string& file : files)
        if (::access(file.c_str(), R_OK) != 0) return false;
    return true;
}

// Whether the repository restored by Init holds exactly the given files, in their order.
bool SameSources(const Cs_ConstraintMgr& mgr, const std::vector<std::string>& files) {
    std::vector<Cs_FileInfo*> sources = mgr.GetConstraintSources();
    if (sources.size() != files.size()) return false;
    for (size_t i = 0; i < files.size(); ++i)
        if (files[i] != sources[i]->GetFileName()) return false;
    return true;
}

std::string Count(size_t n, const char* noun) {
    return std::to_string(n) + " " + noun + (n == 1 ? "" : "s");
}

}  // namespace

int QuillmapRepositoryRoad(const QuillmapRoadRequest& request, const std::function<int()>& file_road) {
    if (!QuillmapProjectNameIsValid(request.project)) return kStatusFatal;
    if (!request.drc.empty()) ::setenv("ZEP_QUILLMAP_CONSTRAINT_DRC", request.drc.c_str(), 1);
    Ta_LunCSHelper::GetDrcLevel();  // a bad level is fatal before anything is written

    std::optional<Ta_LunCSHelper> bridge;
    try {
        bridge.emplace(Port::StringBase<char>(request.project), Port::StringBase<char>("ovi"));
    } catch (const Util::IllegalMethodCalledException&) {
        QuillmapMsg(__LINE__).issueInternal("A constraint repository bridge exists already.\n");
        return kStatusErrors;
    }
    const std::string bcd = bridge->GetBcdPath().str();
    RepositoryFolder folder(bcd);
    const Ta_LunCSHelper::MODE mode = bridge->GetMode();
    if (mode != Ta_LunCSHelper::CREATE_BCD && mode != Ta_LunCSHelper::WRITE_BACK) {
        bridge.reset();
        return file_road();
    }
    if (request.has_ncf) {
        QuillmapMsg(__LINE__).issueError(
            "NCF files cannot be read through the constraint repository: give them without --project, or set "
            "ZEP_QUILLMAP_CS to 0 to read every file without the repository.\n");
        return kStatusFatal;
    }
    if (!request.file_road_options.empty()) {
        QuillmapMsg(__LINE__).issueError(
            "%s cannot be used with the constraint repository, which reads the files by its own rules: give them "
            "without --project, or set ZEP_QUILLMAP_CS to 0.\n",
            request.file_road_options.c_str());
        return kStatusFatal;
    }

    auto design = QuillmapLoadDesign(request.design, request.top);
    if (!design) return kStatusErrors;
    if (!QuillmapWorkView(*design, request.design, "annotate")) return kStatusErrors;
    Cs_ConstraintMgr& mgr = *bridge->GetConstraintsMgr();

    const bool had_repository = Port::File::exist(bcd.c_str());
    bridge->Init(design.get());
    bool restored = false;
    if (had_repository && !mgr.GetStoreOutcome()) {
        // A damaged or foreign file is replaced by the next commit; the files are read instead.
        Cs_ReturnCode why = mgr.GetStoreOutcome();
        for (const auto& status : why) {
            std::unique_ptr<Cs_Status> copy(status->Clone());
            copy->SetSeverity(Cs_Status::WARNING);
            copy->Report();
        }
        QuillmapMsg(__LINE__).issueStatus("The constraints are read from the constraint files again.\n");
        mgr.DeleteAllConstraints();
    } else if (had_repository && SameSources(mgr, request.ucf) && !AllReadable(request.ucf)) {
        QuillmapMsg(__LINE__).issueStatus(
            "A constraint file of the constraint repository '%s' cannot be read: every file is read again.\n",
            bcd.c_str());
        mgr.DeleteAllConstraints();
    } else if (had_repository && SameSources(mgr, request.ucf)) {
        size_t again = 0;
        for (const Cs_FileInfo* source : mgr.GetConstraintSources()) again += source->ReadHere();
        QuillmapMsg(__LINE__).issueStatus("Restored the constraint repository '%s': %zu constraints of %s, %s.\n", bcd.c_str(),
                                  mgr.GetNumConstraints(), Count(request.ucf.size(), "file").c_str(),
                                  again == 0 ? "none changed" : (Count(again, "file") + " read again").c_str());
        restored = true;
    } else if (had_repository) {
        QuillmapMsg(__LINE__).issueStatus(
            "The constraint files differ from those of the constraint repository '%s': every file is read again.\n",
            bcd.c_str());
        mgr.DeleteAllConstraints();
    }

    // Read the files (unless restored), then attach what the repository keeps as plain attributes.
    Util_FNameGroup files;
    if (!restored)
        for (const std::string& file : request.ucf) files.add_fname(file.c_str());
    bridge->Annotate(&files, files.num_fnames(), true);

    Ta_LunCSHelper::AssociationDrc(mgr.GetResolutionFindings(), request.allow_unmatched_io,
                                   request.allow_unmatched_maxdelay);
    bridge->ReportConflicts();
    if (!bridge->Commit())
        for (const auto& status : mgr.GetStoreOutcome()) status->Report();
    if (mode == Ta_LunCSHelper::WRITE_BACK) bridge->WriteConstraintsToNgd(true);

    if (!request.output.empty() && !Ndm_WriteNative(*design, request.output.c_str())) return kStatusErrors;
    return kStatusOk;
}
