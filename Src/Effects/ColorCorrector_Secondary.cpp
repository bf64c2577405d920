// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Effects/ColorCorrector_Secondary.h"

#include <cmath>
#include <cstddef>
#include <cstring>

#include "Src/Effects/SingleChannelBlur.h"
#include "Src/Kernels/RecordUpload.h"

namespace Vantrel {
namespace {

static_assert(offsetof(SecondaryParameters, blurRadiusX) == 48 &&
              offsetof(SecondaryParameters, invertSelection) == 60 && offsetof(SecondaryParameters, fullCircle) == 64);

constexpr const char* kModuleKey = R"(..\..\Src\Effects\ColorCorrector_Secondary)";
KernelTable gKernel;
ModuleSymbol gRecord{kModuleKey, "inSecondaryParameters", {}};

void SecondaryColorCorrection(DeviceValue /*in*/, std::int32_t /*inPitch*/, DeviceValue /*mask*/,
                              std::int32_t /*maskPitch*/, Vellum::PixelFormat /*format*/, std::int32_t /*width*/,
                              std::int32_t /*height*/, DeviceValue /*record*/) {}

float WrapTurn(float turns) { return turns < 0.0F ? turns + 1.0F : turns; }

/// A Gaussian's width in pixels of the frame, for a softness that is counted in the sequence's geometry.
float BlurRadius(float scale, float stretch, float softness) {
    return std::sqrt((1.0F / (scale * scale)) * 2.0F * stretch) * softness;
}

bool IsWholeLinearRange(float lowRamp, float low, float highRamp, float high) {
    return lowRamp == 0.0F && low == 0.0F && highRamp == 0.0F && high == 1.0F;
}

}  // namespace

SecondaryParameters ReadSecondaryParameters(const ParameterReader& read, std::int32_t first, float aspect,
                                            const RenderParams& params) {
    SecondaryParameters record{};
    const float center = read.Number(first);
    record.range0LowRamp = read.Number(first + 2);
    record.range0Low = WrapTurn(read.Number(first + 1) - center);
    record.range0HighRamp = read.Number(first + 4);
    record.range0High = WrapTurn(read.Number(first + 3) - center);
    record.range1LowRamp = read.Number(first + 10);
    record.range1Low = read.Number(first + 9);
    record.range1HighRamp = read.Number(first + 12);
    record.range1High = read.Number(first + 11);
    record.range2LowRamp = read.Number(first + 18);
    record.range2Low = read.Number(first + 17);
    record.range2HighRamp = read.Number(first + 20);
    record.range2High = read.Number(first + 19);
    const float softness = read.Number(first + 23);
    record.blurRadiusX = BlurRadius(params.scaleX, aspect, softness);
    record.blurRadiusY = BlurRadius(params.scaleY, 1.0F, softness);
    record.maskAdjust = read.Number(first + 24);
    record.invertSelection = read.Integer(first + 25);
    const bool rawEdgesRise = read.Number(first + 3) > read.Number(first + 1);
    record.fullCircle = record.range0Low == record.range0High && rawEdgesRise ? 1 : 0;
    return record;
}

bool HasSecondarySelection(const SecondaryParameters& record) {
    constexpr float kAnyHue = 0.5F;  // where both edges stand by default
    const bool anyHue = record.range0LowRamp == 0.0F && record.range0Low == kAnyHue && record.range0HighRamp == 0.0F &&
                        record.range0High == kAnyHue;
    const bool whole =
        anyHue &&
        IsWholeLinearRange(record.range1LowRamp, record.range1Low, record.range1HighRamp, record.range1High) &&
        IsWholeLinearRange(record.range2LowRamp, record.range2Low, record.range2HighRamp, record.range2High);
    return !whole || record.blurRadiusX > 0.0F || record.blurRadiusY > 0.0F || record.invertSelection != 0;
}

Status RenderSecondaryMask(const Kiln::DeviceRef& device, DeviceValue input, std::int32_t inputRowBytes,
                           DeviceValue mask, std::int32_t maskRowBytes, Vellum::PixelFormat inputFormat,
                           std::int32_t width, std::int32_t height, const SecondaryParameters& record) {
    RecordUpload upload(device, sizeof record);
    if (!upload.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    std::memcpy(upload.GetBlock(), &record, sizeof record);
    Status status = upload.Send(gRecord);
    if (Ostrand::Failed(status)) return status;

    const std::uint64_t kernel = GetKernel(gKernel, device, kModuleKey, "SecondaryColorCorrection");
    if (kernel == 0) return Ostrand::kStatus_Failure;
    const std::int32_t maskPitch = maskRowBytes / static_cast<std::int32_t>(sizeof(float));
    status = Launch2D(device, kernel, GridFor(width, height), {}, SecondaryColorCorrection, input,
                      PitchInPixels(inputRowBytes, inputFormat), mask, maskPitch, inputFormat, width, height,
                      upload.GetArgument());
    if (Ostrand::Failed(status)) return status;
    upload.SetMark(device->GetCommands()->CreateMark());
    if (!(record.blurRadiusX > 0.0F || record.blurRadiusY > 0.0F)) return status;
    return SingleChannelBlur(device, mask, maskRowBytes, width, height, record.blurRadiusX, record.blurRadiusY);
}

}  // namespace Vantrel
