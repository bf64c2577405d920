// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "Host/Inspect/Inspection.h"
#include "Host/Session/RenderSession.h"

namespace Vantrel::Host {

/// Asks the engine for every stretch of the top sequence and finds the reasons. Nothing is rendered.
[[nodiscard]] Inspection Inspect(RenderSession& session, const std::string& file);

/// Renders the middle frame of every stretch that has one, and measures it with the device's timing on.
/// @param progress is told how many stretches are done
/// Returns false when `stop` ended it before the last one. Throws std::runtime_error.
bool RenderStretches(RenderSession& session, Inspection& inspection, std::int32_t width, std::int32_t height,
                     const std::function<void(std::int64_t)>& progress, const std::atomic<bool>& stop);

/// Takes the timing lines of the engine's report, and gives each node of a tree its time where the names tell which is
/// which.
void ReadTimings(const std::string& report, StretchFrame& frame, TreeNode& tree);

}  // namespace Vantrel::Host
