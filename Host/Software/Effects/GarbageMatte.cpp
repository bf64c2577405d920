// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/GarbageMatte.h"

#include <algorithm>
#include <cmath>

#include "Vantrel/Effects/GarbageMatte.h"

namespace Vantrel::Host::Software {
namespace {

/// An edge from its upper to its lower end.
struct Edge {
    Corner upper, lower;

    [[nodiscard]] double At(double y) const {
        return upper.x + (lower.x - upper.x) * ((y - upper.y) / (lower.y - upper.y));
    }
};

bool IsPlace(const Corner& corner) { return std::abs(corner.x) < 1e9 && std::abs(corner.y) < 1e9; }

std::vector<Edge> EdgesOf(const std::vector<Corner>& corners) {
    std::vector<Edge> edges;
    for (std::size_t i = 0; i < corners.size(); ++i) {
        const Corner &a = corners[i], &b = corners[(i + 1) % corners.size()];
        if (!IsPlace(a) || !IsPlace(b) || a.y == b.y) continue;
        edges.push_back(a.y < b.y ? Edge{a, b} : Edge{b, a});
    }
    return edges;
}

/// Heights within a line between which no edge begins, ends or crosses another, the line's borders included.
std::vector<double> CutLine(const std::vector<Edge>& edges, double top) {
    std::vector<double> heights = {top, top + 1.0};
    const auto cut = [&](double y) {
        if (y > top && y < top + 1.0) heights.push_back(y);
    };
    for (const Edge& edge : edges) {
        cut(edge.upper.y);
        cut(edge.lower.y);
        for (const Edge& other : edges) {
            const double apart = edge.At(top) - other.At(top);
            cut(top + apart / (apart - (edge.At(top + 1.0) - other.At(top + 1.0))));
        }
    }
    std::sort(heights.begin(), heights.end());
    return heights;
}

/// The integral from 0 to u of what lies of a number between 0 and 1.
double Ramp(double u) { return u <= 0.0 ? 0.0 : u >= 1.0 ? u - 0.5 : 0.5 * u * u; }

/// The part of a pixel's width to the right of an edge that goes from `a` to `b` in front of the pixel's right border.
double MeanBeyond(double a, double b) {
    return std::abs(b - a) < 1e-7 ? std::clamp(0.5 * (a + b), 0.0, 1.0) : (Ramp(b) - Ramp(a)) / (b - a);
}

void CoverStrip(const std::vector<Edge>& edges, double from, double end, std::vector<double>& coverage) {
    const double middle = 0.5 * (from + end);
    std::vector<const Edge*> passing;
    for (const Edge& edge : edges) {
        if (edge.upper.y <= middle && edge.lower.y > middle) passing.push_back(&edge);
    }
    std::sort(passing.begin(), passing.end(),
              [middle](const Edge* a, const Edge* b) { return a->At(middle) < b->At(middle); });
    double sign = 1.0;
    for (const Edge* edge : passing) {
        const double first = edge->At(from), last = edge->At(end);
        for (std::size_t x = 0; x < coverage.size(); ++x) {
            const double right = static_cast<double>(x) + 1.0;
            coverage[x] += sign * (end - from) * MeanBeyond(right - first, right - last);
        }
        sign = -sign;
    }
}

}  // namespace

void ApplyGarbageMatte(const std::vector<Corner>& corners, Picture& picture) {
    const std::vector<Edge> edges = EdgesOf(corners);
    for (int y = 0; y < picture.height; ++y) {
        std::vector<double> coverage(static_cast<std::size_t>(picture.width));
        const std::vector<double> heights = CutLine(edges, y);
        for (std::size_t i = 1; i < heights.size(); ++i) CoverStrip(edges, heights[i - 1], heights[i], coverage);
        for (int x = 0; x < picture.width; ++x) {
            const double share = coverage[static_cast<std::size_t>(x)];
            float& alpha = picture.At(x, y)[3];
            if (share <= 1e-4) {
                alpha = 0.0F;
            } else if (share < 1.0 - 1e-4) {
                alpha = static_cast<float>(static_cast<double>(alpha) * share);
            }
        }
    }
}

void RunGarbageMatte(const EffectContext& context, LayerPicture& layer) {
    const bool isOf8 = context.matchName == kGarbageMatte8Effect.matchName;
    const bool isOf16 = context.matchName == kGarbageMatte16Effect.matchName;
    std::vector<Corner> corners;
    for (std::int32_t i = 0; i < (isOf16 ? 16 : isOf8 ? 8 : 4); ++i) {
        const auto corner = context.value(i);
        corners.push_back({layer.picture.width * corner[0], layer.picture.height * corner[1]});
    }
    ApplyGarbageMatte(corners, layer.picture);
}

}  // namespace Vantrel::Host::Software
