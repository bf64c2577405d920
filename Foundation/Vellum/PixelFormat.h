// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace Vellum {

/// A pixel format: a 64-bit value whose lower half is the host's four-character code (0 for formats that no host sees)
/// and whose upper half describes the layout. The one place where these bits are told:
///
/// | bits of the upper half | meaning |
/// |---|---|
/// | 0 | alpha is there |
/// | 1 to 3 | layout: 0 four 8-bit integers, 2 four 16-bit integers, 5 four floating-point numbers |
/// | 4 | alpha is premultiplied |
/// | 5 | luma and chroma after BT.709; clear: BT.601. Only meaningful for class 10 |
/// | 6 to 7 | order in memory: 0 blue green red alpha, 1 alpha red green blue, 2 V U Y A |
/// | 8 | the device may render into it |
/// | 10, 11 | element width: 00 the layout's own, 01 half of it |
/// | 18, 19 | class: 00 invalid, 01 colour as red, green and blue, 10 colour as luma and chroma |
class PixelFormat {
public:
    constexpr PixelFormat() = default;
    constexpr explicit PixelFormat(std::uint64_t value) : mValue(value) {}
    constexpr PixelFormat(std::uint32_t upper, std::uint32_t code)
        : mValue(static_cast<std::uint64_t>(upper) << 32 | code) {}

    [[nodiscard]] constexpr std::uint64_t GetValue() const { return mValue; }
    [[nodiscard]] constexpr std::uint32_t GetUpper() const { return static_cast<std::uint32_t>(mValue >> 32); }
    [[nodiscard]] constexpr std::uint32_t GetCode() const { return static_cast<std::uint32_t>(mValue); }

    friend constexpr bool operator==(PixelFormat a, PixelFormat b) { return a.mValue == b.mValue; }
    friend constexpr bool operator!=(PixelFormat a, PixelFormat b) { return a.mValue != b.mValue; }

private:
    std::uint64_t mValue = 0;
};

namespace PixelFormatBits {
constexpr std::uint32_t kAlpha = 1U << 0;
constexpr std::uint32_t kLayoutMask = 7U << 1;
constexpr std::uint32_t kLayout8 = 0U << 1;
constexpr std::uint32_t kLayout16 = 2U << 1;
constexpr std::uint32_t kLayoutFloat = 5U << 1;
constexpr std::uint32_t kPremultiplied = 1U << 4;
constexpr std::uint32_t kBT709 = 1U << 5;
constexpr std::uint32_t kOrderMask = 3U << 6;
constexpr std::uint32_t kOrderBGRA = 0U << 6;
constexpr std::uint32_t kOrderARGB = 1U << 6;
constexpr std::uint32_t kOrderVUYA = 2U << 6;
constexpr std::uint32_t kDevice = 1U << 8;
constexpr std::uint32_t kWidthMask = 3U << 10;
constexpr std::uint32_t kHalfWidth = 1U << 10;
constexpr std::uint32_t kClassMask = 3U << 18;
constexpr std::uint32_t kClassRGB = 1U << 18;
constexpr std::uint32_t kClassYUV = 2U << 18;
}  // namespace PixelFormatBits

/// A host's four-character code; the first character lies in the lowest byte, as it does in memory.
[[nodiscard]] constexpr std::uint32_t FourCC(const char (&text)[5]) {
    return static_cast<std::uint32_t>(static_cast<unsigned char>(text[0])) |
           static_cast<std::uint32_t>(static_cast<unsigned char>(text[1])) << 8 |
           static_cast<std::uint32_t>(static_cast<unsigned char>(text[2])) << 16 |
           static_cast<std::uint32_t>(static_cast<unsigned char>(text[3])) << 24;
}

constexpr PixelFormat kPixelFormat_Invalid;

