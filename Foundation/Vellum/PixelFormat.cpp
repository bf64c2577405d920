// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Vellum/PixelFormat.h"

#include <algorithm>
#include <cstdio>
#include <iterator>

namespace Vellum {

namespace {

struct NamedFormat {
    PixelFormat format;
    const char* name;
};

constexpr NamedFormat kFormats[] = {
    {kPixelFormat_BGRA_4444_8u, "BGRA_4444_8u"},           {kPixelFormat_BGRX_4444_8u, "BGRX_4444_8u"},
    {kPixelFormat_BGRP_4444_8u, "BGRP_4444_8u"},           {kPixelFormat_ARGB_4444_8u, "ARGB_4444_8u"},
    {kPixelFormat_XRGB_4444_8u, "XRGB_4444_8u"},           {kPixelFormat_PRGB_4444_8u, "PRGB_4444_8u"},
    {kPixelFormat_VUYA_4444_8u, "VUYA_4444_8u"},           {kPixelFormat_VUYX_4444_8u, "VUYX_4444_8u"},
    {kPixelFormat_VUYP_4444_8u, "VUYP_4444_8u"},           {kPixelFormat_VUYA_4444_8u_709, "VUYA_4444_8u_709"},
    {kPixelFormat_VUYX_4444_8u_709, "VUYX_4444_8u_709"},   {kPixelFormat_VUYP_4444_8u_709, "VUYP_4444_8u_709"},
    {kPixelFormat_BGRA_4444_32f, "BGRA_4444_32f"},         {kPixelFormat_GPU_BGRA_4444_32f, "GPU_BGRA_4444_32f"},
    {kPixelFormat_GPU_BGRA_4444_16f, "GPU_BGRA_4444_16f"}, {kPixelFormat_GPU_BGRX_4444_16f, "GPU_BGRX_4444_16f"},
};

}  // namespace

std::size_t BytesPerPixel(PixelFormat format) {
    using namespace PixelFormatBits;
    const std::uint32_t bits = format.GetUpper();
    if ((bits & kClassMask) != kClassRGB && (bits & kClassMask) != kClassYUV) return 0;
    std::size_t bytes = 0;
    switch (bits & kLayoutMask) {
        case kLayout8:
            bytes = 4;
            break;
        case kLayout16:
            bytes = 8;
            break;
        case kLayoutFloat:
            bytes = 16;
            break;
        default:
            return 0;
    }
    return (bits & kWidthMask) == kHalfWidth ? bytes / 2 : bytes;
}

std::uint64_t PixelFormatSize(PixelFormat format, std::int32_t width, std::int32_t height) {
    if (width <= 0 || height <= 0) return 0;
    return static_cast<std::uint64_t>(BytesPerPixel(format)) * static_cast<std::uint32_t>(width) *
           static_cast<std::uint32_t>(height);
}

PixelFormat PixelFormatFromCode(std::uint32_t code) {
    if (code == 0) return kPixelFormat_Invalid;
    const auto* known = std::find_if(std::begin(kFormats), std::end(kFormats),
                                     [code](const NamedFormat& entry) { return entry.format.GetCode() == code; });
    return known == std::end(kFormats) ? kPixelFormat_Invalid : known->format;
}

std::string ToText(PixelFormat format) {
    if (format == kPixelFormat_Invalid) return "Invalid";
    const auto* known = std::find_if(std::begin(kFormats), std::end(kFormats),
                                     [format](const NamedFormat& entry) { return entry.format == format; });
    if (known != std::end(kFormats)) return known->name;
    char text[2 + 16 + 1];
    (void)std::snprintf(text, sizeof text, "0x%016llX", static_cast<unsigned long long>(format.GetValue()));
    return text;
}

}  // namespace Vellum
