// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vellum/Field.h"

namespace Vellum {

/// Whether a picture's lines belong to two moments.
[[nodiscard]] constexpr bool IsInterlaced(std::uint32_t fieldType) {
    return fieldType == kFieldType_UpperFirst || fieldType == kFieldType_LowerFirst;
}

}  // namespace Vellum
