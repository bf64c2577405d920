// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/GaussianBlurNode.h"

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Filters/Effects/GrownFrame.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Vantrel/Effects/GaussianBlur.h"
#include "Vantrel/Effects/GrownPicture.h"

namespace Vantrel {
namespace {

constexpr float kReach = 3.5F;  // standard deviations of the Gaussian that count

enum class BlurKind { kGaussian, kFast, kNeither };

/// The user's values at one time.
struct Blur {
    BlurKind kind = BlurKind::kNeither;
    float blurriness = 0.0F;
    std::int32_t dimensions = 0;
    bool keepSize = false;

    /// An IR_BlurDirection; 0 for none.
    [[nodiscard]] std::int32_t Direction() const {
        switch (dimensions) {
            case kBlurDimensions_Both:
                return Kiln::kBlur_Both;
            case kBlurDimensions_Horizontal:
                return Kiln::kBlur_Horizontal;
            case kBlurDimensions_Vertical:
                return Kiln::kBlur_Vertical;
            default:
                return 0;
        }
    }
    /// The standard deviation along an axis on which a pixel of the frame is `size` pixels of the sequence wide.
    [[nodiscard]] float Sigma(float size) const {
        switch (kind) {
            case BlurKind::kGaussian:
                return blurriness / (size * kReach);
            case BlurKind::kFast:
                return (blurriness / 2.71F) * 1.125F / size;
            default:
                return 0.0F;
        }
    }
    /// What the picture grows by on each side.
    [[nodiscard]] std::int32_t Pad(float sigma, std::int32_t direction) const {
        constexpr std::int32_t kMargin = 3;
        if ((Direction() & direction) == 0 || !(sigma > 0.0F) || keepSize) return 0;
        return PixelsToGrow(static_cast<double>(sigma) * kReach) + kMargin;
    }
};

Blur ReadBlur(const VideoNode& effect, const WideString& name, std::int64_t time) {
    Blur blur;
    if (name == u"TQ.XQVE Gaussian Blur 2") {
        blur.kind = BlurKind::kGaussian;
        blur.blurriness = static_cast<float>(effect.GetDoubleParam(kBlur_Blurriness, time));
    } else if (name == u"TQ.XQVE Fast Blur") {
        blur.kind = BlurKind::kFast;
        blur.blurriness = effect.GetFloatParam(kBlur_Blurriness, time);
    }
    blur.dimensions = effect.GetIntParam(kBlur_Dimensions, time);
    blur.keepSize = effect.GetBoolParam(kBlur_KeepSize, time);
    return blur;
}

}  // namespace

Status GaussianBlurNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                   bool& host) {
    if (Ostrand::Failed(FilterNode::Configure(description, requirements, host))) return Ostrand::kStatus_Failure;
    const auto pad = [this](std::int64_t time) -> Vellum::Point {
        const Blur blur = ReadBlur(*mDescription, GetName(), time);
        const float sigma = blur.Sigma(1.0F);
        return {blur.Pad(sigma, Kiln::kBlur_Horizontal), blur.Pad(sigma, Kiln::kBlur_Vertical)};
    };
    return FitsAtEveryKeyframe(*description, requirements, kBlur_Blurriness, pad) ? Ostrand::kStatus_OK
                                                                                  : Ostrand::kStatus_Failure;
}

Status GaussianBlurNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                const RenderResultsRef& /*results*/) {
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    const VideoFrameRef input = mFrameSlot;
    const Vellum::PixelAspectRatio aspect = input->GetPixelAspectRatio();
    const auto pixelWidth = static_cast<float>(static_cast<double>(aspect.numerator) / aspect.denominator);
    const Blur blur = ReadBlur(*mDescription, GetName(), GetNodeTime(params.clipTime, false));
    const float sigmaX = blur.Sigma(params.scaleX * pixelWidth), sigmaY = blur.Sigma(params.scaleY);
    const bool blursX = (blur.Direction() & Kiln::kBlur_Horizontal) != 0 && sigmaX > 0.0F;
    const bool blursY = (blur.Direction() & Kiln::kBlur_Vertical) != 0 && sigmaY > 0.0F;
    if (!blursX && !blursY) return Ostrand::kStatus_OK;

    const KernelFrame in(input);
    const std::int32_t padX = blur.Pad(sigmaX, Kiln::kBlur_Horizontal), padY = blur.Pad(sigmaY, Kiln::kBlur_Vertical);
    const Vellum::Point origin = input->GetOrigin();
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, in.Format(), in.Width() + 2 * padX,
                                                  in.Height() + 2 * padY, aspect, Vellum::kFieldType_Progressive,
                                                  {origin.x + padX, origin.y + padY}))) {
        mFrameSlot = input;
        return Ostrand::kStatus_OutOfMemory;
    }
    const KernelFrame out(mFrameSlot);
    const Status status =
        Kiln::GaussianBlur(mDevice, in.Data(), in.RowBytes(), in.Width(), in.Height(), out.Data(), out.RowBytes(),
                           out.Width(), out.Height(), in.Format(), sigmaX, sigmaY, blur.keepSize, blur.Direction());
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = input;
    return status;
}

}  // namespace Vantrel
