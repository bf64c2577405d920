// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>

#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

/// How many sources a launch takes.
constexpr std::int32_t kBatch = 3;

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, DeviceBuffer, std::int32_t, DeviceBuffer, std::int32_t,
                 DeviceBuffer, std::int32_t, float4, std::int32_t, std::int32_t, std::int32_t, std::int32_t, bool, bool>
    kAccumulate{R"(..\..\Kiln\Modules\Accumulate)", "AccumulateKernel"};

}  // namespace

Status Accumulate(const DeviceRef& device, const DeviceBuffer* sources, const float* weights, std::int32_t count,
                  DeviceBuffer target, std::int32_t rowBytes, std::int32_t width, PixelFormat format,
                  std::int32_t height, std::int32_t mode) {
    if (!IsRenderFormat(format) || count < 1 || width < 1 || height < 1) return Ostrand::kStatus_Failure;
    const bool field = mode == kAccumulate_UpperField || mode == kAccumulate_LowerField;
    const std::int32_t first = mode == kAccumulate_LowerField ? 1 : 0;
    const std::int32_t step = field ? 2 : 1;
    const std::int32_t rows = (height - first + step - 1) / step;
    const std::int32_t pitch = PitchOf(rowBytes, format);
    if (rows == 0) return Ostrand::kStatus_OK;

    for (std::int32_t begin = 0; begin < count; begin += kBatch) {
        const std::int32_t end = std::min(begin + kBatch, count);
        // A place without a source names the first one again, and weighs nothing.
        const auto source = [&](std::int32_t index) { return sources[begin + index < end ? begin + index : begin]; };
        const auto weight = [&](std::int32_t index) { return begin + index < end ? weights[begin + index] : 0.0F; };
        const Status status = kAccumulate.Launch(
            device, ShapeFor(width, rows), format, target, pitch, source(0), pitch, source(1), pitch, source(2), pitch,
            float4{weight(0), weight(1), weight(2), 0.0F}, width, rows, first, step, begin != 0, end == count);
        if (Ostrand::Failed(status)) return status;
    }
    return Ostrand::kStatus_OK;
}

Status FieldReverse(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes, DeviceBuffer target,
                    std::int32_t targetRowBytes, PixelFormat format, std::int32_t width, std::int32_t height) {
    if (width < 1 || height < 1 || Vellum::BytesPerPixel(format) == 0) return Ostrand::kStatus_Failure;
    Backend& backend = device->GetBackend();
    const auto from = static_cast<std::uint64_t>(sourceRowBytes);
    const auto to = static_cast<std::uint64_t>(targetRowBytes);
    const std::uint64_t widthBytes = Vellum::BytesPerPixel(format) * static_cast<std::uint64_t>(width);
    const auto pairs = static_cast<std::uint64_t>(height / 2);
    const auto copy = [&](std::uint64_t targetLine, std::uint64_t sourceLine, std::uint64_t rows) {
        if (rows == 0) return Ostrand::kStatus_OK;
        return backend.CopyRows(target, {targetLine * to, 2 * to}, source, {sourceLine * from, 2 * from}, widthBytes,
                                rows);
    };
    const Status status = copy(0, 1, pairs);
    if (Ostrand::Failed(status)) return status;
    const Status lower = copy(1, 0, pairs);
    if (Ostrand::Failed(lower)) return lower;
    const auto last = static_cast<std::uint64_t>(height - 1);
    return copy(last, last, static_cast<std::uint64_t>(height % 2));
}

}  // namespace Kiln
