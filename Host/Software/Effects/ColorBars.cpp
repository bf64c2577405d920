// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/ColorBars.h"

#include <vector>

namespace Vantrel::Host::Software {

namespace {

struct Stripe {
    double rightEdge;  ///< fraction of the width
    double blue, green, red;
};

struct Band {
    double lowerEdge;  ///< fraction of the height
    std::vector<Stripe> stripes;
};

const std::vector<Band>& GetBands() {
    static const std::vector<Band> kBands = {
        {0.66,
         {{0.1428, 0.75, 0.75, 0.75},
          {0.2857, 0, 0.75, 0.75},
          {0.4286, 0.75, 0.75, 0},
          {0.5714, 0, 0.75, 0},
          {0.7143, 0.75, 0, 0.75},
          {0.8571, 0, 0, 0.75},
          {1, 0.75, 0, 0}}},
        {0.75,
         {{0.1428, 0.75, 0, 0},
          {0.2857, 0, 0, 0},
          {0.4286, 0.75, 0, 0.75},
          {0.5714, 0, 0, 0},
          {0.7143, 0.75, 0.75, 0},
          {0.8571, 0, 0, 0},
          {1, 0.75, 0.75, 0.75}}},
        {1,
         {{0.1786, 0.4133, 0.2477, -0.0022},
          {0.3571, 1, 1, 1},
          {0.5358, 0.468, -0.0019, 0.253},
          {0.7144, 0, 0, 0},
          {0.7626, -0.04, -0.04, -0.04},
          {0.8095, 0, 0, 0},
          {0.8571, 0.04, 0.04, 0.04},
          {1, 0, 0, 0}}},
    };
    return kBands;
}

}  // namespace

void DrawColorBars(Picture& picture) {
    std::size_t band = 0;
    for (int y = 0; y < picture.height; ++y) {
        while (band + 1 < GetBands().size() && (y + 0.5) / picture.height >= GetBands()[band].lowerEdge) ++band;
        const std::vector<Stripe>& stripes = GetBands()[band].stripes;
        std::size_t stripe = 0;
        for (int x = 0; x < picture.width; ++x) {
            while (stripe + 1 < stripes.size() && (x + 0.5) / picture.width >= stripes[stripe].rightEdge) ++stripe;
            const Stripe& s = stripes[stripe];
            picture.Set(x, y, {s.blue, s.green, s.red, 1.0});
        }
    }
}

}  // namespace Vantrel::Host::Software
