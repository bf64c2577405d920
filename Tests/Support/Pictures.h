// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "Host/Software/Picture.h"
#include "Vellum/PixelFormat.h"

/// Pictures for tests: made up, compared, looked at.
namespace Vantrel::Testing {

using Host::Software::Picture;
using Host::Software::Pixel;

/// Numbers that differ from test to test and are the same in every run, so that a failure can be had again.
/// VANTREL_TEST_SEED in the environment sets another seed, "new" one that nobody has tried; what fails meanwhile tells
/// it.
class Random {
public:
    Random() : Random(ChooseSeed()) { mTrace.emplace(__FILE__, __LINE__, "seed " + std::to_string(mSeed)); }
    explicit Random(std::uint32_t seed) : mSeed(seed), mEngine(seed) {}

    [[nodiscard]] std::uint32_t GetSeed() const { return mSeed; }
    [[nodiscard]] float Uniform(float low, float high) { return low + (high - low) * Unit(); }
    /// Both ends included.
    [[nodiscard]] int Int(int low, int high) { return std::uniform_int_distribution<int>(low, high)(mEngine); }
    [[nodiscard]] bool Chance(float probability) { return Unit() < probability; }

private:
    [[nodiscard]] static std::uint32_t ChooseSeed();
    [[nodiscard]] float Unit() { return static_cast<float>(mEngine() >> 8) / 16777216.0F; }

    std::uint32_t mSeed;
    std::mt19937 mEngine;
    std::optional<testing::ScopedTrace> mTrace;
};

/// Noise: colours from below 0 to above 1, alpha 0, 1 and between, but for the least that a division would make huge.
[[nodiscard]] Picture RandomPicture(Random& random, int width, int height);
/// The same with alpha 1.
[[nodiscard]] Picture RandomOpaquePicture(Random& random, int width, int height);

/// One colour.
[[nodiscard]] inline Picture Plain(int width, int height, const Pixel& color) {
    Picture picture(width, height);
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) picture.Set(x, y, color);
    }
    return picture;
}

/// What a device of that format holds of the picture: halves are rounded to nearest, ties to even.
[[nodiscard]] Picture RoundTo(Picture picture, Vellum::PixelFormat format);

std::uint16_t HalfFromFloat(float value);
float FloatFromHalf(std::uint16_t half);

/// How far two pictures may lie apart. A value's limit is absolute + relative * |expected|.
struct Tolerance {
    double absolute = 0.0;
    double relative = 0.0;
    /// Colour is compared after multiplication by alpha: a nearly transparent pixel's colour counts for nothing.
    bool weighColorByAlpha = false;
    /// The share of the pixels that may exceed the limit; more than none is at least one pixel.
    double exceptionShare = 0.0;
};

/// Equal to the bit, but that one NaN is as good as another and 0 equals -0.
constexpr Tolerance kExactly{};

/// Passes when the pictures agree, else tells the worst pixel, both values and how many differ, and leaves both as PNG
/// in the folder that VANTREL_TEST_PICTURES names.
[[nodiscard]] testing::AssertionResult PicturesAgree(const Picture& actual, const Picture& expected,
                                                     const Tolerance& tolerance);

/// Writes an 8-bit PNG over a grey check, for looking at. False when the file can't be written.
bool WritePng(const Picture& picture, const std::string& path);

}  // namespace Vantrel::Testing
