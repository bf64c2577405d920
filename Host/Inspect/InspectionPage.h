// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Host/Inspect/Inspection.h"

namespace Vantrel::Host {

/// The inspection as one page for a browser, which needs nothing else. Its parts lie in Host/Inspect/Page.
[[nodiscard]] std::string InspectionToPage(const Inspection& inspection);

}  // namespace Vantrel::Host
