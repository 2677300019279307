/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_FORMS_H
#define CONFIGSTORE_LAYOUTS_FORMS_H

// The store forms there are (store_form.cpp). layouts/registry.h says which converter type has which.

#include "configstore/layouts/store_form.h"

namespace dvs::layout {

extern const StoreField kFormUint32, kFormText, kFormBeacon, kFormBool, kFormAddress, kFormPvlans,
    kFormLinkDiscovery, kFormVspans, kFormIpfix, kFormHealthCheck, kFormPools, kFormPoolKeys, kFormUplinkKeys,
    kFormVersion, kFormLacpGroups, kFormTeaming, kFormUplinkNames, kFormUnmapped, kFormVlan, kFormShaping,
    kFormSecurity, kFormFilters, kFormPortLacp;

} // namespace dvs::layout

#endif
