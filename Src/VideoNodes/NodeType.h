// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace Vantrel {

/// The kind of a host node.
enum class NodeType : std::uint32_t {
    kClip = 0,
    kCompositor = 1,
    kTransition = 2,
    kEffect = 3,
    kMedia = 4,
    kPreview = 5,
    kSolidColor = 6,  ///< never told by a live view, which counts as unknown
    kDisabled = 7,
    kMulticam = 8,
    kAdjustment = 9,
    kUnknown = 10
};

/// The kind that the host's text names, compared as a whole; anything else is kUnknown.
[[nodiscard]] NodeType NodeTypeFromText(const std::string& kindText);

}  // namespace Vantrel
