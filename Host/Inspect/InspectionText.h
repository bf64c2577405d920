// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Host/Inspect/Inspection.h"

namespace Vantrel::Host {

struct TextStyle {
    /// Columns of the terminal; the bar is as wide.
    int width = 80;
    /// Colours by escape sequences; letters without.
    bool colors = false;
};

/// A bar over time with its scale and legend, and a table of the stretches.
[[nodiscard]] std::string InspectionToText(const Inspection& inspection, const TextStyle& style);

}  // namespace Vantrel::Host
