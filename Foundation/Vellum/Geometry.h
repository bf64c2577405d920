// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace Vellum {

/// A rectangle in pixels, half open: right and bottom lie outside.
struct Rect {
    std::int32_t left = 0;
    std::int32_t top = 0;
    std::int32_t right = 0;
    std::int32_t bottom = 0;

    [[nodiscard]] constexpr std::int32_t Width() const { return right - left; }
    [[nodiscard]] constexpr std::int32_t Height() const { return bottom - top; }
    friend constexpr bool operator==(const Rect& a, const Rect& b) {
        return a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom;
    }
    friend constexpr bool operator!=(const Rect& a, const Rect& b) { return !(a == b); }
};
static_assert(sizeof(Rect) == 16, "rectangles go into fingerprints as 16 bytes");

struct Point {
    std::int32_t x = 0;
    std::int32_t y = 0;

    friend constexpr bool operator==(const Point& a, const Point& b) { return a.x == b.x && a.y == b.y; }
    friend constexpr bool operator!=(const Point& a, const Point& b) { return !(a == b); }
};

/// The width of a pixel over its height.
struct PixelAspectRatio {
    std::int32_t numerator = 1;
    std::int32_t denominator = 1;

    [[nodiscard]] constexpr double Value() const {
        return denominator == 0 ? 0.0 : static_cast<double>(numerator) / denominator;
    }
    friend constexpr bool operator==(const PixelAspectRatio& a, const PixelAspectRatio& b) {
        return a.numerator == b.numerator && a.denominator == b.denominator;
    }
    friend constexpr bool operator!=(const PixelAspectRatio& a, const PixelAspectRatio& b) { return !(a == b); }
};
static_assert(sizeof(PixelAspectRatio) == 8, "aspects go into fingerprints as 8 bytes");

constexpr PixelAspectRatio kPixelAspectRatio_Unknown{0, 0};
constexpr PixelAspectRatio kPixelAspectRatio_Any{-1, -1};
constexpr PixelAspectRatio kPixelAspectRatio_Square{1, 1};

/// How good a resampling is wanted. Values as the engine maps the request's quality 1..4 to 2..5, all else to 1.
enum class RenderQuality : std::int32_t {
    kDraft = 1,   ///< nearest
    kLow = 2,     ///< nearest
    kMedium = 3,  ///< bilinear
    kHigh = 4,    ///< bicubic, area-correct when it reduces
    kMaximum = 5  ///< as high
};

/// Maps a request's quality to a resampling quality.
[[nodiscard]] constexpr RenderQuality ToRenderQuality(std::uint32_t requestQuality) {
    return requestQuality >= 1 && requestQuality <= 4 ? static_cast<RenderQuality>(requestQuality + 1)
                                                      : RenderQuality::kDraft;
}

}  // namespace Vellum
