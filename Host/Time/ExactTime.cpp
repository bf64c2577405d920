// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Time/ExactTime.h"

#include <cmath>

namespace Vantrel::Host {
namespace {

using Wide = __int128;

constexpr int kMantissaBits = 53;

std::int64_t Limit(Wide ticks) {
    if (ticks > Vellum::kTime_Max) return Vellum::kTime_Max;
    if (ticks < -Vellum::kTime_Max) return -Vellum::kTime_Max;
    return static_cast<std::int64_t>(ticks);
}

Wide FloorDivide(Wide numerator, Wide denominator) {
    // The analyzer can't know that factors keep to their bounds.
    const Wide quotient = numerator / denominator;  // NOLINT(clang-analyzer-core.DivideZero)
    return numerator % denominator < 0 ? quotient - 1 : quotient;
}

/// floor(numerator / denominator + 1/2) for a denominator above 0 and below 2^126.
Wide RoundedDivide(Wide numerator, Wide denominator) {
    const Wide quotient = FloorDivide(numerator, denominator);
    const Wide rest = numerator - quotient * denominator;
    return rest >= denominator - rest ? quotient + 1 : quotient;
}

/// A finite number as mantissa * 2^exponent, the mantissa odd or 0.
struct Binary {
    std::int64_t mantissa;
    int exponent;
};

Binary Split(double number) {
    int exponent = 0;
    const double fraction = std::frexp(number, &exponent);
    Binary result{static_cast<std::int64_t>(std::ldexp(fraction, kMantissaBits)), exponent - kMantissaBits};
    if (result.mantissa == 0) return {0, 0};
    while (result.mantissa % 2 == 0) {
        result.mantissa /= 2;
        ++result.exponent;
    }
    return result;
}

/// The simplest fraction that reads back as `rate`, by its continued fraction.
Rate SimplestFraction(double rate) {
    constexpr std::int64_t kLargestDenominator = 1000000;
    Rate before{1, 0};
    Rate now{static_cast<std::int64_t>(std::floor(rate)), 1};
    double rest = rate - std::floor(rate);
    while (rest > 0 && static_cast<double>(now.numerator) / static_cast<double>(now.denominator) != rate) {
        const double inverse = 1.0 / rest;
        if (inverse > kLargestDenominator) break;
        const auto term = static_cast<std::int64_t>(std::floor(inverse));
        const Rate next{term * now.numerator + before.numerator, term * now.denominator + before.denominator};
        if (next.denominator > kLargestDenominator) break;
        before = now;
        now = next;
        rest = inverse - std::floor(inverse);
    }
    return now;
}

}  // namespace

std::optional<Rate> SnapRate(double rate) {
    constexpr double kLargest = 10e6;
    // Below a frame in a thousand seconds the fraction would vanish.
    constexpr double kSmallest = 1e-3;
    if (!(rate >= kSmallest && rate <= kLargest)) return std::nullopt;
    if (rate == std::floor(rate)) return Rate{static_cast<std::int64_t>(rate), 1};
    for (const std::int64_t whole : {24, 30, 48, 60, 120}) {
        if (std::fabs(rate - static_cast<double>(whole) * 1000.0 / 1001.0) <= 0.01) return Rate{whole * 1000, 1001};
    }
    return SimplestFraction(rate);
}

std::int64_t TicksPerFrame(Rate rate) {
    return Limit(RoundedDivide(static_cast<Wide>(Vellum::kTicksPerSecond) * rate.denominator, rate.numerator));
}

std::int64_t ToTicks(double value, Rate rate) {
    // A mantissa of 53 bits, ticks of 38 and a denominator of 20 fill 111 bits; the divisor takes 44 and the exponent.
    constexpr int kLargestShift = 80;
    if (!std::isfinite(value)) return value < 0 ? -Vellum::kTime_Max : Vellum::kTime_Max;
    Binary number = Split(value);
    if (number.exponent > 0) {
        if (number.exponent + std::ilogb(static_cast<double>(number.mantissa)) > 57) {
            return value < 0 ? -Vellum::kTime_Max : Vellum::kTime_Max;
        }
        number = {number.mantissa * (std::int64_t{1} << number.exponent), 0};
    }
    if (-number.exponent > kLargestShift) return 0;
    const Wide numerator = static_cast<Wide>(number.mantissa) * Vellum::kTicksPerSecond * rate.denominator;
    return Limit(RoundedDivide(numerator, static_cast<Wide>(rate.numerator) << -number.exponent));
}

std::int64_t ScaleTicks(std::int64_t ticks, double factor) {
    const Binary number = Split(factor);
    const Wide product = static_cast<Wide>(number.mantissa) * ticks;
    // An odd mantissa with a positive exponent is a factor of at most 1e5: 17 bits more.
    if (number.exponent >= 0) return Limit(product * (Wide{1} << number.exponent));
    if (-number.exponent > 120) return 0;
    return Limit(RoundedDivide(product, Wide{1} << -number.exponent));
}

std::int64_t UnscaleTicks(std::int64_t ticks, double factor) {
    Binary number = Split(factor);
    Wide numerator = ticks;
    if (number.mantissa < 0) {
        number.mantissa = -number.mantissa;
        numerator = -numerator;
    }
    if (number.exponent >= 0) {
        return Limit(RoundedDivide(numerator, static_cast<Wide>(number.mantissa) << number.exponent));
    }
    // Times fill 57 bits and the smallest factor's exponent is -69: together below the 127 that there are.
    return Limit(RoundedDivide(numerator * (Wide{1} << -number.exponent), number.mantissa));
}

std::int64_t MultiplyTicks(std::int64_t ticks, std::int64_t numerator, std::int64_t denominator) {
    return Limit(RoundedDivide(static_cast<Wide>(ticks) * numerator, denominator));
}

std::int64_t FrameNumberAt(std::int64_t time, std::int64_t ticksPerFrame) {
    return static_cast<std::int64_t>(FloorDivide(static_cast<Wide>(time) + kFrameTolerance, ticksPerFrame));
}

}  // namespace Vantrel::Host
