// Ta_LunCSHelper: DRC level and status reporting; modes, set-up, copies and commit.
#include "bridge/bridge_messages.h"
#include "bridge/luncshelper.h"

#include <map>
#include <memory>
#include <string>
#include <typeinfo>

#include "host/design/ndm.h"
#include "host/port/env.h"
#include "host/port/file.h"
#include "host/port/msgman.h"
#include "host/port/stream.h"
#include "host/util/shared_resource.h"

using luncshelper::Msg;

namespace {

constexpr int kManagerKey = 1234321;

// The registry of shared repository managers: by integer key, the object and its users.
struct ManagerRegistry {
    struct Entry {
        Cs_ConstraintMgr* manager;
        int uses;
    };
    std::map<int, Entry> entries;
    int current = 0;
};

std::string RegistryKey() { return std::string(typeid(Cs_ConstraintMgr).name()) + typeid(int).name(); }

ManagerRegistry* FindRegistry() {
    return static_cast<ManagerRegistry*>(Util::Details::SharedResourceMgr::find(RegistryKey().c_str()));
}

}  // namespace

// ---------------------------------------------------------------- DRC level and reporting

int Ta_LunCSHelper::GetDrcLevel() {
    const char* value = Port_Env::GetEnv("ZEP_QUILLMAP_CONSTRAINT_DRC");
    if (!value) return NORMAL;
    const std::string v(value);
    if (v == "NONE") return NONE;
    if (v == "WARN_ONLY") return WARN_ONLY;
    if (v == "NORMAL") return NORMAL;
    if (v == "STRICT") return STRICT;
    Msg(__LINE__).issueFatal(0, "Invalid argument for ZEP_QUILLMAP_CONSTRAINT_DRC env var\n");
}

bool Ta_LunCSHelper::Drc(Cs_ReturnCode& outcome) {
    const int level = GetDrcLevel();
    if (level == NONE) return true;
    for (const auto& status : outcome) {
        if (status->GetID() == Cs_StatusID::PARSE_ERROR) {
            PrintParseError(dynamic_cast<const Cs_Status_Parse*>(status.get()), level);
        } else if (status->GetID() == Cs_StatusID::NO_RESOLVED_ASSOCIATIONS && status->GetLocalizedMsgNum() == 80) {
            continue;
        } else {
            status->Report();
        }
    }
    return true;
}

bool Ta_LunCSHelper::PrintParseError(const Cs_Status_Parse* status, int level) {
    if (!status) return true;
    Port::StringBase<char> text;
    CreatePortString(status->GetLocalizedMsg().c_str(), text);
    const Cs_SourceFile* where = status->GetSourceFile();
    const char* file = where && where->GetFile() ? where->GetFile() : "";
    const int line = where ? where->GetLine() : 0;
    if (level < NORMAL)
        Msg(__LINE__).issueWarning("Line %d in %s: %s\n", line, file, text.c_str());
    else
        Msg(__LINE__).issueError("Line %d in %s: %s\n", line, file, text.c_str());
    return true;
}

// ---------------------------------------------------------------- set-up

Ta_LunCSHelper::Ta_LunCSHelper(const Port::StringBase<char>& ovi_file, const Port::StringBase<char>& flow) {
    const std::string key = RegistryKey();
    ManagerRegistry* registry = FindRegistry();
    if (!registry) {
        registry = new ManagerRegistry();
        Util::Details::SharedResourceMgr::insert(key.c_str(), registry);
    }
    registry->current = kManagerKey;
    if (registry->entries.count(kManagerKey))
        throw Util::IllegalMethodCalledException("Quillmap", __FILE__, "1.0", __LINE__,
                                                 "Shared Object already exists. Use Get() instead of Create().\n");
    m_cmgr = new Cs_ConstraintMgr();
    registry->entries[kManagerKey] = {m_cmgr, 1};

    filter_owner_ = std::make_shared<Ndh_PropInFilter>("ucf.prp", nullptr);
    m_filter = filter_owner_.get();
    m_oviFile = ovi_file;
    m_mode = static_cast<MODE>(0);
    m_oviFlow = flow.str() == "ovi";
    m_attachBufferType = true;

    m_bcdPath = RepositoryPath(ovi_file);
    const std::string dir = m_bcdPath.str().substr(0, m_bcdPath.str().rfind('/'));
    if (!Port::File::exist(dir.c_str())) Port::File::mkdir(dir.c_str(), false);
    if (!ovi_file.IsEmpty()) Port_MsgManData::debugStub("BCD Path: %s\n", m_bcdPath.c_str());
}

Port::StringBase<char> Ta_LunCSHelper::RepositoryPath(const Port::StringBase<char>& ovi_file) {
    if (ovi_file.IsEmpty()) return Port::StringBase<char>("zepk_auto_0_qdb/cst.qbcd");
    std::string dir = ovi_file.str();
    dir.resize(dir.size() >= 4 ? dir.size() - 4 : 0);
    return Port::StringBase<char>(dir + "_qdb/cst.qbcd");
}

