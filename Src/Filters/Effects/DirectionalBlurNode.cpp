// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/DirectionalBlurNode.h"

#include <cmath>
#include <optional>

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Filters/Effects/GrownFrame.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Kernels/TextureTable.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\DirectionalBlurNode)";
EffectKernel gHorizontal{kModuleKey, "ShearHorizontalKernel", {}};
EffectKernel gVertical{kModuleKey, "ShearVerticalKernel", {}};
TextureTable gSourceTexture;

void ShearKernel(DeviceValue /*texture*/, Vellum::PixelFormat /*format*/, DeviceValue /*out*/, std::int32_t /*width*/,
                 std::int32_t /*height*/, std::int32_t /*outPitch*/, std::int32_t /*inWidth*/,
                 std::int32_t /*inHeight*/, float /*shear*/, std::int32_t /*offset*/) {}

/// A part of a frame, from its first pixel on.
struct Part {
    const KernelFrame& frame;
    std::int32_t width;
    std::int32_t height;
};

Status Shear(const Kiln::DeviceRef& device, const Part& out, const Part& in, bool horizontal, float shear,
             std::int32_t offset) {
    const Vellum::PixelFormat format = in.frame.Format();
    Kiln::Texture& texture = GetTexture(gSourceTexture, device, kModuleKey, "inSrcTexture",
                                        Kiln::TextureAddress::kClamp, Kiln::TextureFilter::kLinear, format);
    const Kiln::ScopedTextureBinding binding(device, texture);
    const Status bound = Kiln::BindTexture(device, texture, in.frame.Data(), in.frame.Data(), in.frame.RowBytes(),
                                           in.width, in.height, format);
    if (Ostrand::Failed(bound)) return bound;
    const std::uint64_t kernel = (horizontal ? gHorizontal : gVertical).Find(device);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    const bool isCuda = device->GetFramework() == Kiln::DeviceFramework::kCuda;
    const BlockSize row{isCuda ? 512 : 256, 1}, square{isCuda ? 32 : 16, 16};
    const BlockSize block = horizontal ? row : square;
    return Launch2D(device, kernel, GridFor(out.width, out.height, block.x, block.y), block, ShearKernel,
                    texture.argument, format, out.frame.Data(), out.width, out.height, out.frame.Pitch(), in.width,
                    in.height, shear, offset);
}

/// What the kernels are told to add to a pixel's place, in whole pixels.
std::int32_t FirstOffset(float shear, std::int32_t lines) {
    return shear > 0.0F ? 0 : static_cast<std::int32_t>(std::ceil(-(static_cast<float>(lines) * shear)));
}

}  // namespace

ShearPlan DirectionalBlurNode::ComputeShearPlan(std::int64_t time, float scaleX, float scaleY, float aspect,
                                                bool asNodeTime) const {
    const std::int64_t at = asNodeTime ? GetNodeTime(time, false) : time;
    return MakeShearPlan(mDescription->GetFloatParam(kDirectionalBlur_Direction, at),
                         mDescription->GetFloatParam(kDirectionalBlur_Length, at), scaleX, scaleY, aspect);
}

Status DirectionalBlurNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                      bool& host) {
    if (Ostrand::Failed(FilterNode::Configure(description, requirements, host))) return Ostrand::kStatus_Failure;
    const auto pad = [this](std::int64_t time) -> Vellum::Point {
        const ShearPlan plan = ComputeShearPlan(time, 1.0F, 1.0F, 1.0F, false);
        return {plan.GetPadX(), plan.GetPadY()};
    };
    return FitsAtEveryKeyframe(*description, requirements, kDirectionalBlur_Length, pad) ? Ostrand::kStatus_OK
                                                                                         : Ostrand::kStatus_Failure;
}

Status DirectionalBlurNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                   const RenderResultsRef& /*results*/) {
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    const VideoFrameRef input = mFrameSlot;
    const auto pixelWidth = static_cast<float>(input->GetPixelAspectRatio().Value());
    const ShearPlan plan = ComputeShearPlan(params.clipTime, params.scaleX, params.scaleY, pixelWidth, true);
    if (plan.sigma == 0.0F) return Ostrand::kStatus_OK;
    const Status status = Blur(plan, input);
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = input;
    return status;
}

Status DirectionalBlurNode::Blur(const ShearPlan& plan, const VideoFrameRef& input) {
    const KernelFrame in(input);
    const Vellum::PixelFormat format = in.Format();
    const std::int32_t width = in.Width(), height = in.Height(), padX = plan.GetPadX(), padY = plan.GetPadY();
    const bool horizontal = plan.horizontal != 0;
    const std::int32_t shearedWidth = horizontal ? plan.GetShearedSize(width, height) : width;
    const std::int32_t shearedHeight = horizontal ? height : plan.GetShearedSize(height, width);
    const std::int32_t blurredWidth = shearedWidth + (horizontal ? 0 : 2 * padX);
    const std::int32_t blurredHeight = shearedHeight + (horizontal ? 2 * padY : 0);
    const std::int32_t offset = FirstOffset(plan.shear, horizontal ? height : width);
    const std::int32_t offsetChange = plan.shear < 0.0F ? 0 : -2 * (horizontal ? padX : padY);
    const auto makeFrame = [&](VideoFrameRef& frame, std::int32_t frameWidth, std::int32_t frameHeight,
                               Vellum::Point origin) {
        return !Ostrand::Failed(Kiln::CreateGPUVideoFrame(frame, mDevice, format, frameWidth, frameHeight,
                                                          input->GetPixelAspectRatio(), Vellum::kFieldType_Progressive,
                                                          origin));
    };

    const Vellum::Point origin = input->GetOrigin();
    VideoFrameRef shearedFrame, blurredFrame;
    if (!makeFrame(shearedFrame, blurredWidth, blurredHeight, origin)) return Ostrand::kStatus_OutOfMemory;
    std::optional<KernelFrame> sheared(shearedFrame);
    Status status =
        Shear(mDevice, {*sheared, shearedWidth, shearedHeight}, {in, width, height}, horizontal, plan.shear, offset);
    if (Ostrand::Failed(status)) return status;
    if (!makeFrame(blurredFrame, blurredWidth, blurredHeight, origin)) return Ostrand::kStatus_OutOfMemory;
    const KernelFrame blurred(blurredFrame);
    status = Kiln::GaussianBlur(mDevice, sheared->Data(), sheared->RowBytes(), shearedWidth, shearedHeight,
                                blurred.Data(), blurred.RowBytes(), blurredWidth, blurredHeight, format, plan.sigma,
                                plan.sigma, false, horizontal ? Kiln::kBlur_Vertical : Kiln::kBlur_Horizontal);
    if (Ostrand::Failed(status)) return status;
    sheared.reset();
    shearedFrame.Reset();

    if (!makeFrame(mFrameSlot, width + 2 * padX, height + 2 * padY, {origin.x + padX, origin.y + padY})) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const KernelFrame out(mFrameSlot);
    return Shear(mDevice, {out, out.Width(), out.Height()}, {blurred, blurredWidth, blurredHeight}, horizontal,
                 -plan.shear, -(offset + offsetChange));
}

}  // namespace Vantrel
