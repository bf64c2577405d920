// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <vector>

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// A natural cubic spline through points of rising x; definition: Vantrel/Effects/Curves.h.
class Curve {
public:
    struct Point {
        double x, y;
    };
    /// Points that aren't to the right of all before them are left out.
    explicit Curve(const std::vector<Point>& points);
    [[nodiscard]] double At(double value) const;

private:
    struct Knot {
        double x, y, bend;
    };
    std::vector<Knot> mKnots;
};

void RunLumaCurve(const EffectContext& context, LayerPicture& layer);
void RunRGBCurves(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
