// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Marl/IVideoFrame.h"

namespace Kiln {

/// Frames by fingerprint, least recently used first to go, bounded in bytes. Thread safe.
class FrameCache {
public:
    virtual ~FrameCache() = default;

    /// Keeps a frame, replacing what stood under that fingerprint. A frame larger than the bound isn't kept.
    virtual void CacheFrame(const Halden::utility::Guid& hash, const Marl::VideoFrameRef& frame) = 0;
    /// The frame, which thereby becomes the most recent one; empty when absent.
    [[nodiscard]] virtual Marl::VideoFrameRef FindFrame(const Halden::utility::Guid& hash) = 0;
    /// Lets go of the least recently used frames until `bytes` have been freed or nothing is left. Returns bytes freed.
    virtual std::uint64_t Purge(std::uint64_t bytes) = 0;

    [[nodiscard]] virtual std::uint64_t GetBytes() const = 0;
};

}  // namespace Kiln
