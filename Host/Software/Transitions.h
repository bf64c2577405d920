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
/// "XQVE Cross Dissolve" mixes the values as they are, "XQVE Film Dissolve" the light that they stand for; colour is
/// weighed by alpha in both. "XQVE Additive Dissolve" adds: the outgoing picture stays whole up to the middle and the
/// incoming one is whole from there on. The dips go through black or white. "XQVE Push" moves pictures by whole pixels.
/// @param known  becomes false for a name that isn't known, which shows as a cross dissolve
[[nodiscard]] Picture RenderTransition(const Node& transition, float elapsed, const TransitionSides& sides,
                                       bool& known);

/// The mix of two pictures of the same size: the first at fraction 0, the second at 1.
/// @param film  mixes light, taken as value to the power of 2.2, rather than values
[[nodiscard]] Picture MixPictures(const Picture& first, const Picture& second, double fraction, bool film);

}  // namespace Vantrel::Host::Software
