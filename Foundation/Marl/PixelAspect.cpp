// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Marl/PixelAspect.h"

#include <cstdint>
#include <limits>
#include <numeric>

namespace Marl {

namespace {

struct Fraction {
    std::uint64_t numerator;
    std::uint64_t denominator;

    void Reduce() {
        const std::uint64_t divisor = std::gcd(numerator, denominator);
        numerator /= divisor;
        denominator /= divisor;
    }
};

constexpr std::uint64_t kLargest = std::numeric_limits<std::int32_t>::max();

// Terms beyond 32 bits come of sizes without common factors only; halving both loses less than a billionth.
void Fit(Fraction& fraction) {
    while (fraction.numerator > kLargest || fraction.denominator > kLargest) {
        fraction.numerator /= 2;
        fraction.denominator /= 2;
    }
    if (fraction.numerator == 0) fraction.numerator = 1;
    if (fraction.denominator == 0) fraction.denominator = 1;
}

// Each factor's terms fit 32 bits, so a product fits 64.
Fraction Times(Fraction fraction, std::int32_t numerator, std::int32_t denominator) {
    Fraction product{fraction.numerator * static_cast<std::uint32_t>(numerator),
                     fraction.denominator * static_cast<std::uint32_t>(denominator)};
    product.Reduce();
    Fit(product);
    return product;
}

}  // namespace

Vellum::PixelAspectRatio AdjustPixelAspectRatioForNonUniformDownsample(Vellum::PixelAspectRatio aspect,
                                                                       const Vellum::Rect& streamRect,
                                                                       const Vellum::Rect& frameRect) {
    const std::int32_t sizes[] = {streamRect.Width(), streamRect.Height(), frameRect.Width(), frameRect.Height()};
    for (const std::int32_t size : sizes) {
        if (size <= 0) return aspect;
    }
    if (aspect.numerator <= 0 || aspect.denominator <= 0) return aspect;

    const Fraction across = Times({1, 1}, streamRect.Width(), frameRect.Width());
    const Fraction down = Times({1, 1}, streamRect.Height(), frameRect.Height());
    if (across.numerator == down.numerator && across.denominator == down.denominator) return aspect;

    Fraction factor{across.numerator * down.denominator, across.denominator * down.numerator};
    factor.Reduce();
    Fit(factor);
    Fraction shape = Times(factor, aspect.numerator, aspect.denominator);
    return {static_cast<std::int32_t>(shape.numerator), static_cast<std::int32_t>(shape.denominator)};
}

}  // namespace Marl
