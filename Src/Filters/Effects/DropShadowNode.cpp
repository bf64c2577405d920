// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/DropShadowNode.h"

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Effects/SingleChannelBlur.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/Effects/ParameterReader.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\DropShadowNode)";
EffectKernel gCreate{kModuleKey, "CreateShadowMask", {}};
EffectKernel gComposite{kModuleKey, "CompositeShadowMask", {}};

/// One 32-bit float a pixel, in the bytes of an 8-bit frame.
constexpr Vellum::PixelFormat kMaskFormat = Vellum::kPixelFormat_BGRA_4444_8u;

void CreateShadowMask(DeviceValue /*in*/, std::int32_t /*inPitch*/, std::int32_t /*inWidth*/, std::int32_t /*inHeight*/,
                      DeviceValue /*mask*/, std::int32_t /*maskPitch*/, std::int32_t /*width*/, std::int32_t /*height*/,
                      Vellum::PixelFormat /*format*/, std::int32_t /*shadowX*/, std::int32_t /*shadowY*/) {}
void CompositeShadowMask(DeviceValue /*in*/, std::int32_t /*inPitch*/, std::int32_t /*inWidth*/,
                         std::int32_t /*inHeight*/, DeviceValue /*mask*/, std::int32_t /*maskPitch*/,
                         DeviceValue /*out*/, std::int32_t /*outPitch*/, std::int32_t /*width*/,
                         std::int32_t /*height*/, std::int32_t /*left*/, std::int32_t /*top*/,
                         Vellum::PixelFormat /*format*/, float /*blue*/, float /*green*/, float /*red*/,
                         float /*opacity*/, std::int32_t /*shadowOnly*/) {}

}  // namespace

Status DropShadowNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                              const RenderResultsRef& /*results*/) {
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    const VideoFrameRef input = mFrameSlot;
    const std::int64_t time = GetNodeTime(params.clipTime, false);
    const ParameterReader read(*mDescription, kDropShadowEffect, time);
    const KernelFrame in(input);
    const float opacity = read.Number(kDropShadow_Opacity);
    if (opacity == 0.0F) {
        if (!read.Flag(kDropShadow_ShadowOnly)) return Ostrand::kStatus_OK;
        return Kiln::FillWithTransparentBlack(mDevice, in.Data(), in.RowBytes(), in.Format(), 0, 0, in.Width(),
                                              in.Height());
    }
    const ShadowPlace place =
        PlaceShadow(in.Width(), in.Height(), read.Number(kDropShadow_Direction), read.Number(kDropShadow_Distance),
                    read.Number(kDropShadow_Softness), params.scaleX, params.scaleY);
    const Status status = DrawShadow(place, opacity, time, input);
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = input;
    return status;
}

Status DropShadowNode::DrawShadow(const ShadowPlace& place, float opacity, std::int64_t time,
                                  const VideoFrameRef& input) {
    const KernelFrame in(input);
    const Vellum::Point origin = {input->GetOrigin().x + place.left, input->GetOrigin().y + place.top};
    const auto makeFrame = [&](VideoFrameRef& frame, Vellum::PixelFormat format) {
        return !Ostrand::Failed(Kiln::CreateGPUVideoFrame(frame, mDevice, format, place.width, place.height,
                                                          input->GetPixelAspectRatio(), Vellum::kFieldType_Progressive,
                                                          origin));
    };
    VideoFrameRef maskFrame;
    if (!makeFrame(maskFrame, kMaskFormat) || !makeFrame(mFrameSlot, in.Format())) return Ostrand::kStatus_OutOfMemory;
    const KernelFrame mask(maskFrame), out(mFrameSlot);
    const DeviceValue maskData = mask.Data(), outData = out.Data();
    const std::uint64_t create = gCreate.Find(mDevice), composite = gComposite.Find(mDevice);
    if (create == 0 || composite == 0) return Ostrand::kStatus_Failure;

    Status status =
        Launch2D(mDevice, create, out.Grid(), {}, CreateShadowMask, in.Data(), in.Pitch(), in.Width(), in.Height(),
                 maskData, mask.Pitch(), place.width, place.height, in.Format(), place.shadowX, place.shadowY);
    if (Ostrand::Failed(status)) return status;
    if (place.sigmaX != 0.0F || place.sigmaY != 0.0F) {
        status = SingleChannelBlur(mDevice, maskData, mask.RowBytes(), place.width, place.height, place.sigmaX,
                                   place.sigmaY);
        if (Ostrand::Failed(status)) return status;
    }
    float blue = 0.0F, green = 0.0F, red = 0.0F, unused = 0.0F;
    mDescription->GetColorParam(kDropShadow_Color, time, blue, green, red, unused);
    return Launch2D(mDevice, composite, out.Grid(), {}, CompositeShadowMask, in.Data(), in.Pitch(), in.Width(),
                    in.Height(), maskData, mask.Pitch(), outData, out.Pitch(), place.width, place.height, place.left,
                    place.top, in.Format(), blue, green, red, opacity,
                    mDescription->GetBoolParam(kDropShadow_ShadowOnly, time) ? 1 : 0);
}

}  // namespace Vantrel
