// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <initializer_list>

#include "Src/Effects/ColorCorrector_Secondary.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/Effects/ParameterReader.h"
#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel {

/// The part of the frame that is worked on while a split view shows the rest as it was.
struct SplitView {
    float columns = 1.0F;
    float rows = 1.0F;

    /// Reads the three parameters from `first` on; the second and third only where the first says yes.
    [[nodiscard]] static SplitView Read(const ParameterReader& read, std::int32_t first);
    /// Cuts a size to the part that is worked on.
    void Cut(std::int32_t& width, std::int32_t& height) const;
};

/// Where a corrector has the parameters that it shares with the others.
struct CorrectorLayout {
    const EffectRow* table;
    std::int32_t showMask;
    std::int32_t selection;
    std::int32_t splitView = 1;
    std::int32_t showTonalRange = -1;  ///< below 0: there is none
};

/// One correcting pass, as the kernels of all correctors take it.
class CorrectorPass {
public:
    CorrectorPass(Kiln::DeviceRef device, const KernelFrame& frame) : mDevice(std::move(device)), mFrame(frame) {}

    /// Queues a kernel over the worked part: the arguments that all share, device values, then floats.
    template <std::size_t N>
    [[nodiscard]] Status Launch(EffectKernel& kernel, const std::array<float, N>& values) const {
        return Launch(kernel, {}, values.data(), N);
    }
    [[nodiscard]] Status Launch(EffectKernel& kernel, std::initializer_list<DeviceValue> buffers = {},
                                const float* values = nullptr, std::size_t count = 0) const;

private:
    friend class CorrectorNode;
    Kiln::DeviceRef mDevice;
    const KernelFrame& mFrame;
    DeviceValue mMask = 0;
    std::int32_t mMaskPitch = 0;
    std::int32_t mWidth = 0;
    std::int32_t mHeight = 0;
};

/// The four kernels of a corrector with tonal ranges, by output.
class CorrectorKernels {
public:
    CorrectorKernels(const char* moduleKey, const std::array<const char*, kCorrectorOutput_Count>& names) noexcept
        : mKernels{{{moduleKey, names[0], {}},
                    {moduleKey, names[1], {}},
                    {moduleKey, names[2], {}},
                    {moduleKey, names[3], {}}}} {}

    /// Queues the output's kernel. Both lists of values begin with the four levels of the tonal ranges, which are what
    /// the view of them takes. @return kStatus_Failure for an output that there isn't.
    template <std::size_t N, std::size_t M>
    [[nodiscard]] Status Launch(std::int32_t output, const CorrectorPass& pass,
                                const std::array<float, N>& compositeValues, const std::array<float, M>& lumaValues) {
        constexpr std::size_t kTonalRange = 4;
        const std::pair<const float*, std::size_t> values[] = {
            {compositeValues.data(), N}, {lumaValues.data(), M}, {compositeValues.data(), kTonalRange}, {nullptr, 0}};
        if (output < 0 || output >= kCorrectorOutput_Count) return Ostrand::kStatus_Failure;
        const auto which = static_cast<std::size_t>(output);
        return pass.Launch(mKernels[which], {}, values[which].first, values[which].second);
    }

private:
    std::array<EffectKernel, kCorrectorOutput_Count> mKernels;
};

/// The base of the correctors: they work in place, with one kernel a frame that their output chooses, over the part
/// that a split view leaves them, within a selection by colour. A corrector is its table, its kernels and this much:
///
///     Status LumaCorrectorNode::Render(...) {
///         return Correct(params, kLayout, [](const ParameterReader& read) {
///             return [values](std::int32_t output, const CorrectorPass& pass) {
///                 return gKernels.Launch(output, pass, values, values);
///             };
///         });
///     }
///
/// What the inner function does not know as an output it answers with kStatus_Failure.
class CorrectorNode : public FilterNode {
protected:
    CorrectorNode() : FilterNode(false, false) {}

    /// `prepare(read)` reads the parameters and gives back the function that launches, `run(output, pass)`.
    template <class Prepare>
    [[nodiscard]] Status Correct(const RenderParams& params, const CorrectorLayout& layout, const Prepare& prepare) {
        const KernelFrame frame(mFrameSlot);
        const ParameterReader read(*mDescription, *layout.table, GetNodeTime(params.clipTime, false));
        const Shared shared = ReadShared(read, layout, params);
        auto run = prepare(read);
        CorrectorPass pass(mDevice, frame);
        VideoFrameRef maskFrame;
        bool nothingToDo = false;
        const Status status = BeginPass(shared, pass, maskFrame, nothingToDo);
        if (Ostrand::Failed(status) || nothingToDo) return status;
        static_cast<void>(frame.Data());
        return run(shared.output, pass);
    }

private:
    struct Shared {
        std::int32_t output;
        SplitView split;
        SecondaryParameters selection;
    };
    [[nodiscard]] Shared ReadShared(const ParameterReader& read, const CorrectorLayout& layout,
                                    const RenderParams& params) const;
    /// Cuts the pass to the split view and makes the mask if there is a selection.
    [[nodiscard]] Status BeginPass(const Shared& shared, CorrectorPass& pass, VideoFrameRef& maskFrame,
                                   bool& nothingToDo) const;
};

}  // namespace Vantrel
