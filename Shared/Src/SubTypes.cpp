// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/SubTypes.h"

#include <algorithm>
#include <initializer_list>

namespace Vantrel {
namespace {

constexpr std::uint32_t Code(const char (&text)[5]) {
    std::uint32_t code = 0;
    for (int i = 0; i < 4; ++i) code = code << 8 | static_cast<unsigned char>(text[i]);
    return code;
}

/// Sequences of one of `keys` play media of all of `codes`.
struct SubTypeFamily {
    std::initializer_list<std::uint32_t> keys;
    std::initializer_list<std::uint32_t> codes;
};

constexpr SubTypeFamily kFamilies[] = {
    {{Code("dsvn"), Code("dvc "), Code("dsv2"), Code("kl24")},
     {Code("dsvn"), Code("dvc "), Code("dsv2"), Code("kl24"), Code("dsvd")}},
    {{Code("dsvp"), Code("dvcp")}, {Code("dsvp"), Code("dvcp"), Code("dsvd")}},
    {{Code("dvn5")}, {Code("dsvn"), Code("dvc "), Code("dsv2"), Code("kl24"), Code("dsvd"), Code("dvn5")}},
    {{Code("dvp5")}, {Code("dsvp"), Code("dvcp"), Code("dsvd"), Code("dvp5")}},
    {{Code("dvn7"), Code("dvp7")}, {Code("dvn7"), Code("dvp7"), Code("dvhp")}},
    {{Code("dvn1")}, {Code("dvn1"), Code("dvh6")}},
    {{Code("dvp1")}, {Code("dvp1"), Code("dvh5")}},
    {{Code("v210")}, {Code("v210"), Code("012v")}},
    {{Code("MPIN")}, {Code("MPEG")}},
    // The key and the code of the byte-swapped form differ on purpose.
    {{Code("2vuy"), Code("2Vuy"), Code("UYVY")}, {Code("2vuy"), Code("YVYU"), Code("2Vuy")}},
};

}  // namespace

std::set<std::uint32_t> GetNativeSubTypes(std::uint32_t nativeSubType) {
    for (const SubTypeFamily& family : kFamilies) {
        if (std::find(family.keys.begin(), family.keys.end(), nativeSubType) != family.keys.end()) {
            return family.codes;
        }
    }
    return {nativeSubType};
}

std::set<std::uint32_t> GetHostSubTypes() { return {Code("DLYM")}; }

}  // namespace Vantrel
