// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Convert.h"

#include <cmath>
#include <cstring>

#include "Vellum/Field.h"

namespace Vantrel::Host::Software {
namespace {

namespace Bits = Vellum::PixelFormatBits;

Pixel FromVideoLevels(const std::uint8_t* vuya, double kr, double kb) {
    const double luma = (vuya[2] - 16) / 219.0;
    const double red = luma + 2.0 * (1.0 - kr) * (vuya[0] - 128) / 224.0;
    const double blue = luma + 2.0 * (1.0 - kb) * (vuya[1] - 128) / 224.0;
    return {blue, (luma - kr * red - kb * blue) / (1.0 - kr - kb), red, vuya[3] / 255.0};
}

Pixel ReadPixel(const unsigned char* bytes, std::uint32_t upper) {
    if ((upper & Bits::kLayoutMask) == Bits::kLayoutFloat) {
        float values[4];
        std::memcpy(values, bytes, sizeof values);
        return {values[0], values[1], values[2], values[3]};
    }
    if ((upper & Bits::kClassMask) == Bits::kClassYUV) {
        return (upper & Bits::kBT709) != 0 ? FromVideoLevels(bytes, 0.2126, 0.0722)
                                           : FromVideoLevels(bytes, 0.299, 0.114);
    }
    if ((upper & Bits::kOrderMask) == Bits::kOrderARGB) {
        return {bytes[3] / 255.0, bytes[2] / 255.0, bytes[1] / 255.0, bytes[0] / 255.0};
    }
    return {bytes[0] / 255.0, bytes[1] / 255.0, bytes[2] / 255.0, bytes[3] / 255.0};
}

}  // namespace

Picture ReadPicture(const void* data, std::ptrdiff_t rowBytes, int width, int height, Vellum::PixelFormat format,
                    std::uint32_t alphaType) {
    const std::uint32_t upper = format.GetUpper();
    const bool opaque = (upper & Bits::kAlpha) == 0 || alphaType == Vellum::kAlphaType_None;
    const bool premultiplied = (upper & Bits::kPremultiplied) != 0 || alphaType == Vellum::kAlphaType_Premultiplied;
    const std::size_t pixelBytes = (upper & Bits::kLayoutMask) == Bits::kLayoutFloat ? 16 : 4;
    Picture picture(width, height);
    for (int y = 0; y < height; ++y) {
        const auto* row = static_cast<const unsigned char*>(data) + y * rowBytes;
        for (int x = 0; x < width; ++x) {
            Pixel pixel = ReadPixel(row + static_cast<std::size_t>(x) * pixelBytes, upper);
            if (opaque) {
                pixel[3] = 1.0;
            } else if (premultiplied) {
                for (std::size_t c = 0; c < 3; ++c) pixel[c] = pixel[3] == 0.0 ? 0.0 : pixel[c] / pixel[3];
            }
            picture.Set(x, y, pixel);
        }
    }
    return picture;
}

void WritePicture8(const Picture& picture, void* data, std::ptrdiff_t rowBytes) {
    for (int y = 0; y < picture.height; ++y) {
        auto* row = static_cast<unsigned char*>(data) + y * rowBytes;
        const float* source = picture.At(0, y);
        for (int i = 0; i < picture.width * 4; ++i) {
            const double value = source[i];
            const double clamped = value > 0.0 ? (value < 1.0 ? value : 1.0) : 0.0;
            row[i] = static_cast<unsigned char>(std::floor(clamped * 255.0 + 0.5));
        }
    }
}

}  // namespace Vantrel::Host::Software