// What the host delivers. In the YUV formats "x" has no alpha and "p" has it premultiplied; V, U and Y are 8-bit video
// levels. The BGRA family is full range; a format without alpha counts as opaque whatever its fourth byte holds.
// clang-format off
constexpr PixelFormat kPixelFormat_BGRA_4444_8u{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha, FourCC("bgra")};
constexpr PixelFormat kPixelFormat_BGRX_4444_8u{PixelFormatBits::kClassRGB, FourCC("bgrx")};
constexpr PixelFormat kPixelFormat_BGRP_4444_8u{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha | PixelFormatBits::kPremultiplied, FourCC("bgrp")};
constexpr PixelFormat kPixelFormat_ARGB_4444_8u{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha | PixelFormatBits::kOrderARGB, FourCC("argb")};
constexpr PixelFormat kPixelFormat_XRGB_4444_8u{PixelFormatBits::kClassRGB | PixelFormatBits::kOrderARGB, FourCC("xrgb")};
constexpr PixelFormat kPixelFormat_PRGB_4444_8u{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha | PixelFormatBits::kPremultiplied | PixelFormatBits::kOrderARGB, FourCC("prgb")};
constexpr PixelFormat kPixelFormat_VUYA_4444_8u{PixelFormatBits::kClassYUV | PixelFormatBits::kAlpha | PixelFormatBits::kOrderVUYA, FourCC("vuya")};
constexpr PixelFormat kPixelFormat_VUYX_4444_8u{PixelFormatBits::kClassYUV | PixelFormatBits::kOrderVUYA, FourCC("vuyx")};
constexpr PixelFormat kPixelFormat_VUYP_4444_8u{PixelFormatBits::kClassYUV | PixelFormatBits::kAlpha | PixelFormatBits::kPremultiplied | PixelFormatBits::kOrderVUYA, FourCC("vuyp")};
constexpr PixelFormat kPixelFormat_VUYA_4444_8u_709{PixelFormatBits::kClassYUV | PixelFormatBits::kAlpha | PixelFormatBits::kOrderVUYA | PixelFormatBits::kBT709, FourCC("VUYA")};
constexpr PixelFormat kPixelFormat_VUYX_4444_8u_709{PixelFormatBits::kClassYUV | PixelFormatBits::kOrderVUYA | PixelFormatBits::kBT709, FourCC("vux7")};
constexpr PixelFormat kPixelFormat_VUYP_4444_8u_709{PixelFormatBits::kClassYUV | PixelFormatBits::kAlpha | PixelFormatBits::kPremultiplied | PixelFormatBits::kOrderVUYA | PixelFormatBits::kBT709, FourCC("vup7")};
constexpr PixelFormat kPixelFormat_BGRA_4444_32f{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha | PixelFormatBits::kLayoutFloat, FourCC("bgrf")};

// What the device renders in: straight alpha.
constexpr PixelFormat kPixelFormat_GPU_BGRA_4444_32f{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha | PixelFormatBits::kLayoutFloat | PixelFormatBits::kDevice, 0};
constexpr PixelFormat kPixelFormat_GPU_BGRA_4444_16f{PixelFormatBits::kClassRGB | PixelFormatBits::kAlpha | PixelFormatBits::kLayoutFloat | PixelFormatBits::kHalfWidth | PixelFormatBits::kDevice, 0};
constexpr PixelFormat kPixelFormat_GPU_BGRX_4444_16f{PixelFormatBits::kClassRGB | PixelFormatBits::kLayoutFloat | PixelFormatBits::kHalfWidth | PixelFormatBits::kDevice, 0};
// clang-format on

/// Bytes of one pixel of any valid format; 0 for the invalid one.
[[nodiscard]] std::size_t BytesPerPixel(PixelFormat format);

/// Bytes of a tightly packed picture; 0 for the invalid format and for sizes that aren't positive.
[[nodiscard]] std::uint64_t PixelFormatSize(PixelFormat format, std::int32_t width, std::int32_t height);

/// The host's code as a format; the invalid format for a code that is none of the above.
[[nodiscard]] PixelFormat PixelFormatFromCode(std::uint32_t code);

/// For logs: "BGRA_4444_8u", "GPU_BGRA_4444_16f", "Invalid"; an unknown format's value in hexadecimal.
[[nodiscard]] std::string ToText(PixelFormat format);

}  // namespace Vellum
