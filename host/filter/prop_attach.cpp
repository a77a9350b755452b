#include "host/filter/prop_attach.h"

#include <string>

#include "host/design/ndm_property.h"

Ndh_PropFiltResult Ndh_FilterOnto(Ndh_PropInFilter& filter, Ndm_PropertyHolder* object,
                                  const std::function<void(Ndm_Property* list)>& make_entry) {
    // A list left behind by an interrupted attachment is replaced.
    object->DeleteProperty("_TempPropList");
    Ndm_Property* list = object->CreatePropertyList("_TempPropList");
    make_entry(list);
    Ndh_PropFiltResult result = filter.FilterProp(list, object);
    object->DeleteProperty(list);
    return result;
}

void Ndh_RecordConstraintName(Ndm_PropertyHolder* object, const char* list_name, const char* name) {
    std::string upper(name ? name : "");
    for (char& c : upper)
        if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 32);
    Ndm_Property* list = object->GetPropertyByName(list_name);
    if (!list) list = object->CreatePropertyStringList(list_name);
    list->AddString(upper.c_str());
}
