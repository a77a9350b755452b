// Ta_LunBase: construction, copies, options, the run over a view and comment lines.
#include "frame/lunbase.h"

#include <cstring>

#include "host/filter/prop_filter.h"
#include "host/port/env.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"

namespace {
const char* kDefaultFilter = "ucf.pfd";

Port_MsgManData Msg(int line) { return Port_MsgManData::createObject("Quillmap", "lunbase", line, "1.0"); }
}  // namespace

Ta_LunBase::Ta_LunBase(const char* filename, CP_FILE_TYPE type, const char* filter_file)
    : Pr_Logical_Parser(filename),
      constraint_filename(nullptr),
      view(nullptr),
      filter_filename(nullptr),
      prop_filter(nullptr),
      file_type(type),
      case_sensitive(type != CP_UCF),
      debug_callbacks(false),
      file_from_csttrans(false),
      second_pass(false),
      blocks_(type == CP_UCF) {
    Port_MsgManData::debugStub("Debugging the Data Driven Parser\n");
    if (!filename) Msg(__LINE__).issueFatal(2, "No filename supplied!\n");
    constraint_filename = UT_STR::Dup(filename);
    second_pass = Port_Env::GetEnv("ZEP_QUILLMAP_SECOND_UCF_PASS") != nullptr;
    if (filter_file) filter_filename = UT_STR::Dup(filter_file);
}

// A copy owns its own strings and, when the source has a filter, its own filter over the same
// definition file: nothing the source still uses is ever released by the copy.
void Ta_LunBase::CopyFrom(const Ta_LunBase& other) {
    constraint_filename = UT_STR::Dup(other.constraint_filename);
    view = other.view;
    filter_filename = UT_STR::Dup(other.filter_filename);
    prop_filter = other.prop_filter
                      ? new Ndh_PropInFilter(filter_filename ? filter_filename : kDefaultFilter, nullptr)
                      : nullptr;
    file_type = other.file_type;
    case_sensitive = other.case_sensitive;
    debug_callbacks = other.debug_callbacks;
    file_from_csttrans = other.file_from_csttrans;
    second_pass = other.second_pass;
    blocks_ = other.blocks_;
}

void Ta_LunBase::Release() {
    delete[] constraint_filename;
    delete prop_filter;
    delete[] filter_filename;
    constraint_filename = nullptr;
    prop_filter = nullptr;
    filter_filename = nullptr;
}

Ta_LunBase::Ta_LunBase(const Ta_LunBase& other) : Pr_Logical_Parser(other) { CopyFrom(other); }

Ta_LunBase& Ta_LunBase::operator=(const Ta_LunBase& other) {
    if (this == &other) return *this;
    Pr_Logical_Parser::operator=(other);
    Release();
    CopyFrom(other);
    return *this;
}

Ta_LunBase::~Ta_LunBase() { Release(); }

unsigned char Ta_LunBase::annotate(Ndm_View* design_view) {
    if (!design_view) Msg(__LINE__).issueFatal(2, "No design supplied!\n");
    view = design_view;
    blocks_ = Ndm_ConstraintBlocks(file_type == CP_UCF);
    // A second run replaces the filter of the first rather than leaking it.
    delete prop_filter;
    prop_filter = new Ndh_PropInFilter(filter_filename ? filter_filename : kDefaultFilter, nullptr);
    return parse() ? 0 : 1;
}

bool Ta_LunBase::cb_comment(const char* /*text*/, const Pr_Logical_ConstraintHandle* handle) {
    const char* line = handle ? handle->return_ascii() : nullptr;
    if (line && std::strstr(line, "PROG") && std::strstr(line, "CSTTRANS")) file_from_csttrans = true;
    return true;
}
