// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/StabilizerWarpNode.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "Kiln/Frames.h"
#include "Kiln/Scratch.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/Effects/ParameterReader.h"
#include "Src/Kernels/TextureTable.h"
#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoClipNode.h"
#include "Src/VideoNodes/VideoEffectNode.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Vantrel/Effects/Stabilizer.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\StabilizerWarpNode)";
EffectKernel gWarp{kModuleKey, "StabilizerWarpKernel", {}};
TextureTable gTexture;

void StabilizerWarpKernel(DeviceValue /*texture*/, Vellum::PixelFormat /*format*/, DeviceValue /*out*/,
                          std::int32_t /*width*/, std::int32_t /*height*/, std::int32_t /*outPitch*/,
                          std::int32_t /*inWidth*/, std::int32_t /*inHeight*/, DeviceValue /*mesh*/,
                          std::int32_t /*meshWidth*/, std::int32_t /*meshHeight*/, Kiln::float4 /*sourceRectangle*/,
                          Kiln::float4 /*cropWindow*/, std::int32_t /*cropped*/, std::int32_t /*windowLeft*/,
                          std::int32_t /*windowTop*/, std::int32_t /*windowRight*/, std::int32_t /*windowBottom*/,
                          float /*scale*/) {}

/// Draws `in` through the mesh of the inputs into a frame that is cleared first.
Status Warp(const Kiln::DeviceRef& device, const KernelFrame& in, const KernelFrame& out,
            const StabilizerMeshCache& cache, const StabilizerWarpInputs& inputs) {
    Kiln::Texture& texture = GetTexture(gTexture, device, kModuleKey, "inputTex", Kiln::TextureAddress::kClamp,
                                        Kiln::TextureFilter::kLinear, in.Format());
    const Kiln::ScopedTextureBinding binding(device, texture);
    Status status =
        Kiln::BindTexture(device, texture, in.Data(), in.Data(), in.RowBytes(), in.Width(), in.Height(), in.Format());
    if (Ostrand::Failed(status)) return status;

    const std::uint64_t bytes = inputs.mesh->size() * sizeof(float);
    Kiln::ScopedRecordedHostMemory block(device, bytes);
    const Kiln::DeviceScratchBuffer buffer(device, bytes);
    if (!block.GetBlock() || buffer.GetHandle() == 0) return Ostrand::kStatus_OutOfMemory;
    std::memcpy(block.GetBlock(), inputs.mesh->data(), bytes);
    status = device->GetCommands()->CopyHostToDevice(block.GetBlock(), buffer.GetHandle(), bytes, nullptr);
    if (Ostrand::Failed(status)) return status;
    status = Kiln::FillWithTransparentBlack(device, out.Data(), out.RowBytes(), out.Format(), 0, 0, out.Width(),
                                            out.Height());
    if (Ostrand::Failed(status)) return status;

    const std::uint64_t kernel = gWarp.Find(device);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    const Vellum::Rect& window = inputs.outputWindow;
    status = Launch2D(device, kernel, {cache.meshWidth, cache.meshHeight}, {}, StabilizerWarpKernel, texture.argument,
                      in.Format(), out.Data(), out.Width(), out.Height(), out.Pitch(), in.Width(), in.Height(),
                      buffer.GetHandle(), cache.meshWidth, cache.meshHeight, inputs.sourceRectangle, inputs.cropWindow,
                      inputs.cropped, window.left, window.top, window.right, window.bottom, inputs.scale);
    if (!Ostrand::Failed(status)) block.GetMark() = device->GetCommands()->CreateMark();
    return status;
}

}  // namespace

StabilizerWarpNode::StabilizerWarpNode() : FilterNode(false, false), mEntries(FindStabilizer()) {}

StabilizerWarpNode::~StabilizerWarpNode() {
    if (!mHandle) return;
    std::uint8_t disposed = 0;
    if (const OpaqueEffectDataSuite* suite = FindOpaqueEffectDataSuite()) suite->Release(mInstanceID, &disposed);
}

