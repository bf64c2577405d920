// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Render/FinishedFrame.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace Vantrel::Host {

namespace {

/// The picture as a frame that shares its pixels.
Marl::VideoFrameRef WrapPicture(const HostPictureRef& picture) {
    const std::unique_ptr<Glaze, void (*)(Glaze*)> glaze(MakeGlaze(picture), DisposeGlaze);
    return Tarn::GetVideoFrameFromGlaze(glaze.get());
}

/// A host frame's pixels as a picture; the frame lives as long as the picture.
HostPictureRef ShareHostFrame(const Marl::VideoFrameRef& frame) {
    auto picture = std::make_shared<HostPicture>();
    const Vellum::Rect bounds = frame->GetBounds();
    picture->format = frame->GetPixelFormat();
    picture->width = bounds.Width();
    picture->height = bounds.Height();
    picture->rowBytes = Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes();
    picture->aspect = frame->GetPixelAspectRatio();
    picture->fieldType = frame->GetFieldType();
    picture->origin = frame->GetOrigin();
    picture->alphaType = frame->GetAlphaType();
    auto* pixels = reinterpret_cast<std::byte*>(Ostrand::Demand<Marl::IFrameData>(frame)->GetData());
    picture->pixels = std::shared_ptr<std::byte>(pixels, [frame](std::byte*) {});
    return picture;
}

void ToFloatRow(const std::byte* from, std::byte* to, std::int32_t count, bool opaque) {
    const auto* source = reinterpret_cast<const std::uint8_t*>(from);
    auto* target = reinterpret_cast<float*>(to);
    for (std::int32_t i = 0; i < 4 * count; ++i) target[i] = static_cast<float>(source[i]) / 255.0F;
    if (!opaque) return;
    for (std::int32_t i = 0; i < count; ++i) target[4 * i + 3] = 1.0F;
}

void ToByteRow(const std::byte* from, std::byte* to, std::int32_t count, bool opaque) {
    const auto* source = reinterpret_cast<const float*>(from);
    auto* target = reinterpret_cast<std::uint8_t*>(to);
    for (std::int32_t i = 0; i < 4 * count; ++i) {
        // Written so that NaN becomes 0.
        const float value = source[i] > 0.0F ? std::min(source[i], 1.0F) : 0.0F;
        const float raised = value * 255.0F + 0.5F;
        target[i] = static_cast<std::uint8_t>(raised);
    }
    if (!opaque) return;
    for (std::int32_t i = 0; i < count; ++i) target[4 * i + 3] = 255;
}

/// A format without alpha, or one whose alpha doesn't count.
bool IsOpaque(const HostPicture& picture) {
    return picture.alphaType == Vellum::kAlphaType_None ||
           (picture.format.GetUpper() & Vellum::PixelFormatBits::kAlpha) == 0;
}

std::shared_ptr<HostPicture> CopyConverted(PixelBufferPool& pool, const HostPicture& source,
                                           Vellum::PixelFormat format) {
    const bool fromBytes = Vellum::BytesPerPixel(source.format) == 4;
    const bool toBytes = Vellum::BytesPerPixel(format) == 4;
    auto target = MakeHostPicture(pool, format, source.width, source.height);
    target->aspect = source.aspect;
    target->fieldType = source.fieldType;
    target->origin = source.origin;
    for (std::int32_t y = 0; y < source.height; ++y) {
        if (fromBytes == toBytes) {
            std::memcpy(target->GetRow(y), source.GetRow(y),
                        static_cast<std::size_t>(source.width) * Vellum::BytesPerPixel(format));
        } else if (fromBytes) {
            ToFloatRow(source.GetRow(y), target->GetRow(y), source.width, IsOpaque(source));
        } else {
            ToByteRow(source.GetRow(y), target->GetRow(y), source.width, IsOpaque(source));
        }
    }
    target->alphaType =
        fromBytes == toBytes ? source.alphaType : static_cast<std::uint32_t>(Vellum::kAlphaType_Straight);
    return target;
}

}  // namespace

HostPictureRef ConvertPicture(PixelBufferPool& pool, const HostPictureRef& picture, Vellum::PixelFormat format) {
    if (picture->format == format) return picture;
    for (const Vellum::PixelFormat known : {picture->format, format}) {
        if (known != Vellum::kPixelFormat_BGRA_4444_8u && known != Vellum::kPixelFormat_BGRA_4444_32f) {
            throw std::invalid_argument("no conversion for pictures of " + Vellum::ToText(known));
        }
    }
    return CopyConverted(pool, *picture, format);
}

