/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_FILTERS_H
#define CONFIGSTORE_LAYOUTS_FILTERS_H

// The record of a port's traffic filters: a count and filters of variable size, each with its parameters.

#include "configstore/layouts/layout.h"
#include "configstore/layouts/store_form.h"

namespace dvs::layout::filters {

// clang-format off
inline constexpr Field kParameterFields[] = {
    // name    offset width kind             domain   meaning
    {"ordinal",     0,    4, Kind::kUnsigned, nullptr, "number of the parameter, from 0"},
    {"text",        4,  256, Kind::kText,     nullptr, "what the agent is given"},
};
inline constexpr Record kParameter = {"filter parameter", 260, kParameterFields, {}};
static_assert(IsSound(kParameter));

inline constexpr const char *kOnFailureTexts[] = {"FAIL_CLOSED", "FAIL_OPEN"};
inline constexpr Domain kOnFailure = {"what becomes of traffic without the agent", kOnFailureTexts, 2, {}};

inline constexpr Field kFilterFields[] = {
    // name            offset width kind             domain       meaning
    {"slot_number",         0,    4, Kind::kUnsigned, nullptr,     "place in the chain of filters"},
    {"agent_name",          4,   40, Kind::kText,     nullptr,     "agent that filters"},
    {"parameter_count",    44,    4, Kind::kCount,    nullptr,     "number of parameters"},
    {"on_failure",         48,    4, Kind::kEnum,     &kOnFailure, "1 lets traffic pass without the agent, all else stops it"},
};
inline constexpr Part kFilterParts[] = {
    {"parameters", &kParameter, CountBy::kField, 0, "parameter_count", nullptr, 0, "what the agent is given"},
};
inline constexpr Record kFilter = {"filter", 52, kFilterFields, kFilterParts};
static_assert(IsSound(kFilter));

inline constexpr Field kConfigFields[] = {
    // name         offset width kind          domain   meaning
    {"filter_count",     0,    4, Kind::kCount, nullptr, "number of filters"},
};
inline constexpr Part kConfigParts[] = {
    {"filters", &kFilter, CountBy::kField, 0, "filter_count", nullptr, 0, "the filters, each with its parameters"},
};
// clang-format on

} // namespace dvs::layout::filters

namespace dvs::layout {

inline constexpr Record kFilterConfig = {"filter configuration", 4, filters::kConfigFields,
                                         filters::kConfigParts};
static_assert(IsSound(kFilterConfig));

} // namespace dvs::layout

namespace dvs::layout::filters {

// clang-format off
inline constexpr const char *kOnFailureWords[] = {"FAIL_OPEN", "FAIL_CLOSED"};
inline constexpr Domain kOnFailureDomain = {"on failure", kOnFailureWords, 2, {}};
inline constexpr StoreField kFilterMembers[] = {
    // name         form          place                                              unit max domain id members meaning
    {"slot_number", Form::kText,  Decimal(kFilter, "slot_number"),                  "", 0,   nullptr,           nullptr, {}, "place in the chain of filters, as decimal text", Rule::kSlot},
    {"agent_name",  Form::kText,  In(kFilter, "agent_name"),                        "", 39,  nullptr,           nullptr, {}, "agent that filters"},
    {"on_failure",  Form::kText,  In(kFilter, "on_failure", Unnamed::kFirst),       "", 0,   &kOnFailureDomain, nullptr, {}, "what becomes of traffic without the agent"},
    {"parameters",  Form::kTexts, Elements(kFilter, "parameters", "text", "ordinal"), "", 255, nullptr,         nullptr, {}, "what the agent is given"},
};
inline constexpr StoreField kMembers[] = {
    {"network_filters", Form::kInstances, Elements(kFilterConfig, "filters"), "", 0, nullptr, "slot_number", kFilterMembers, "the filters"},
};
// clang-format on

} // namespace dvs::layout::filters

namespace dvs::layout {

inline constexpr StoreField kFiltersForm = {
    nullptr, Form::kObject, {}, "", 0, nullptr, nullptr, filters::kMembers, "filters of the port"};

} // namespace dvs::layout

#endif