bool StabilizerWarpNode::Acquire(const VideoNode& description) {
    const auto* effect = dynamic_cast<const VideoEffectNode*>(&description);
    if (!effect) return false;
    mInstanceID = effect->GetRuntimeInstanceID();
    void* handle = nullptr;
    if (OpaqueDataSuite().Acquire(mInstanceID, &handle) != 0 || !handle) return false;
    mHandle = handle;
    return mEntries.AreComplete() && mEntries.allowRendering(mHandle) && mData.Read(mEntries, mHandle);
}

bool StabilizerWarpNode::Covers(const VideoNode& description) {
    const auto* clip = dynamic_cast<const VideoClipNode*>(description.GetParent().get());
    const VideoMediaNodeRef media = GetClipMedia(description.GetParent());
    if (!clip || !media) return false;
    const std::int64_t in = media->GetInPointMediaTimeAsTicks() + clip->GetEffectiveTrackItemStartAsTicks() -
                            clip->GetTrackItemStartAsTicks();
    const std::int64_t out =
        media->GetOutPointMediaTimeAsTicks() + clip->GetEffectiveTrackItemEndAsTicks() - clip->GetTrackItemEndAsTicks();
    mFieldType = media->GetStreamFieldType();
    const double fields = FieldsPerFrame(), frameTicks = static_cast<double>(media->GetStreamFrameRate());
    const double firstNeeded = std::floor(static_cast<double>(in) * fields / frameTicks);
    const double lastNeeded = std::floor(static_cast<double>(out) * fields / frameTicks);
    // So that a clip without a rate is refused, too.
    const bool spans =
        mData.firstFrame <= firstNeeded && static_cast<double>(mData.firstFrame) + mData.frameCount >= lastNeeded;
    return spans && clip->GetClipSpeed() == 1.0;
}

Status StabilizerWarpNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                     bool& host) {
    if (!description || !Acquire(*description) || !Covers(*description)) return Ostrand::kStatus_Failure;
    const Vellum::Rect& frame = requirements.frameRect;
    if (mData.frameWidth != frame.Width() || mData.frameHeight != frame.Height()) return Ostrand::kStatus_Failure;
    return FilterNode::Configure(description, requirements, host);
}

StabilizerSettings StabilizerWarpNode::ReadSettings(std::int64_t time) const {
    const ParameterReader read(*mDescription, kStabilizerEffect, time);
    StabilizerSettings settings;
    settings.framing = read.Integer(kStabilizer_Framing);
    const float largestScale = read.Number(kStabilizer_LargestScale);
    if (settings.framing == kStabilizerFraming_CropAndScale) settings.largestScale = largestScale;
    settings.margin = read.Number(kStabilizer_Margin);
    settings.extraScale = read.Number(kStabilizer_ExtraScale);
    return settings;
}

Status StabilizerWarpNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                  const RenderResultsRef& /*results*/) {
    const VideoFrameRef input = mFrameSlot;
    const KernelFrame in(input);
    if (!mData.Read(mEntries, mHandle)) return Ostrand::kStatus_Failure;
    const Vellum::PixelAspectRatio aspect = input->GetPixelAspectRatio();
    const auto pixelWidth = static_cast<float>(static_cast<double>(aspect.numerator) / aspect.denominator);
    const std::int64_t time = GetNodeTime(params.clipTime, false);
    StabilizerWarpInputs inputs;
    inputs.WorkOut(mEntries, mHandle, mData, mCache, ReadSettings(time), params, pixelWidth, time, FieldsPerFrame());
    if (!inputs.mesh) return Ostrand::kStatus_Failure;
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, in.Format(), inputs.width, inputs.height, aspect,
                                                  Vellum::kFieldType_Progressive, inputs.origin))) {
        mFrameSlot = input;
        return Ostrand::kStatus_OutOfMemory;
    }
    Vellum::Rect& window = inputs.outputWindow;
    window.left = std::clamp(window.left, 0, inputs.width);
    window.right = std::clamp(window.right, 0, inputs.width);
    window.top = std::clamp(window.top, 0, inputs.height);
    window.bottom = std::clamp(window.bottom, 0, inputs.height);
    const Status status = Warp(mDevice, in, KernelFrame(mFrameSlot), mCache, inputs);
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = input;
    return status;
}

}  // namespace Vantrel