void Ta_LunCSHelper::Share(const Ta_LunCSHelper& other) {
    m_cmgr = other.m_cmgr;
    m_design = other.m_design;
    m_filter = other.m_filter;
    filter_owner_ = other.filter_owner_;
    m_oviFile = other.m_oviFile;
    m_bcdPath = other.m_bcdPath;
    m_mode = other.m_mode;
    m_oviFlow = other.m_oviFlow;
    m_attachBufferType = other.m_attachBufferType;
    if (!m_cmgr) return;
    if (ManagerRegistry* registry = FindRegistry()) {
        auto it = registry->entries.find(kManagerKey);
        if (it != registry->entries.end() && it->second.manager == m_cmgr) ++it->second.uses;
    }
}

Ta_LunCSHelper::Ta_LunCSHelper(const Ta_LunCSHelper& other) { Share(other); }

Ta_LunCSHelper& Ta_LunCSHelper::operator=(const Ta_LunCSHelper& other) {
    if (this == &other) return *this;
    Release();
    Share(other);
    return *this;
}

void Ta_LunCSHelper::Release() {
    if (m_cmgr) {
        const std::string key = RegistryKey();
        if (ManagerRegistry* registry = FindRegistry()) {
            auto it = registry->entries.find(kManagerKey);
            if (it != registry->entries.end() && it->second.manager == m_cmgr && --it->second.uses == 0) {
                delete it->second.manager;
                registry->entries.erase(it);
                if (registry->entries.empty()) {
                    Util::Details::SharedResourceMgr::erase(key.c_str());
                    delete registry;
                }
            }
        }
        m_cmgr = nullptr;
    }
    m_filter = nullptr;
    filter_owner_.reset();
}

Ta_LunCSHelper::~Ta_LunCSHelper() { Release(); }

Ta_LunCSHelper::MODE Ta_LunCSHelper::GetMode() {
    if (m_mode != 0) return m_mode;
    const char* value = Port_Env::GetEnv("ZEP_QUILLMAP_CS");
    if (!value) {
        m_mode = WRITE_BACK;
        Port_MsgManData::debugStub("Ta_LunCSHelper::MODE = WRITE_BACK\n");
        return m_mode;
    }
    const std::string v(value);
    if (v == "0") {
        m_mode = NO_CS;
        Port_MsgManData::debugStub("Ta_LunCSHelper::MODE = NO_CS\n");
    } else if (v == "1") {
        m_mode = CREATE_BCD;
        Port_MsgManData::debugStub("Ta_LunCSHelper::MODE = CREATE_BCD\n");
    } else if (v == "2") {
        m_mode = WRITE_BACK;
        Port_MsgManData::debugStub("Ta_LunCSHelper::MODE = WRITE_BACK\n");
    } else if (v == "3") {
        m_mode = static_cast<MODE>(4);
        Port_MsgManData::debugStub("Ta_LunCSHelper::MODE = NO_CS\n");
    } else {
        Msg(__LINE__).issueFatal(0, "Invalid argument for ZEP_QUILLMAP_CS env var\n");
    }
    return m_mode;
}

bool Ta_LunCSHelper::Init(Ndm_Design* design) {
    m_cmgr->DeleteAllConstraints();
    m_cmgr->SetDesign(design);
    m_design = design;
    if (!m_oviFlow) return true;
    Cs_ReturnCode result = m_cmgr->Restore(m_bcdPath);
    for (const Cs_FileInfo* source : m_cmgr->GetConstraintSources())
        Msg(__LINE__).issueStatus("Reading in constraint information from '%s'...\n", source->GetFileName());
    if (!m_cmgr->GetOutOfDateConstraintSources().empty()) {
        Port_MsgManData::debugStub("There are some out of date constraint sources...\n");
        result = m_cmgr->UpdateConstraintsFromSource();
        Drc(result);
    }
    Cs_Filter_ConstraintType filter(Cs_Constraint_Unsupported::Type());
    for (Cs_Constraint* c : m_cmgr->GetConstraints(filter, Cs_ConstraintMgr::ACTIVE)) {
        auto* u = static_cast<Cs_Constraint_Unsupported*>(c);
        Check_Buffer_Type(u, u->GetSourceInfo()->GetSourceFile(), nullptr, "UCF");  // the form without an instance
    }
    return true;
}

bool Ta_LunCSHelper::Commit() {
    Port_MsgManData::debugStub("Committing changes to repo\n");
    Cs_ReturnCode result = m_cmgr->Commit(m_bcdPath);
    if (!Port_Env::GetEnv("ZEP_QUILLMAP_NO_OVI_PROP") && m_design) {
        // A design without the view EXPANDED has nowhere to keep the two names.
        if (Ndm_View* view = m_design->GetViewByName("EXPANDED")) {
            view->DeleteProperty("EXPANDED_OVI_FILE");
            view->CreatePropertyString("EXPANDED_OVI_FILE", m_oviFile.c_str());
            view->DeleteProperty("EXPANDED_BCD_FILE");
            view->CreatePropertyString("EXPANDED_BCD_FILE", m_bcdPath.c_str());
        }
    }
    return static_cast<bool>(result);
}

void Ta_LunCSHelper::CreatePortString(const wchar_t* text, Port::StringBase<char>& target) {
    std::unique_ptr<char[]> narrow(Port::wcstombs(text));
    if (narrow) target = Port::StringBase<char>(narrow.get());
}
