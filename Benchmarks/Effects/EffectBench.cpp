// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What the kernels of effects cost on 1080p frames, as a multiple of the plainest pass over the same frame in place.
// Both are measured in turn, and the least of each counts.
#include <algorithm>
#include <chrono>
#include <vector>

#include "Benchmarks/Support/KernelBench.h"

namespace {

using namespace Vantrel;
using namespace Vantrel::Benchmarks;

constexpr int kRounds = 15;
constexpr float kGamma = 1.2F;

/// A corrector's kernel and the values behind the arguments that all correctors take.
struct Row {
    const char* name;
    EffectKernel kernel;
    std::vector<float> values;
};

/// The levels of the tonal ranges, then `sets` times a set.
std::vector<float> Sets(int sets, const std::vector<float>& set) {
    std::vector<float> values = {0.25F, 0.4F, 0.6F, 0.75F};
    for (int i = 0; i < sets; ++i) values.insert(values.end(), set.begin(), set.end());
    return values;
}

std::vector<float> ThreeWay(float gamma) {
    std::vector<float> values = {0.25F, 0.4F, 0.6F, 0.75F, 1.1F, 1.2F, 0.9F, 1.1F, 0.1F, 0.2F, 0.3F};
    for (int i = 0; i < 4; ++i) values.insert(values.end(), {0.7F, 0.1F, 0.2F});
    values.insert(values.end(), {0.1F, 0.9F, 1.0F / gamma, 0.0F, 1.0F});
    for (int i = 0; i < 3; ++i) values.insert(values.end(), {0.0F, 1.0F, 1.0F, 0.0F, 1.0F});
    return values;
}

std::vector<Row> MakeRows() {
    const auto kernel = [](const char* module, const char* name) { return EffectKernel{module, name, {}}; };
    const EffectKernel luma =
        kernel("..\\..\\Src\\Filters\\Effects\\LumaCorrectorNode", "LumaCorrector_CompositeKernel");
    const EffectKernel rgb =
        kernel("..\\..\\Src\\Filters\\Effects\\RGBColorCorrectorNode", "RGBColorCorrector_CompositeKernel");
    const EffectKernel threeWay =
        kernel("..\\..\\Src\\Filters\\Effects\\ThreeWayColorCorrectorNode", "ThreeWayColorCorrector_CompositeKernel");
    return {{"pass in place", kernel(luma.moduleKey, "LumaCorrector_MaskKernel"), {}},
            {"luma corrector", luma, Sets(4, {0.01F, 0.1F, 0.5F, 1.0F, 0.01F, 1.1F})},
            {"luma corrector, gammas", luma, Sets(4, {0.01F, 0.1F, 0.5F, kGamma, 0.01F, 1.1F})},
            {"RGB corrector", rgb, Sets(16, {1.0F, 0.01F, 1.1F})},
            {"RGB corrector, gammas", rgb, Sets(16, {kGamma, 0.01F, 1.1F})},
            {"three-way corrector", threeWay, ThreeWay(1.0F)},
            {"three-way corrector, gamma", threeWay, ThreeWay(kGamma)}};
}

/// Milliseconds of one run.
double Time(const Kiln::DeviceRef& device, const KernelFrame& frame, Row& row) {
    const std::uint64_t kernel = row.kernel.Find(device);
    KernelArgs args(device->GetFramework(), kernel);
    const auto add = [&args](const auto& value) {
        const auto packed = PackArgument(value);
        args.Add(&packed, sizeof packed);
    };
    add(frame.Data());
    add(frame.Pitch());
    add(DeviceValue{0});
    add(std::int32_t{0});
    add(frame.Format());
    add(frame.Width());
    add(frame.Height());
    for (const float value : row.values) add(value);
    const auto start = std::chrono::steady_clock::now();
    Start(device, frame, kernel, args);
    Check(!Ostrand::Failed(device->Synchronize()));
    return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
}

void Measure(const Kiln::DeviceRef& device, const KernelFrame& frame, const char* name) {
    std::vector<Row> rows = MakeRows();
    std::vector<double> best(rows.size(), 1e9);
    for (int round = 0; round < kRounds; ++round) {
        for (std::size_t i = 0; i < rows.size(); ++i) {
            Refresh(device, frame);
            best[i] = std::min(best[i], Time(device, frame, rows[i]));
        }
    }
    for (std::size_t i = 0; i < rows.size(); ++i) {
        std::printf("| %s | %s | %.2f ms | %.1f passes |\n", name, rows[i].name, best[i], best[i] / best[0]);
    }
}

}  // namespace

int main() { ForEachDevice(&Measure); }
