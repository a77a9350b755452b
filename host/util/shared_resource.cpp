#include "host/util/shared_resource.h"

#include <map>

namespace Util::Details {

namespace {
std::map<std::string, void*>& Registry() {
    static std::map<std::string, void*> registry;
    return registry;
}
}  // namespace

void* SharedResourceMgr::find(const char* key) {
    auto it = Registry().find(key ? key : "");
    return it == Registry().end() ? nullptr : it->second;
}

void SharedResourceMgr::insert(const char* key, void* object) { Registry()[key ? key : ""] = object; }

void SharedResourceMgr::erase(const char* key) { Registry().erase(key ? key : ""); }

}  // namespace Util::Details
