// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Log.h"

#include "Halden/Trace.h"

namespace Kiln {
namespace {
constexpr int kLevel = 10;
}

void Log(const char* category, const std::string& message) {
    if (!Halden::debug::TraceEnabled(category, kLevel, 1)) return;
    Halden::debug::Trace(Halden::debug::TracePrefix(category, kLevel) + message);
}

}  // namespace Kiln
