// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace Kiln {

/// Writes a trace line at level 10, when the category ("Kiln.Module", "Kiln.Device") is wanted. Any thread.
void Log(const char* category, const std::string& message);

}  // namespace Kiln
