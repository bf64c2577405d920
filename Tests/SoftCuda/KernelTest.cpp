// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Kernels of each shape against plain loops in double precision, on every instruction-set level.

#include <algorithm>
#include <cmath>
#include <limits>

#include "Kiln/Device/TextureDescriptor.h"
#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

namespace {

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

/// What a kernel is compared with: made from the pixel's place by a function.
template <class Function>
std::vector<Pixel> MakePixels(int width, int height, const Function& function) {
    std::vector<Pixel> pixels;
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            Pixel pixel;
            for (int c = 0; c < 4; ++c) pixel.value[c] = static_cast<float>(function(x, y, c));
            pixels.push_back(pixel);
        }
    return pixels;
}

}  // namespace

class KernelTest : public DriverTest, public ::testing::WithParamInterface<const char*> {
protected:
    void SetUp() override { Open(GetParam()); }

    std::mt19937 mRandom{20};
};

/// The functions of a device file at work, against the C library in double precision.
class MathTest : public KernelTest {
protected:
    std::vector<float> Evaluate(int function, const std::vector<float>& a, const std::vector<float>& b) const {
        const std::size_t bytes = a.size() * sizeof(float);
        CUdeviceptr memory[3] = {};
        for (CUdeviceptr& block : memory) CHECK_CUDA(cuMemAlloc_v2(&block, bytes));
        CHECK_CUDA(cuMemcpyHtoD_v2(memory[0], a.data(), bytes));
        CHECK_CUDA(cuMemcpyHtoD_v2(memory[1], b.data(), bytes));
        const int count = static_cast<int>(a.size());
        Run("MathKernel", count, 1, Arguments(function, memory[0], memory[1], memory[2], count));
        std::vector<float> out(a.size());
        CHECK_CUDA(cuMemcpyDtoH_v2(out.data(), memory[2], bytes));
        for (const CUdeviceptr block : memory) CHECK_CUDA(cuMemFree_v2(block));
        return out;
    }
};

TEST_P(MathTest, FunctionsStayWithinTheirStatedErrors) {
    struct Case {
        int function;
        const char* name;
        double (*reference)(double, double);
        float lowA, highA, lowB, highB;
        double relative, absolute;
    };
    const Case cases[] = {
        {0, "Exp2", [](double a, double) { return std::exp2(a); }, -125, 127, 0, 1, 1.8e-7, 0},
        {1, "Log2", [](double a, double) { return std::log2(a); }, 1e-30F, 1e4F, 0, 1, 2.4e-7, 1e-7},
        {1, "Log2 near 1", [](double a, double) { return std::log2(a); }, 0.7F, 1.5F, 0, 1, 2.4e-7, 1e-7},
        {2, "Pow", [](double a, double b) { return std::pow(a, b); }, 0.12F, 3, 0.2F, 1.3F, 4e-7, 0},
        {3, "Exp", [](double a, double) { return std::exp(a); }, -80, 80, 0, 1, 3e-7, 0},
        {4, "Log", [](double a, double) { return std::log(a); }, 1e-5F, 100, 0, 1, 3e-7, 1e-7},
        {5, "Sin", [](double a, double) { return std::sin(a); }, -8000, 8000, 0, 1, 0, 2e-7},
        {6, "Cos", [](double a, double) { return std::cos(a); }, -8000, 8000, 0, 1, 0, 2e-7},
        {7, "Atan2", [](double a, double b) { return std::atan2(a, b); }, -5, 5, -5, 5, 0, 4e-7},
        {11, "Sqrt", [](double a, double) { return std::sqrt(a); }, 0, 1e6F, 0, 1, 6e-8, 0},
        {12, "Floor", [](double a, double) { return std::floor(a); }, -1e4F, 1e4F, 0, 1, 0, 0},
    };
    for (const Case& each : cases) {
        std::uniform_real_distribution<float> da(each.lowA, each.highA), db(each.lowB, each.highB);
        std::vector<float> a(20000), b(a.size());
        for (float& value : a) value = da(mRandom);
        for (float& value : b) value = db(mRandom);
        const std::vector<float> out = Evaluate(each.function, a, b);
        double worst = 0;
        std::size_t where = 0;
        for (std::size_t i = 0; i < a.size(); ++i) {
            const double want = each.reference(a[i], b[i]);
            const double error = std::abs(out[i] - want) - each.absolute - each.relative * std::abs(want);
            if (!(error <= worst)) worst = error, where = i;
        }
        EXPECT_EQ(worst, 0) << each.name << "(" << a[where] << ", " << b[where] << ") gave " << out[where] << ", not "
                            << each.reference(a[where], b[where]);
    }
}

