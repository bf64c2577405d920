// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/UltraKeySetup.h"

#include <algorithm>
#include <array>
#include <cfloat>
#include <cmath>
#include <cstddef>

#include "Vantrel/Effects/UltraKey.h"

namespace Vantrel {
namespace {

static_assert(offsetof(UltraKeyParams, analysis) == 40 && offsetof(UltraKeyParams, output) == 76 &&
              offsetof(UltraKeyParams, contrastGain) == 140 && offsetof(UltraKeyParams, keyInverseLength) == 160);

constexpr float kLeast = 1.0e-37F;
constexpr std::array<float, 3> kLumaWeights = {0.212671F, 0.71516F, 0.072169F};

/// Rows act on (red, green, blue, 1).
using Matrix = std::array<std::array<float, 4>, 4>;
constexpr Matrix kIdentity = {{{1, 0, 0, 0}, {0, 1, 0, 0}, {0, 0, 1, 0}, {0, 0, 0, 1}}};

Matrix Multiply(const Matrix& m, const Matrix& x) {
    Matrix product{};
    for (std::size_t i = 0; i < 4; ++i) {
        for (std::size_t j = 0; j < 4; ++j) {
            for (std::size_t k = 0; k < 4; ++k) product[i][j] += m[i][k] * x[k][j];
        }
    }
    return product;
}

/// A turn in the plane of two axes, the first towards the second.
Matrix Rotation(std::size_t first, std::size_t second, float sine, float cosine) {
    Matrix x = kIdentity;
    x[first][first] = x[second][second] = cosine;
    x[first][second] = sine;
    x[second][first] = -sine;
    return x;
}

Matrix ShearZ(float dx, float dy) {
    Matrix x = kIdentity;
    x[0][2] = dx;
    x[1][2] = dy;
    return x;
}

Matrix Saturation(float s) {
    Matrix x = kIdentity;
    for (std::size_t i = 0; i < 3; ++i) {
        const float weight = kLumaWeights[i] * (1.0F - s);
        for (std::size_t j = 0; j < 3; ++j) x[i][j] = i == j ? weight + s : weight;
    }
    return x;
}

/// Grey is laid along z and equal luma across it, so that a turn about z changes neither.
Matrix HueRotation(float degrees) {
    constexpr float kPi = 3.1415927F;
    const float half = 1.0F / std::sqrt(2.0F);
    const float third = 1.0F / std::sqrt(3.0F), rest = std::sqrt(2.0F) / std::sqrt(3.0F);
    const auto aboutX = [](float sine, float cosine) { return Rotation(1, 2, sine, cosine); };
    const auto aboutY = [](float sine, float cosine) { return Rotation(2, 0, sine, cosine); };
    Matrix h = Multiply(Multiply(kIdentity, aboutX(half, half)), aboutY(-third, rest));
    std::array<float, 3> luma{};
    for (std::size_t j = 0; j < 3; ++j) {
        for (std::size_t i = 0; i < 3; ++i) luma[j] += kLumaWeights[i] * h[i][j];
    }
    const float dx = luma[0] / luma[2], dy = luma[1] / luma[2];
    const float angle = degrees * kPi / 180.0F;
    h = Multiply(h, ShearZ(dx, dy));
    h = Multiply(h, Rotation(0, 1, std::sin(angle), std::cos(angle)));
    h = Multiply(h, ShearZ(-dx, -dy));
    return Multiply(Multiply(h, aboutY(third, rest)), aboutX(-half, half));
}

/// @param hue in hundreds of degrees
Matrix ColorMatrix(float saturation, float hue, float luminance) {
    Matrix m = kIdentity;
    if (saturation != 1.0F) m = Multiply(m, Saturation(saturation));
    if (hue * 100.0F != 0.0F) m = Multiply(m, HueRotation(hue * 100.0F));
    const float gain = std::pow(luminance, 2.2F);
    Matrix scale = kIdentity;
    for (std::size_t i = 0; i < 3; ++i) scale[i][i] = gain;
    return Multiply(m, scale);
}

/// 1 at a half, falling to 0 at 1 and rising without end towards 0.
float Ramp(float x) {
    if (x >= 0.5F) return (1.0F - x) * 2.0F;
    return x == 0.0F ? 1.1754943e38F : 1.0F / (x * 2.0F);
}

float Linear(float c) { return c > 0.04045F ? std::pow((c + 0.055F) / 1.055F, 2.4F) : c / 12.92F; }

void FillAnalysis(UltraKeyParams& record) {
    constexpr std::array<float, 9> kRows = {-0.23570225F, -0.23570225F, 0.47140452F, -0.40824828F, 0.40824828F,
                                            0.0F,         0.21267103F,  0.7151599F,  0.072169006F};
    std::copy(kRows.begin(), kRows.end(), record.analysis);
}

/// The matrix behind the way back from chromas and luma.
void FillOutput(UltraKeyParams& record, const Matrix& m) {
    for (std::size_t j = 0; j < 4; ++j) {
        const float a = m[0][j], b = m[1][j], c = m[2][j];
        float* const weights = record.output + 3 * j;
        weights[0] = c * 1.9682268F - (b * 0.15309364F + a * 0.15309364F);
        weights[1] = b * 0.6093241F - a * 1.8401657F - c * 0.61542076F;
        weights[2] = b + a + c;
    }
}

void FillKey(UltraKeyParams& record, float blue, float green, float red) {
    blue = Linear(blue);
    green = Linear(green);
    red = Linear(red);
    const float u = blue * 0.47140452F - (green * 0.23570225F + red * 0.23570225F);
    const float v = green * 0.40824828F - red * 0.40824828F + blue * 0.0F;
    const float luma = green * 0.7151599F + red * 0.21267103F + blue * 0.072169006F;
    record.keyLuma = luma < kLeast ? kLeast : luma;
    record.keyChroma[0] = u / record.keyLuma;
    record.keyChroma[1] = v / record.keyLuma;
    const float length =
        std::sqrt(record.keyChroma[0] * record.keyChroma[0] + record.keyChroma[1] * record.keyChroma[1]);
    record.keyInverseLength = 1.0F / (length < kLeast ? kLeast : length);
}

/// What no whole number can hold becomes the nearest that one can; 0 for what isn't a number.
std::int32_t Truncate(float value) {
    constexpr float kMost = 2147483520.0F;
    if (!(std::fabs(value) <= kMost)) value = value > 0.0F ? kMost : (value < 0.0F ? -kMost : 0.0F);
    return static_cast<std::int32_t>(value);
}

}  // namespace

MatteStage MatteStage::Make(float radiusX, float radiusY) {
    MatteStage stage;
    stage.runs = radiusX != 0.0F || radiusY != 0.0F;
    if (!stage.runs) return stage;
    stage.reachX = Truncate(std::ceil(radiusX * 4.0F)) - 1;
    stage.reachY = Truncate(std::ceil(radiusY * 4.0F)) - 1;
    stage.fractionY = radiusY * 4.0F - static_cast<float>(stage.reachY);
    return stage;
}

UltraKeySetup UltraKeySetup::Read(const ParameterReader& read, const RenderParams& params) {
    const auto p = [&read](std::int32_t index) { return read.Number(index); };
    UltraKeySetup setup;
    setup.output = read.Integer(0);
    UltraKeyParams& record = setup.record;
    record.spillRange = Ramp(p(18));
    record.spillAmount = p(19) * 2.0F - 1.0F;
    record.tolerance = p(7);
    record.desaturation = Ramp(p(17));
    record.transparency = Ramp(setup.output == kUltraKeyOutput_Color ? 0.0F : p(4));
    record.shadow = p(6) * -2.0F;
    record.highlight = p(5) * 2.0F;
    record.restoredLuma = p(20) * 2.0F;
    record.pedestal = p(8);
    record.pedestalGain = record.pedestal + 1.0F;
    FillAnalysis(record);
    FillOutput(record, ColorMatrix(p(23), p(24), p(25)));
    const float mid = p(14);
    record.contrastGain = p(13) + 1.0F;
    record.contrastOffset = mid - record.contrastGain * mid;
    float blue = 0.0F, green = 0.0F, red = 0.0F, alpha = 0.0F;
    read.GetEffect().GetColorParam(2, read.GetTime(), blue, green, red, alpha);
    FillKey(record, blue, green, red);

    const float choke = p(11), soften = p(12);
    setup.choke = MatteStage::Make(choke / params.scaleX + soften / params.scaleX,
                                   choke / params.scaleY + soften / params.scaleY);
    setup.soften = MatteStage::Make(soften / params.scaleX, soften / params.scaleY);
    setup.finishes = record.contrastGain > 1.0F;
    return setup;
}

}  // namespace Vantrel
