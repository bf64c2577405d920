// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "Host/Timeline/Model.h"

namespace Vantrel::Host {

/// A film that a timeline asks for: every frame of it shows its own number (NumberPicture.h).
struct TestMediaPlan {
    std::string name;  ///< of the file, without a folder
    std::int64_t firstFrame = 0;
    std::int64_t frameCount = 1;
    std::int64_t ticksPerFrame = 0;
};

/// One film for each reference of a document that stands for a file: its own name, or the clip's where it is missing;
/// the available range, or what the clips use of it.
[[nodiscard]] std::vector<TestMediaPlan> PlanTestMedia(const Document& document);

/// Writes the films into a folder, which must exist. `progress` is told each file's path before it is written. Throws
/// OutputError.
void WriteTestMedia(const std::vector<TestMediaPlan>& plans, const std::string& folder,
                    const std::function<void(const std::string&)>& progress);

}  // namespace Vantrel::Host