TEST_P(MathTest, EdgesAreAsWrittenDown) {
    struct Case {
        int function;
        float a, b, result;
    };
    // Of 8 and 9, minimum and maximum, the second operand is the result where one is not a number.
    const Case cases[] = {{0, 128, 0, kInfinity},
                          {0, -127, 0, 0},
                          {0, 0, 0, 1},
                          {0, kNaN, 0, kNaN},
                          {1, 0, 0, -kInfinity},
                          {1, 1, 0, 0},
                          {1, kInfinity, 0, kInfinity},
                          {1, -1, 0, kNaN},
                          {2, 0, 0.5F, 0},
                          {2, -3, 2, 0},
                          {2, 0, 0, 1},
                          {2, 0, -1, kInfinity},
                          {2, 1, 77, 1},
                          {2, kNaN, 1, kNaN},
                          {5, 0, 0, 0},
                          {7, 0, 0, 0},
                          {8, kNaN, 3, 3},
                          {8, 3, kNaN, kNaN},
                          {9, kNaN, 3, 3},
                          {9, 3, kNaN, kNaN},
                          {8, 1, 2, 1},
                          {9, 1, 2, 2},
                          {10, kNaN, 0, 0},
                          {10, 7, 0, 1},
                          {10, -kInfinity, 0, 0},
                          {13, -1, 4, 3},
                          {13, 9, 4, 1}};
    for (const Case& each : cases) {
        const float got = Evaluate(each.function, {each.a}, {each.b})[0];
        const bool same = std::isnan(each.result) ? std::isnan(got) : got == each.result;
        EXPECT_TRUE(same) << "function " << each.function << "(" << each.a << ", " << each.b << ") gave " << got;
    }
}

/// Textures through their descriptor; lanes and single samples have to agree.
TEST_P(KernelTest, TexturesAreSampledAsTheirDescriptorSays) {
    constexpr int kWidth = 37, kHeight = 11;
    DeviceFrame in(kWidth, kHeight, kWidth, 1), out(kWidth, kHeight, kWidth, 1), single(kWidth, kHeight, kWidth, 1);
    std::vector<Pixel> pixels = RandomPixels(kWidth * kHeight, mRandom, 0, 1);
    pixels[3 * kWidth + 5] = {{9, 9, 9, 0}};  // bright, but not there: it must not bleed
    in.Write(pixels);
    CUdeviceptr descriptorMemory = 0;
    CHECK_CUDA(cuMemAlloc_v2(&descriptorMemory, sizeof(TextureDescriptor)));

    const auto index = [](int i, int size, int mode) {
        if (mode == TEXTURE_ADDRESS_CLAMP) return std::clamp(i, 0, size - 1);
        if (mode == TEXTURE_ADDRESS_BORDER) return i < 0 || i >= size ? -1 : i;
        while (i < 0) i += 2 * size;
        if (mode == TEXTURE_ADDRESS_WRAP) return i % size;
        return i % (2 * size) < size ? i % (2 * size) : 2 * size - 1 - i % (2 * size);
    };
    for (int mode = 0; mode < 4; ++mode)
        for (int filter = 0; filter < 2; ++filter) {
            SCOPED_TRACE("mode " + std::to_string(mode) + ", filter " + std::to_string(filter));
            const TextureDescriptor descriptor = {in.data, kWidth, kHeight, kWidth, 1, mode, filter};
            CHECK_CUDA(cuMemcpyHtoD_v2(descriptorMemory, &descriptor, sizeof descriptor));
            const Pixel matrix{{1.5F, -0.25F, 0.125F, 1.25F}};
            const auto run = [&](const DeviceFrame& target, int lanesOff) {
                Run("SampleKernel", kWidth, kHeight,
                    Arguments(descriptorMemory, target.data, kWidth, 1, kWidth, kHeight, matrix, lanesOff));
            };
            run(out, 0);
            run(single, 1);
            const auto texel = [&](int x, int y, int c) -> double {
                const int column = index(x, kWidth, mode), row = index(y, kHeight, mode);
                return column < 0 || row < 0 ? 0 : pixels[static_cast<std::size_t>(row * kWidth + column)].value[c];
            };
            const auto expected = MakePixels(kWidth, kHeight, [&](int x, int y, int c) {
                const double u = (x + 0.5) * 1.5 - (y + 0.5) * 0.25, v = (x + 0.5) * 0.125 + (y + 0.5) * 1.25;
                if (filter == TEXTURE_FILTER_POINT)
                    return texel(static_cast<int>(std::floor(u)), static_cast<int>(std::floor(v)), c);
                const double left = std::floor(u - 0.5), top = std::floor(v - 0.5);
                double color = 0, alpha = 0;
                for (int tap = 0; tap < 4; ++tap) {
                    const int tx = static_cast<int>(left) + tap % 2, ty = static_cast<int>(top) + tap / 2;
                    const double fx = u - 0.5 - left, fy = v - 0.5 - top;
                    const double weight = (tap % 2 != 0 ? fx : 1 - fx) * (tap / 2 != 0 ? fy : 1 - fy);
                    alpha += weight * texel(tx, ty, 3);
                    color += weight * texel(tx, ty, 3) * texel(tx, ty, c);
                }
                return c == 3 ? alpha : alpha > 0 ? color / alpha : 0;
            });
            ExpectNear(out.Read(), expected, 1e-4, 1e-4, kWidth);
            ExpectNear(single.Read(), expected, 1e-4, 1e-4, kWidth);
        }
    CHECK_CUDA(cuMemFree_v2(descriptorMemory));
}

// A level that the processor lacks runs as the best one below it.
INSTANTIATE_TEST_SUITE_P(Levels, KernelTest, ::testing::Values("v2", "v3", "v4"));
INSTANTIATE_TEST_SUITE_P(Levels, MathTest, ::testing::Values("v2", "v3", "v4"));

}  // namespace SoftCudaTest
