// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Frames.h"
#include "Ostrand/Allocated.h"

namespace Kiln {

/// What every frame carries besides its pixels.
struct FrameAttributes {
    Vellum::PixelFormat format;
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::int32_t rowBytes = 0;
    Vellum::PixelAspectRatio aspect;
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    std::uint32_t alphaType = Vellum::kAlphaType_Straight;
    Vellum::Point origin;

    [[nodiscard]] std::uint64_t GetBytes() const {
        return static_cast<std::uint64_t>(rowBytes) * static_cast<std::uint64_t>(height);
    }
};

/// Attributes for a new picture, with its row bytes and the alpha type that the format implies. False when the size
/// isn't positive or a row is longer than 2 GB.
[[nodiscard]] bool DescribeFrame(Vellum::PixelFormat format, std::int32_t width, std::int32_t height,
                                 FrameAttributes& out);
/// The attributes of a frame of any kind.
[[nodiscard]] FrameAttributes GetAttributes(const VideoFrameRef& frame);
/// The address of a host frame's first row.
[[nodiscard]] std::uint8_t* GetHostPixels(const VideoFrameRef& frame);

/// A frame that AllocateHostFrameForUpload made.
class IUploadFrame : public Ostrand::OstrandUnknown {
public:
    static constexpr Marl::Guid kInterfaceID{
        0x1F0C7A9B, 0x44E2, 0x4D0D, {0x9C, 0x61, 0x7B, 0x0E, 0xD2, 0x35, 0x8A, 0x4F}};
    [[nodiscard]] virtual const DeviceRef& GetUploadDevice() const = 0;
};

/// The shared part of frames: counting, attributes, rows and fingerprint. The derived class owns the pixels and answers
/// GetData; `Further` are the interfaces that it has besides.
template <class... Further>
class FrameObject : public IVideoFrame,
                    public Marl::IFrameData,
                    public Marl::IFrameRows,
                    public Marl::IFrameIdentity,
                    public Further...,
                    public Ostrand::Allocated<FrameObject<Further...>> {
public:
    explicit FrameObject(const FrameAttributes& attributes) : mAttributes(attributes) {}

    void AddRef() override { ++this->mRefCount; }
    void Release() override {
        if (--this->mRefCount == 0) delete this;
    }
    Status QueryInterface(const Marl::Guid& iid, void** out) override {
        *out = nullptr;
        Offer<IVideoFrame>(iid, out);
        Offer<Marl::IFrameData>(iid, out);
        Offer<Marl::IFrameRows>(iid, out);
        Offer<Marl::IFrameIdentity>(iid, out);
        (Offer<Further>(iid, out), ...);
        if (!*out) return Ostrand::kStatus_NoInterface;
        AddRef();
        return Ostrand::kStatus_OK;
    }

    Vellum::Rect GetBounds() const override { return {0, 0, mAttributes.width, mAttributes.height}; }
    Vellum::Point GetOrigin() const override { return mAttributes.origin; }
    void SetOrigin(Vellum::Point origin) override { mAttributes.origin = origin; }
    Vellum::PixelFormat GetPixelFormat() const override { return mAttributes.format; }
    Vellum::PixelAspectRatio GetPixelAspectRatio() const override { return mAttributes.aspect; }
    void SetPixelAspectRatio(Vellum::PixelAspectRatio aspect) override { mAttributes.aspect = aspect; }
    std::uint32_t GetFieldType() const override { return mAttributes.fieldType; }
    void SetFieldType(std::uint32_t fieldType) override { mAttributes.fieldType = fieldType; }
    std::uint32_t GetAlphaType() const override { return mAttributes.alphaType; }
    void SetAlphaType(std::uint32_t alphaType) override { mAttributes.alphaType = alphaType; }
    std::int32_t GetRowBytes() const override { return mAttributes.rowBytes; }
    Marl::Guid GetHash() const override { return mHash; }
    void SetHash(const Marl::Guid& hash) override { mHash = hash; }

protected:
    FrameAttributes mAttributes;

private:
    template <class Interface>
    void Offer(const Marl::Guid& iid, void** out) {
        if (iid == Interface::kInterfaceID) *out = static_cast<Interface*>(this);
    }

    Marl::Guid mHash;
};

}  // namespace Kiln
