// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Vellum/Field.h"
#include "Vellum/Geometry.h"
#include "Vellum/Time.h"

namespace Vantrel {

/// One frame's request. The host fills it; a node that changes anything works on its own copy and hands that down.
struct RenderParams {
    /// Copied along, read by nobody here.
    std::uint32_t reservedWord = 0;
    /// Ticks on the timeline of this tree. With the node pointer it keys the hash memo, and the host's calls receive
    /// it.
    std::int64_t time = 0;
    /// The same instant as the nodes see it: for a segment time - info.in + info.offset. What moves one moves both.
    std::int64_t clipTime = 0;
    /// The frame to make, in output pixels.
    Vellum::Rect outputRect;
    Vellum::PixelAspectRatio pixelAspectRatio;
    /// The host's four-character code in which host frames are wanted.
    std::uint32_t pixelFormat = 0;
    /// Of the sequence: 0 none, 1 upper field first, 2 lower field first.
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    /// 0 first field, 1 second field, 2 the whole frame.
    std::uint32_t fieldSelection = Vellum::kFieldSelection_Frame;
    /// 1 to 4; below 2 a CUDA device works in 16-bit float.
    std::uint32_t quality = 1;
    /// Copied along, read by nobody here.
    std::uint8_t reservedByte = 0;
    /// Ticks per frame of this tree's rate.
    std::int64_t frameTicks = 0;
    /// Not 0: host frames add a line to the log of the results.
    std::uint8_t collectInformation = 0;
    /// The host's id of the sequence that this tree belongs to.
    std::uint32_t sequenceID = 0;
    std::uint32_t sequenceFieldType = Vellum::kFieldType_Progressive;
    std::int64_t sequenceFrameTicks = 0;
    /// The sequence's frame at full size.
    Vellum::Rect sequenceRect;
    /// Not 0: the host may answer in any pixel format that the engine reads.
    std::uint8_t anyPixelFormat = 0;
    /// Sequence size over output size: 1 at full size, above 1 at reduced resolution.
    float scaleX = 1.0F;
    float scaleY = 1.0F;
};

}  // namespace Vantrel
