// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstring>

#include "Kiln/Backend.h"
#include "Kiln/FrameCopies.h"
#include "Kiln/FrameObject.h"
#include "Kiln/ParallelRows.h"
#include "Kiln/Scratch.h"

namespace Kiln {
namespace {

// Rows come back in portions that a processor's cache holds until they are converted.
constexpr std::uint64_t kPortionBytes = 4U << 20;

// Moving the exponent by a multiplication is exact and gets denormals right; infinities and NaN get the exponent that
// the multiplication can't give them.
void HalfToFloat(const std::uint16_t* halves, float* floats, std::size_t count) {
    constexpr float kExponentShift = 0x1p112F;
    for (std::size_t i = 0; i < count; ++i) {
        const std::uint32_t magnitude = (halves[i] & 0x7FFFU) << 13;
        float value = 0.0F;
        std::memcpy(&value, &magnitude, sizeof value);
        value *= kExponentShift;
        std::uint32_t bits = 0;
        std::memcpy(&bits, &value, sizeof bits);
        bits |= magnitude >= 0x0F800000U ? 0x7F800000U : 0U;
        bits |= (halves[i] & 0x8000U) << 16;
        std::memcpy(&floats[i], &bits, sizeof bits);
    }
}

// The product with 255 is exact in double precision, so that halves round up always. NaN becomes 0.
void FloatTo8Bits(const float* floats, std::uint8_t* bytes, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
        const float positive = floats[i] > 0.0F ? floats[i] : 0.0F;
        const float clamped = positive < 1.0F ? positive : 1.0F;
        bytes[i] = static_cast<std::uint8_t>(static_cast<std::int32_t>(static_cast<double>(clamped) * 255.0 + 0.5));
    }
}

// Converts one row, in pieces that stay in the first-level cache.
class RowConverter {
public:
    RowConverter(Vellum::PixelFormat from, Vellum::PixelFormat to)
        : mFromHalf(from != kPixelFormat_GPU_BGRA_4444_32f),
          mOpaque(from == kPixelFormat_GPU_BGRX_4444_16f),
          mToFloat(to == Vellum::kPixelFormat_BGRA_4444_32f) {}

    void Convert(const std::uint8_t* source, std::uint8_t* target, std::size_t values) const {
        constexpr std::size_t kPiece = 1024;
        float piece[kPiece];
        const std::size_t sourceSize = mFromHalf ? 2 : 4;
        const std::size_t targetSize = mToFloat ? 4 : 1;
        for (std::size_t done = 0; done < values; done += kPiece) {
            const std::size_t count = std::min(kPiece, values - done);
            Read(source + done * sourceSize, piece, count);
            if (mToFloat) {
                std::memcpy(target + done * targetSize, piece, count * sizeof(float));
            } else {
                FloatTo8Bits(piece, target + done * targetSize, count);
            }
        }
    }

private:
    void Read(const std::uint8_t* source, float* piece, std::size_t count) const {
        if (mFromHalf) {
            HalfToFloat(reinterpret_cast<const std::uint16_t*>(source), piece, count);
        } else {
            std::memcpy(piece, source, count * sizeof(float));
        }
        if (!mOpaque) return;
        for (std::size_t i = 3; i < count; i += 4) piece[i] = 1.0F;
    }

    bool mFromHalf;
    bool mOpaque;
    bool mToFloat;
};

Status ReadConverted(const FrameAttributes& to, std::uint8_t* target, const DeviceFrameView& from) {
    const auto rowBytes = static_cast<std::uint64_t>(from.rowBytes);
    const auto portionRows = static_cast<std::int32_t>(
        std::clamp<std::uint64_t>(kPortionBytes / rowBytes, 1, static_cast<std::uint64_t>(from.height)));
    const ScopedRecordedHostMemory portion(from.device, rowBytes * static_cast<std::uint64_t>(portionRows));
    if (!portion.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    const auto* staged = static_cast<const std::uint8_t*>(portion.GetBlock());
    const RowConverter converter(from.format, to.format);
    for (std::int32_t top = 0; top < from.height; top += portionRows) {
        const std::int32_t rows = std::min(portionRows, from.height - top);
        const Status status = from.device->GetBackend().CopyRowsToHost(
            portion.GetBlock(), rowBytes, from.data, {rowBytes * static_cast<std::uint64_t>(top), rowBytes}, rowBytes,
            static_cast<std::uint64_t>(rows));
        if (Ostrand::Failed(status)) return status;
        ForEachBand(rows, 2 * rowBytes, [&](std::int32_t first, std::int32_t last) {
            for (std::ptrdiff_t row = first; row < last; ++row) {
                converter.Convert(staged + row * from.rowBytes, target + (top + row) * to.rowBytes,
                                  static_cast<std::size_t>(from.width) * 4);
            }
        });
    }
    return Ostrand::kStatus_OK;
}

}  // namespace

Status CopyFromDevice(const VideoFrameRef& target, const VideoFrameRef& deviceFrame) {
    const DeviceFrameView from = ViewDeviceFrame(deviceFrame);
    if (!from.device || !target || IsDeviceFrame(target)) return Ostrand::kStatus_Failure;
    if ((from.format.GetUpper() & Vellum::PixelFormatBits::kDevice) == 0) return Ostrand::kStatus_Failure;
    const FrameAttributes to = GetAttributes(target);
    const bool toFloat = to.format == Vellum::kPixelFormat_BGRA_4444_32f;
    if (!toFloat && to.format != Vellum::kPixelFormat_BGRA_4444_8u) return Ostrand::kStatus_Failure;
    if (to.width != from.width || to.height != from.height) return Ostrand::kStatus_Failure;
    if (!toFloat || from.format != kPixelFormat_GPU_BGRA_4444_32f) {
        return ReadConverted(to, GetHostPixels(target), from);
    }
    return from.device->GetBackend().CopyRowsToHost(GetHostPixels(target), static_cast<std::uint64_t>(to.rowBytes),
                                                    from.data, {0, static_cast<std::uint64_t>(from.rowBytes)},
                                                    static_cast<std::uint64_t>(from.width) * 16,
                                                    static_cast<std::uint64_t>(from.height));
}

}  // namespace Kiln
