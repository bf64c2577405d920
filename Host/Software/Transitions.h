// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "Host/Snapshot/Node.h"
#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// The two pictures of a transition, each of the frame's size. Asked for only where they are seen.
struct TransitionSides {
    std::function<Picture()> outgoing;
    std::function<Picture()> incoming;
};

/// The picture at `elapsed`, 0 at the transition's beginning and 1 at its end.
///
/// For "XQVE Cross Dissolve", "XQVE Film Dissolve" and "XQVE Additive Dissolve" see Effects/Dissolves.h. The dips are
/// dissolves to black or white and from there on. "XQVE Push" moves pictures by whole pixels.
/// @param known  becomes false for a name that isn't known, which shows as a cross dissolve
[[nodiscard]] Picture RenderTransition(const Node& transition, float elapsed, const TransitionSides& sides,
                                       bool& known);

}  // namespace Vantrel::Host::Software
