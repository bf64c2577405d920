// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Vellum/FieldOrder.h"
#include "Vellum/Time.h"

/// Small questions about fields and the frames that times lie in.
namespace Vantrel {

using Vellum::IsInterlaced;

/// The start of the frame that a time lies in; the time itself for a rate of zero.
[[nodiscard]] constexpr std::int64_t AlignToFrame(std::int64_t time, std::int64_t frameTicks) {
    Vellum::TickTime aligned(time);
    aligned.AlignToFrame(Vellum::FrameRate::Create(frameTicks));
    return aligned.GetTicks();
}

/// 1 when the frame that a time lies in is an odd one, else 0.
[[nodiscard]] constexpr std::uint32_t FrameParity(std::int64_t time, std::int64_t frameTicks) {
    if (frameTicks <= 0) return 0;
    return static_cast<std::uint32_t>(AlignToFrame(time, frameTicks) / frameTicks) & 1U;
}

}  // namespace Vantrel
