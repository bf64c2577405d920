// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json.hpp>

#include "Host/Inspect/Inspection.h"

namespace Vantrel::Host {

/// An inspection in the form that Docs/inspect.schema.json lays down.
[[nodiscard]] nlohmann::ordered_json InspectionToJson(const Inspection& inspection);

}  // namespace Vantrel::Host
