// The attachment steps every road shares: a property is built in the temporary list
// "_TempPropList" on its object, judged by the property filter (which puts an accepted one on
// the object), and the list is removed again; the names of attached constraints are kept in
// the object's "FROM_UCF" or "FROM_NCF" list.
#pragma once

#include <functional>

#include "host/filter/prop_filter.h"

class Ndm_Property;
class Ndm_PropertyHolder;

// Builds the property with make_entry inside a fresh "_TempPropList" on object, runs the
// filter, removes the list and returns the verdict.
Ndh_PropFiltResult Ndh_FilterOnto(Ndh_PropInFilter& filter, Ndm_PropertyHolder* object,
                                  const std::function<void(Ndm_Property* list)>& make_entry);

// Appends name in upper case to the string list list_name of object (created when missing).
void Ndh_RecordConstraintName(Ndm_PropertyHolder* object, const char* list_name, const char* name);
