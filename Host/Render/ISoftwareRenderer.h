// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "Host/Media/HostPicture.h"
#include "Host/Snapshot/Node.h"
#include "Vantrel/HostSuites.h"

namespace Vantrel::Host {

/// The size in which a request sees its sequence.
struct SequenceSize {
    std::int32_t width = 0;
    std::int32_t height = 0;
    Vellum::PixelAspectRatio aspect;
    std::int64_t frameTicks = 0;
};

/// Makes pictures on the processor. Called from the pool's threads, several at once. Failures come as exceptions
/// derived from std::exception, whose text names the thing and the reason.
class ISoftwareRenderer {
public:
    virtual ~ISoftwareRenderer() = default;

    /// An undecorated frame of a clip, in its own size. `format` is BGRA of 8 bits or 32-bit float.
    [[nodiscard]] virtual HostPictureRef RenderClip(const MediaClip& clip, std::int64_t frame,
                                                    Vellum::PixelFormat format) = 0;

    /// The picture of a node, of exactly the description's size, centred as in the sequence.
    /// @param nodeTime media time for media; for a clip or nested sequence what TransformTime gave for its own time;
    /// for
    ///                 other kinds the node's own time.
    [[nodiscard]] virtual HostPictureRef RenderNode(const Node& node, std::int64_t nodeTime,
                                                    const SequenceSize& sequence,
                                                    const VantrelRenderDescription& description) = 0;

    /// The picture of a clip with its operators before `endOperator`.
    /// @param rawTime the clip's own time, or its hold time where effects stand still with the picture.
    [[nodiscard]] virtual HostPictureRef RenderOperators(const Node& clip, std::int32_t endOperator,
                                                         std::int64_t rawTime, const SequenceSize& sequence,
                                                         const VantrelRenderDescription& description) = 0;

    /// Match names of effects that have no software version: their pictures passed through unchanged. Sorted.
    [[nodiscard]] virtual std::vector<std::string> GetPassedThrough() const = 0;
};

}  // namespace Vantrel::Host