std::shared_ptr<HostPicture> TakeFinishedFrame(PixelBufferPool& pool, const Marl::VideoFrameRef& frame,
                                               Vellum::PixelFormat format) {
    if (!Kiln::IsDeviceFrame(frame)) return CopyConverted(pool, *ShareHostFrame(frame), format);
    const Vellum::Rect bounds = frame->GetBounds();
    auto picture = MakeHostPicture(pool, format, bounds.Width(), bounds.Height());
    picture->aspect = frame->GetPixelAspectRatio();
    picture->fieldType = frame->GetFieldType();
    picture->origin = frame->GetOrigin();
    if (Ostrand::Failed(Kiln::CopyFromDevice(WrapPicture(picture), frame))) return nullptr;
    return picture;
}

std::shared_ptr<HostPicture> MakeTransparentPicture(PixelBufferPool& pool, Vellum::PixelFormat format,
                                                    std::int32_t width, std::int32_t height) {
    auto picture = MakeHostPicture(pool, format, width, height);
    std::memset(picture->pixels.get(), 0, picture->GetBytes());
    return picture;
}

std::shared_ptr<HostPicture> PlaceOnOutput(PixelBufferPool& pool, std::shared_ptr<HostPicture> picture,
                                           std::int32_t width, std::int32_t height) {
    if (picture->width == width && picture->height == height) return picture;
    auto placed = MakeTransparentPicture(pool, picture->format, width, height);
    placed->aspect = picture->aspect;
    placed->fieldType = picture->fieldType;
    const Vellum::Point origin = picture->origin;
    const std::int32_t left = std::max(0, -origin.x);
    const std::int32_t right = std::min(width, picture->width - origin.x);
    const std::size_t pixel = Vellum::BytesPerPixel(picture->format);
    for (std::int32_t y = std::max(0, -origin.y); y < std::min(height, picture->height - origin.y) && left < right;
         ++y) {
        std::memcpy(placed->GetRow(y) + pixel * static_cast<std::size_t>(left),
                    picture->GetRow(y + origin.y) + pixel * static_cast<std::size_t>(left + origin.x),
                    pixel * static_cast<std::size_t>(right - left));
    }
    return placed;
}

void WeaveFields(HostPicture& upper, const HostPicture& lower) {
    const std::size_t bytes = static_cast<std::size_t>(upper.width) * Vellum::BytesPerPixel(upper.format);
    for (std::int32_t y = 1; y < upper.height; y += 2) std::memcpy(upper.GetRow(y), lower.GetRow(y), bytes);
}

namespace {

void LayByteRowOverBlack(std::uint8_t* row, std::int32_t width) {
    // Most rows of most films have nothing transparent in them, and that is soon known.
    std::uint32_t common = 0xFFFFFFFF;
    for (std::int32_t x = 0; x < width; ++x) {
        std::uint32_t word = 0;
        std::memcpy(&word, row + 4 * static_cast<std::ptrdiff_t>(x), sizeof word);
        common &= word;
    }
    if (common >> 24 == 255) return;
    for (std::int32_t x = 0; x < width; ++x) {
        const unsigned alpha = row[4 * x + 3];
        for (int c = 0; c < 3; ++c) row[4 * x + c] = static_cast<std::uint8_t>((row[4 * x + c] * alpha + 127U) / 255U);
        row[4 * x + 3] = 255;
    }
}

void LayFloatRowOverBlack(float* row, std::int32_t width) {
    for (std::int32_t x = 0; x < width; ++x) {
        const float alpha = row[4 * x + 3];
        for (int c = 0; c < 3; ++c) row[4 * x + c] *= alpha;
        row[4 * x + 3] = 1.0F;
    }
}

void MakeRowOpaque(HostPicture& picture, std::int32_t y) {
    if (Vellum::BytesPerPixel(picture.format) == 4) {
        auto* row = reinterpret_cast<std::uint8_t*>(picture.GetRow(y));
        for (std::int32_t x = 0; x < picture.width; ++x) row[4 * x + 3] = 255;
    } else {
        auto* row = reinterpret_cast<float*>(picture.GetRow(y));
        for (std::int32_t x = 0; x < picture.width; ++x) row[4 * x + 3] = 1.0F;
    }
}

}  // namespace

void LayOverBlack(HostPicture& picture) {
    const bool opaque = IsOpaque(picture);
    for (std::int32_t y = 0; y < picture.height; ++y) {
        if (opaque) {
            MakeRowOpaque(picture, y);
        } else if (Vellum::BytesPerPixel(picture.format) == 4) {
            LayByteRowOverBlack(reinterpret_cast<std::uint8_t*>(picture.GetRow(y)), picture.width);
        } else {
            LayFloatRowOverBlack(reinterpret_cast<float*>(picture.GetRow(y)), picture.width);
        }
    }
    picture.alphaType = Vellum::kAlphaType_None;
}

}  // namespace Vantrel::Host
