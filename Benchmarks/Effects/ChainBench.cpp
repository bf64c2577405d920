// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What chains of pointwise filters cost on a 1080p frame: as one launch, filter by filter, and as a multiple of the
// plainest pass over the frame in place. The three are run in turn, and the least of each counts. Milliseconds of work
// say nothing where the device isn't the processor.
#include <algorithm>
#include <cstring>
#include <memory>
#include <vector>

#include "Benchmarks/Support/KernelBench.h"
#include "Src/Filters/Effects/PointwiseFilterRecord.h"
#include "Src/Kernels/RecordUpload.h"

namespace {

using namespace Vantrel;
using namespace Vantrel::Benchmarks;
using Records = std::vector<PointwiseFilterRecord>;

constexpr int kRounds = 15;
constexpr const char* kModuleKey = "..\\..\\Src\\Filters\\Effects\\PointwiseFilterHostNode";
EffectKernel gKernels[] = {{kModuleKey, "PointwiseFilterHostKernel1", {}},
                           {kModuleKey, "PointwiseFilterHostKernel2", {}},
                           {kModuleKey, "PointwiseFilterHostKernel3", {}},
                           {kModuleKey, "PointwiseFilterHostKernel4", {}}};
ModuleSymbol gRecords[] = {{kModuleKey, "inFilter0", {}},
                           {kModuleKey, "inFilter1", {}},
                           {kModuleKey, "inFilter2", {}},
                           {kModuleKey, "inFilter3", {}}};
EffectKernel gPass{"..\\..\\Src\\Filters\\Effects\\LumaCorrectorNode", "LumaCorrector_MaskKernel", {}};

constexpr PointwiseFilterRecord kLine{kPointwise_BrightnessContrast, 1, 1.1F, 0.05F, 0.95F, 0, 1, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kBalance{kPointwise_ColorBalance, 0.9F, 1, 1.1F, 0, 0, 0, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kTint{kPointwise_Tint, 0, 0, 0.1F, 1, 1, 0.9F, 0.3F, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kProcAmp{kPointwise_ProcAmp, 0.1F, 1.1F, 0.9F, 0.1F, 1, 0, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kGamma{kPointwise_GammaCorrection, 0.8F, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kNoise{kPointwise_Noise, 0.1F, 1, 0, 7, 0, 0, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kKey{kPointwise_ColorPass, 0, 0.2F, 0, 0, 1, 0, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kGrey{kPointwise_BlackAndWhite, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};
constexpr PointwiseFilterRecord kFast{kPointwise_FastCorrector, 0.9F, 0.1F, 1, 0, 0.8F, 1.1F, 0.1F, 0.7F, 0, 0.1F, 1};

const struct {
    const char* name;
    Records records;
} kChains[] = {{"contrast", {kLine}},
               {"gamma", {kGamma}},
               {"fast corrector, gamma", {kFast}},
               {"contrast, balance", {kLine, kBalance}},
               {"four light filters", {kLine, kBalance, kTint, kGrey}},
               {"ProcAmp, tint, balance, contrast", {kProcAmp, kTint, kBalance, kLine}},
               {"colour pass, noise, ProcAmp", {kKey, kNoise, kProcAmp}},
               {"fast corrector, gamma, noise, colour pass", {kFast, kGamma, kNoise, kKey}},
               {"four fast correctors", {kFast, kFast, kFast, kFast}},
               {"four gammas", {kGamma, kGamma, kGamma, kGamma}}};

class Bench {
public:
    Bench(Kiln::DeviceRef device, const KernelFrame& frame) : mDevice(std::move(device)), mFrame(frame) {}

    void Launch(const Records& records) {
        std::vector<std::unique_ptr<RecordUpload>> uploads;
        for (std::size_t i = 0; i < records.size(); ++i) {
            uploads.push_back(std::make_unique<RecordUpload>(mDevice, std::uint32_t{sizeof records[i]}));
            std::memcpy(uploads[i]->GetBlock(), &records[i], sizeof records[i]);
            Check(!Ostrand::Failed(uploads[i]->Send(gRecords[i])));
        }
        const std::uint64_t kernel = gKernels[records.size() - 1].Find(mDevice);
        KernelArgs args(mDevice->GetFramework(), kernel);
        args.AddAll(mFrame.Data(), mFrame.Pitch(), mFrame.Data(), mFrame.Pitch(), mFrame.Format(), kWidth, kHeight);
        for (const auto& upload : uploads) args.AddAll(upload->GetArgument());
        Start(mDevice, mFrame, kernel, args);
        const Kiln::TimingMarkRef mark = mDevice->GetCommands()->CreateMark();
        for (const auto& upload : uploads) upload->SetMark(mark);
    }
    void Pass() {
        const std::uint64_t kernel = gPass.Find(mDevice);
        KernelArgs args(mDevice->GetFramework(), kernel);
        args.AddAll(mFrame.Data(), mFrame.Pitch(), DeviceValue{0}, std::int32_t{0}, mFrame.Format(), kWidth, kHeight);
        Start(mDevice, mFrame, kernel, args);
    }
    /// What `work` takes on a fresh frame.
    template <class Work>
    double Time(const Work& work) {
        Refresh(mDevice, mFrame);
        const double start = WorkMilliseconds();
        work();
        Check(!Ostrand::Failed(mDevice->Synchronize()));
        return WorkMilliseconds() - start;
    }

private:
    Kiln::DeviceRef mDevice;
    const KernelFrame& mFrame;
};

void Measure(const Kiln::DeviceRef& device, const KernelFrame& frame, const char* name) {
    Bench bench(device, frame);
    for (const auto& chain : kChains) {
        double pass = 1e9, together = 1e9, apart = 1e9;
        for (int round = 0; round < kRounds; ++round) {
            pass = std::min(pass, bench.Time([&] { bench.Pass(); }));
            together = std::min(together, bench.Time([&] { bench.Launch(chain.records); }));
            apart = std::min(apart, bench.Time([&] {
                for (const PointwiseFilterRecord& record : chain.records) bench.Launch({record});
            }));
        }
        std::printf("| %s | %s | %.2f ms | %.1f passes | %.2f ms one by one | %.1f times |\n", name, chain.name,
                    together, together / pass, apart, apart / together);
    }
}

}  // namespace

int main() { ForEachDevice(&Measure); }
