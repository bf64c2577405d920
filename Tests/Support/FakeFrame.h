// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Marl/IVideoFrame.h"
#include "Ostrand/QueryTable.h"

namespace Vantrel::Testing {

/// The attributes of a frame, for frames that tests make up.
class FrameAttributes : public Marl::IVideoFrame, public Marl::IFrameIdentity {
public:
    FrameAttributes(Vellum::Rect bounds, Vellum::PixelFormat format) : mBounds(bounds), mFormat(format) {}

    Marl::Guid GetHash() const override { return mHash; }
    void SetHash(const Marl::Guid& hash) override { mHash = hash; }
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

private:
    Vellum::Rect mBounds;
    Vellum::PixelFormat mFormat;
    Marl::Guid mHash;
    Vellum::Point mOrigin;
    Vellum::PixelAspectRatio mAspect;
    std::uint32_t mFieldType = Vellum::kFieldType_Progressive;
    std::uint32_t mAlphaType = Vellum::kAlphaType_Straight;
};

/// A device frame without pixels, told apart by its address: attributes, a fingerprint, and data and rows that lead
/// nowhere.
class FakeFrame final : public Ostrand::Counted<FakeFrame, FrameAttributes, Marl::IFrameData, Marl::IFrameRows> {
public:
    FakeFrame() : Counted(Vellum::Rect{0, 0, 64, 36}, Vellum::kPixelFormat_GPU_BGRA_4444_32f) {}
    [[nodiscard]] static Marl::VideoFrameRef Make() { return Ostrand::MakeRef<FakeFrame>(); }

    Ostrand::Status QueryInterface(const Marl::Guid& iid, void** out) override {
        return Ostrand::QueryTable(this, iid, out)
            .Answer<Marl::IVideoFrame>()
            .Answer<Marl::IFrameIdentity>()
            .Answer<Marl::IFrameData>()
            .Answer<Marl::IFrameRows>()
            .Result();
    }
    std::uint64_t GetData() const override { return 0; }
    std::int32_t GetRowBytes() const override { return GetBounds().Width() * 16; }
};

}  // namespace Vantrel::Testing
