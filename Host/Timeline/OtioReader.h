// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Host/Timeline/JsonCursor.h"
#include "Host/Timeline/Model.h"

/// Reads OpenTimelineIO files: video only, everything else is skipped.
namespace Vantrel::Host {

/// @throws TimelineError
[[nodiscard]] Document ReadTimelineFile(const std::string& file);

/// @param file names the text in messages; media with a relative path are looked for beside it
/// @throws TimelineError
[[nodiscard]] Document ReadTimelineText(const std::string& text, const std::string& file);

}  // namespace Vantrel::Host
