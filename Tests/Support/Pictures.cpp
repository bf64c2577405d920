// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Support/Pictures.h"

#include <png.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <string_view>

namespace Vantrel::Testing {
namespace {

/// Is it further from the expectation than the limit? Infinities agree with themselves only.
bool Exceeds(double actual, double expected, double limit) {
    if (std::isnan(actual) || std::isnan(expected)) return std::isnan(actual) != std::isnan(expected);
    if (std::isinf(actual) || std::isinf(expected)) return actual != expected;
    return std::abs(actual - expected) > limit;
}

std::string Describe(const Pixel& pixel) {
    std::string text = "(";
    for (const double value : pixel) text += (text.size() > 1 ? ", " : "") + testing::PrintToString(value);
    return text + ")";
}

struct Worst {
    int x = 0;
    int y = 0;
    std::size_t channel = 0;
    double excess = -1.0;
};

}  // namespace

std::uint32_t Random::ChooseSeed() {
    if (const char* text = std::getenv("VANTREL_TEST_SEED")) {
        if (std::string_view(text) == "new") return std::random_device{}();
        return static_cast<std::uint32_t>(std::strtoul(text, nullptr, 0));
    }
    const testing::TestInfo* const test = testing::UnitTest::GetInstance()->current_test_info();
    const std::string name = test ? std::string(test->test_suite_name()) + '.' + test->name() : std::string();
    std::uint32_t seed = 2166136261U;  // FNV-1a: the same with every library
    for (const char c : name) seed = (seed ^ static_cast<unsigned char>(c)) * 16777619U;
    return seed;
}

Picture RandomPicture(Random& random, int width, int height) {
    Picture picture(width, height);
    for (std::size_t i = 0; i < picture.pixels.size(); i += 4) {
        for (std::size_t c = 0; c < 3; ++c) picture.pixels[i + c] = random.Uniform(-0.25F, 1.5F);
        const int kind = random.Int(0, 3);
        picture.pixels[i + 3] = kind == 0 ? 0.0F : kind == 1 ? 1.0F : random.Uniform(0.01F, 1.0F);
    }
    return picture;
}

Picture RandomOpaquePicture(Random& random, int width, int height) {
    Picture picture = RandomPicture(random, width, height);
    for (std::size_t i = 3; i < picture.pixels.size(); i += 4) picture.pixels[i] = 1.0F;
    return picture;
}

Picture RoundTo(Picture picture, Vellum::PixelFormat format) {
    if ((format.GetUpper() & Vellum::PixelFormatBits::kWidthMask) != 0) {
        for (float& value : picture.pixels) value = FloatFromHalf(HalfFromFloat(value));
    }
    return picture;
}

std::uint16_t HalfFromFloat(float value) {
    std::uint32_t bits = 0;
    std::memcpy(&bits, &value, sizeof bits);
    const auto sign = static_cast<std::uint16_t>(bits >> 16 & 0x8000U);
    if (std::isnan(value)) return static_cast<std::uint16_t>(sign | 0x7E00U);
    const double magnitude = std::abs(static_cast<double>(value));
    // The default rounding mode is the one that halves are made with: scaled to whole steps, nearbyint rounds as
    // wanted.
    if (magnitude < 0x1p-14)
        return static_cast<std::uint16_t>(sign | static_cast<unsigned>(std::nearbyint(magnitude * 0x1p24)));
    int exponent = std::ilogb(magnitude);
    auto mantissa = static_cast<unsigned>(std::nearbyint(std::scalbn(magnitude, 10 - exponent)));
    if (mantissa == 2048) {
        mantissa = 1024;
        ++exponent;
    }
    if (exponent > 15) return static_cast<std::uint16_t>(sign | 0x7C00U);
    return static_cast<std::uint16_t>(sign | static_cast<unsigned>(exponent + 15) << 10 | (mantissa - 1024));
}

float FloatFromHalf(std::uint16_t half) {
    const float sign = (half & 0x8000U) != 0 ? -1.0F : 1.0F;
    const int exponent = half >> 10 & 0x1F;
    const auto mantissa = static_cast<float>(half & 0x3FFU);
    if (exponent == 31) return mantissa == 0.0F ? sign * INFINITY : NAN;
    return exponent == 0 ? sign * std::scalbn(mantissa, -24) : sign * std::scalbn(mantissa + 1024.0F, exponent - 25);
}

testing::AssertionResult PicturesAgree(const Picture& actual, const Picture& expected, const Tolerance& tolerance) {
    if (actual.width != expected.width || actual.height != expected.height) {
        return testing::AssertionFailure() << "sizes differ: " << actual.width << " by " << actual.height
                                           << ", expected " << expected.width << " by " << expected.height;
    }
    Worst worst;
    std::size_t different = 0;
    for (int y = 0; y < actual.height; ++y) {
        for (int x = 0; x < actual.width; ++x) {
            const Pixel got = actual.Get(x, y);
            const Pixel want = expected.Get(x, y);
            bool differs = false;
            for (std::size_t c = 0; c < 4; ++c) {
                const bool weigh = tolerance.weighColorByAlpha && c < 3;
                const double a = weigh ? got[c] * got[3] : got[c];
                const double e = weigh ? want[c] * want[3] : want[c];
                const double limit = tolerance.absolute + tolerance.relative * std::abs(e);
                if (!Exceeds(a, e, limit)) continue;
                differs = true;
                const double excess = std::isfinite(a) && std::isfinite(e) ? std::abs(a - e) - limit : INFINITY;
                if (excess > worst.excess) worst = {x, y, c, excess};
            }
            different += differs ? 1 : 0;
        }
    }
    const auto pixels = static_cast<double>(actual.width) * actual.height;
    const double excepted = tolerance.exceptionShare > 0.0 ? std::max(1.0, tolerance.exceptionShare * pixels) : 0.0;
    if (static_cast<double>(different) <= excepted) return testing::AssertionSuccess();
    if (const char* folder = std::getenv("VANTREL_TEST_PICTURES")) {
        WritePng(actual, std::string(folder) + "/actual.png");
        WritePng(expected, std::string(folder) + "/expected.png");
    }
    return testing::AssertionFailure() << different << " of " << pixels << " pixels differ; worst at (" << worst.x
                                       << ", " << worst.y << "), channel "
                                       << "BGRA"[worst.channel] << ", by " << worst.excess << " more than allowed: got "
                                       << Describe(actual.Get(worst.x, worst.y)) << ", expected "
                                       << Describe(expected.Get(worst.x, worst.y));
}

bool WritePng(const Picture& picture, const std::string& path) {
    std::vector<std::uint8_t> bytes;
    bytes.reserve(static_cast<std::size_t>(picture.width) * static_cast<std::size_t>(picture.height) * 3);
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            const Pixel pixel = picture.Get(x, y);
            const double check = ((x / 8 + y / 8) & 1) != 0 ? 0.6 : 0.4;
            for (const std::size_t c : {2U, 1U, 0U}) {
                const double value = pixel[c] * pixel[3] + check * (1.0 - pixel[3]);
                bytes.push_back(static_cast<std::uint8_t>(std::clamp(value, 0.0, 1.0) * 255.0 + 0.5));
            }
        }
    }
    png_image image{};
    image.version = PNG_IMAGE_VERSION;
    image.width = static_cast<png_uint_32>(picture.width);
    image.height = static_cast<png_uint_32>(picture.height);
    image.format = PNG_FORMAT_RGB;
    return png_image_write_to_file(&image, path.c_str(), 0, bytes.data(), 0, nullptr) != 0;
}

}  // namespace Vantrel::Testing
