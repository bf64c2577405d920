// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/InterfaceRef.h"
#include "Vellum/Field.h"
#include "Vellum/Geometry.h"
#include "Vellum/PixelFormat.h"

namespace Marl {

using Halden::utility::Guid;
using Vellum::kPixelFormat_BGRA_4444_8u;
using Vellum::kPixelFormat_Invalid;

/// A picture, in host or in device memory. Rows run from top to bottom. Colour is BGRA; device frames have straight
/// alpha, host frames what GetAlphaType says.
///
/// Attributes are plain fields: whoever sets one is the only one who uses the frame at that time. Pixels are reached
/// through IFrameData and IFrameRows, which every frame answers.
class IVideoFrame : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{0x5D6F0C3B, 0x2A41, 0x4E0E, {0x9B, 0x77, 0x31, 0xC4, 0x0A, 0x5E, 0x8D, 0x12}};

    /// The picture's rectangle, with left and top 0.
    [[nodiscard]] virtual Vellum::Rect GetBounds() const = 0;
    /// Where the corner of the frame that it will be part of lies in this picture, in pixels: above 0 for a picture
    /// that is larger than the frame, below 0 for a smaller one, (0, 0) for a finished one.
    [[nodiscard]] virtual Vellum::Point GetOrigin() const = 0;
    virtual void SetOrigin(Vellum::Point origin) = 0;
    [[nodiscard]] virtual Vellum::PixelFormat GetPixelFormat() const = 0;
    [[nodiscard]] virtual Vellum::PixelAspectRatio GetPixelAspectRatio() const = 0;
    virtual void SetPixelAspectRatio(Vellum::PixelAspectRatio aspect) = 0;
    [[nodiscard]] virtual std::uint32_t GetFieldType() const = 0;
    virtual void SetFieldType(std::uint32_t fieldType) = 0;
    /// One of Vellum's kAlphaType values.
    [[nodiscard]] virtual std::uint32_t GetAlphaType() const = 0;
    virtual void SetAlphaType(std::uint32_t alphaType) = 0;
};

using VideoFrameRef = Ostrand::InterfaceRef<IVideoFrame>;

/// A frame's memory.
class IFrameData : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{0x689AC22C, 0x6831, 0x4C8D, {0xB1, 0xFD, 0x0D, 0x65, 0x4D, 0xC9, 0x65, 0xBB}};

    /// For a device frame its device memory, an opaque value that only kernels and copies take; for a host frame the
    /// address of the first row.
    [[nodiscard]] virtual std::uint64_t GetData() const = 0;
};

/// A frame's rows.
class IFrameRows : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{0x282D21CF, 0xD8DA, 0x4E4F, {0x82, 0xBE, 0x6E, 0x9C, 0x17, 0x6C, 0xA7, 0x96}};

    /// Bytes from one row to the next; at least a row's own size.
    [[nodiscard]] virtual std::int32_t GetRowBytes() const = 0;
};

/// The fingerprint that a device frame carries.
class IFrameIdentity : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{0xCF026861, 0xA969, 0x4B32, {0x9A, 0x5A, 0x34, 0x91, 0x96, 0xDB, 0xA5, 0x91}};

    [[nodiscard]] virtual Guid GetHash() const = 0;
    virtual void SetHash(const Guid& hash) = 0;
};

}  // namespace Marl
