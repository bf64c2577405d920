// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// What a push is, apart from the time. Directions are those of Vantrel/TransitionTable.h.
struct PushSettings {
    std::int32_t direction = 0;
    bool reverse = false;
    float borderWidth = 0;  ///< in pixels
    Pixel borderColor{0, 0, 0, 1};
};

/// The incoming picture slides in and shoves the outgoing one out, by s = floor(f L + 1/2) pixels, L being the frame's
/// length in the direction of the move; half the border's width, without its fraction, is taken from each. Backwards,
/// the outgoing picture slides out of the way of the incoming one, which the first now is. What nothing covers has the
/// border's colour, and is transparent when there is no border.
[[nodiscard]] Picture Push(const Picture& outgoing, const Picture& incoming, const PushSettings& settings,
                           float fraction);

}  // namespace Vantrel::Host::Software
