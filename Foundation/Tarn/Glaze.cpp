// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tarn/Glaze.h"

#include <memory>

#include "Ostrand/QueryTable.h"

namespace Tarn {

namespace {

using Ostrand::Guid;
using Ostrand::Status;

using StorageRef = std::unique_ptr<void, void (*)(void*)>;

StorageRef Retain(const Glaze& glaze) {
    glaze.retainStorage(glaze.storage);
    return {glaze.storage, glaze.releaseStorage};
}

/// A host's picture as a frame.
class GlazeFrame final : public Ostrand::Counted<GlazeFrame, Marl::IVideoFrame, Marl::IFrameData, Marl::IFrameRows> {
public:
    GlazeFrame(const Glaze& glaze, Vellum::PixelFormat format)
        : mStorage(Retain(glaze)),
          mPixels(glaze.pixels),
          mRowBytes(glaze.rowBytes),
          mBounds{0, 0, glaze.width, glaze.height},
          mOrigin{glaze.originX, glaze.originY},
          mFormat(format),
          mAspect{glaze.aspectNumerator, glaze.aspectDenominator},
          mFieldType(glaze.fieldType),
          mAlphaType(glaze.alphaType) {}

    Status QueryInterface(const Guid& iid, void** out) override {
        return Ostrand::QueryTable(this, iid, out)
            .Answer<Marl::IVideoFrame>()
            .Answer<Marl::IFrameData>()
            .Answer<Marl::IFrameRows>()
            .Result();
    }

    Vellum::Rect GetBounds() const override { return mBounds; }
    Vellum::Point GetOrigin() const override { return mOrigin; }
    void SetOrigin(Vellum::Point origin) override { mOrigin = origin; }
    Vellum::PixelFormat GetPixelFormat() const override { return mFormat; }
    Vellum::PixelAspectRatio GetPixelAspectRatio() const override { return mAspect; }
    void SetPixelAspectRatio(Vellum::PixelAspectRatio aspect) override { mAspect = aspect; }
    std::uint32_t GetFieldType() const override { return mFieldType; }
    void SetFieldType(std::uint32_t fieldType) override { mFieldType = fieldType; }
    std::uint32_t GetAlphaType() const override { return mAlphaType; }
    void SetAlphaType(std::uint32_t alphaType) override { mAlphaType = alphaType; }

    std::uint64_t GetData() const override { return reinterpret_cast<std::uintptr_t>(mPixels); }
    std::int32_t GetRowBytes() const override { return mRowBytes; }

private:
    StorageRef mStorage;
    const void* mPixels;
    std::int32_t mRowBytes;
    Vellum::Rect mBounds;
    Vellum::Point mOrigin;
    Vellum::PixelFormat mFormat;
    Vellum::PixelAspectRatio mAspect;
    std::uint32_t mFieldType;
    std::uint32_t mAlphaType;
};

bool IsSound(const Glaze& glaze, Vellum::PixelFormat format) {
    if (format == Vellum::kPixelFormat_Invalid || !glaze.pixels) return false;
    if (!glaze.storage || !glaze.retainStorage || !glaze.releaseStorage) return false;
    if (glaze.width <= 0 || glaze.height <= 0 || glaze.rowBytes <= 0) return false;
    return static_cast<std::uint64_t>(glaze.rowBytes) >= Vellum::PixelFormatSize(format, glaze.width, 1);
}

}  // namespace

Marl::VideoFrameRef GetVideoFrameFromGlaze(const Glaze* glaze) {
    if (!glaze || glaze->size != sizeof(Glaze)) return {};
    const Vellum::PixelFormat format = SDKToBEPixelFormat(glaze->pixelFormat);
    if (!IsSound(*glaze, format)) return {};
    return Ostrand::MakeRef<GlazeFrame>(*glaze, format);
}

Vellum::PixelFormat SDKToBEPixelFormat(std::uint32_t code) { return Vellum::PixelFormatFromCode(code); }

}  // namespace Tarn
