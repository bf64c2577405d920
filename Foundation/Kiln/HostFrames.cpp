// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cstring>
#include <utility>

#include "Kiln/FrameObject.h"
#include "Kiln/Pages.h"
#include "Kiln/ParallelRows.h"
#include "Kiln/Resample.h"
#include "Kiln/Scratch.h"

namespace Kiln {
namespace {

class HostFrame final : public FrameObject<> {
public:
    HostFrame(const FrameAttributes& attributes, Pages pages) : FrameObject(attributes), mPages(std::move(pages)) {}
    std::uint64_t GetData() const override { return reinterpret_cast<std::uint64_t>(mPages.get()); }

private:
    Pages mPages;
};

class UploadFrame final : public FrameObject<IUploadFrame> {
public:
    UploadFrame(const FrameAttributes& attributes, const DeviceRef& device)
        : FrameObject(attributes), mBlock(device, attributes.GetBytes()) {}
    std::uint64_t GetData() const override { return reinterpret_cast<std::uint64_t>(mBlock.GetBlock()); }
    const DeviceRef& GetUploadDevice() const override { return mBlock.GetDevice(); }

private:
    ScopedRecordedHostMemory mBlock;
};

void CopyRowsOnHost(const FrameAttributes& to, std::uint8_t* target, const FrameAttributes& from,
                    const std::uint8_t* source) {
    const std::size_t widthBytes = static_cast<std::size_t>(from.width) * Vellum::BytesPerPixel(from.format);
    ForEachBand(from.height, 2 * widthBytes, 1, [&](std::int32_t first, std::int32_t last) {
        for (std::ptrdiff_t row = first; row < last; ++row) {
            std::memcpy(target + row * to.rowBytes, source + row * from.rowBytes, widthBytes);
        }
    });
}

}  // namespace

VideoFrameRef AllocateHostFrameForUpload(const DeviceRef& device, const VideoFrameRef& hostFrame,
                                         Vellum::RenderQuality /*quality*/, const Vellum::Rect& rect) {
    if (!device || !hostFrame || IsDeviceFrame(hostFrame)) return {};
    const FrameAttributes source = GetAttributes(hostFrame);
    const bool keepsSize = rect == Vellum::Rect();
    FrameAttributes attributes;
    if (!DescribeFrame(source.format, keepsSize ? source.width : rect.Width(),
                       keepsSize ? source.height : rect.Height(), attributes)) {
        return {};
    }
    attributes.aspect = source.aspect;
    attributes.fieldType = source.fieldType;
    attributes.alphaType = source.alphaType;
    attributes.origin = source.origin;
    const Ostrand::InterfaceRef<UploadFrame> frame(new UploadFrame(attributes, device));
    if (frame->GetData() == 0) return {};
    return frame;
}

VideoFrameRef CreateHostVideoFrame(Vellum::PixelFormat format, std::int32_t width, std::int32_t height,
                                   Vellum::PixelAspectRatio aspect, std::uint32_t fieldType, Vellum::Point origin) {
    FrameAttributes attributes;
    if (!DescribeFrame(format, width, height, attributes)) return {};
    attributes.aspect = aspect;
    attributes.fieldType = fieldType;
    attributes.origin = origin;
    Pages pages = AllocatePages(attributes.GetBytes());
    return pages ? VideoFrameRef(new HostFrame(attributes, std::move(pages))) : VideoFrameRef();
}

Status CopyToHostFrame(const VideoFrameRef& target, const VideoFrameRef& source, Vellum::RenderQuality quality) {
    if (!target || !source || IsDeviceFrame(target) || IsDeviceFrame(source)) return Ostrand::kStatus_Failure;
    const FrameAttributes to = GetAttributes(target);
    const FrameAttributes from = GetAttributes(source);
    if (to.format != from.format) return Ostrand::kStatus_Failure;
    if (to.width == from.width && to.height == from.height) {
        CopyRowsOnHost(to, GetHostPixels(target), from, GetHostPixels(source));
        return Ostrand::kStatus_OK;
    }
    return ResampleOnHost(to, GetHostPixels(target), from, GetHostPixels(source), quality);
}

}  // namespace Kiln
