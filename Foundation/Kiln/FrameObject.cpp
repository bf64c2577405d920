// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/FrameObject.h"

#include <limits>

namespace Kiln {
namespace {

constexpr std::uint64_t kRowAlignment = 256;

// Rows that lie a whole number of pages apart fall into the same few lines of every cache.
std::uint64_t ChooseRowBytes(std::uint64_t widthBytes) {
    const std::uint64_t aligned = (widthBytes + kRowAlignment - 1) / kRowAlignment * kRowAlignment;
    return aligned % 4096 == 0 ? aligned + kRowAlignment : aligned;
}

std::uint32_t GetImpliedAlphaType(Vellum::PixelFormat format) {
    const std::uint32_t upper = format.GetUpper();
    if ((upper & Vellum::PixelFormatBits::kAlpha) == 0) return Vellum::kAlphaType_None;
    return (upper & Vellum::PixelFormatBits::kPremultiplied) != 0 ? Vellum::kAlphaType_Premultiplied
                                                                  : Vellum::kAlphaType_Straight;
}

}  // namespace

bool DescribeFrame(Vellum::PixelFormat format, std::int32_t width, std::int32_t height, FrameAttributes& out) {
    const std::uint64_t bytesPerPixel = Vellum::BytesPerPixel(format);
    if (width <= 0 || height <= 0 || bytesPerPixel == 0) return false;
    const std::uint64_t rowBytes = ChooseRowBytes(static_cast<std::uint64_t>(width) * bytesPerPixel);
    if (rowBytes > static_cast<std::uint64_t>(std::numeric_limits<std::int32_t>::max())) return false;
    out = {};
    out.format = format;
    out.width = width;
    out.height = height;
    out.rowBytes = static_cast<std::int32_t>(rowBytes);
    out.alphaType = GetImpliedAlphaType(format);
    return true;
}

FrameAttributes GetAttributes(const VideoFrameRef& frame) {
    FrameAttributes attributes;
    attributes.format = frame->GetPixelFormat();
    attributes.width = frame->GetBounds().Width();
    attributes.height = frame->GetBounds().Height();
    attributes.rowBytes = Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes();
    attributes.aspect = frame->GetPixelAspectRatio();
    attributes.fieldType = frame->GetFieldType();
    attributes.alphaType = frame->GetAlphaType();
    attributes.origin = frame->GetOrigin();
    return attributes;
}

std::uint8_t* GetHostPixels(const VideoFrameRef& frame) {
    return reinterpret_cast<std::uint8_t*>(Ostrand::Demand<Marl::IFrameData>(frame)->GetData());
}

}  // namespace Kiln
