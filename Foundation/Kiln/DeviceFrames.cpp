// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Backend.h"
#include "Kiln/FrameCopies.h"
#include "Kiln/FrameObject.h"
#include "Kiln/Operations/Common.h"
#include "Kiln/Scratch.h"

namespace Kiln {
namespace {

class DeviceFrame final : public FrameObject<IDeviceFrame, IOpaqueFill> {
public:
    DeviceFrame(const FrameAttributes& attributes, const DeviceRef& device)
        : FrameObject(attributes), mBlock(device, attributes.GetBytes()) {}

    std::uint64_t GetData() const override { return mBlock.GetHandle(); }
    const DeviceRef& GetDevice() const override { return mBlock.GetDevice(); }

    // White and opaque is the number 1 throughout, so that plain memory can be filled with it.
    Status FillOpaque() override {
        constexpr std::uint32_t kOneAsFloat = 0x3F800000;
        constexpr std::uint32_t kOneAsTwoHalves = 0x3C003C00;
        if (!IsRenderFormat(mAttributes.format)) return Ostrand::kStatus_Failure;
        const bool isFloat = mAttributes.format == kPixelFormat_GPU_BGRA_4444_32f;
        const std::uint32_t pattern = isFloat ? kOneAsFloat : kOneAsTwoHalves;
        return GetDevice()->GetBackend().Fill(GetData(), 0, pattern, mAttributes.GetBytes());
    }

private:
    DeviceScratchBuffer mBlock;
};

VideoFrameRef MakeDeviceFrame(const FrameAttributes& attributes, const DeviceRef& device) {
    const Ostrand::InterfaceRef<DeviceFrame> frame(new DeviceFrame(attributes, device));
    if (frame->GetData() == 0) return {};
    return frame;
}

}  // namespace

Status CreateGPUVideoFrame(VideoFrameRef& out, const DeviceRef& device, Vellum::PixelFormat format, std::int32_t width,
                           std::int32_t height, Vellum::PixelAspectRatio aspect, std::uint32_t fieldType,
                           Vellum::Point origin) {
    out.Reset();
    FrameAttributes attributes;
    const bool isMask = format == Vellum::kPixelFormat_BGRA_4444_8u;
    if (!device || !(IsRenderFormat(format) || isMask) || !DescribeFrame(format, width, height, attributes)) {
        return Ostrand::kStatus_Failure;
    }
    attributes.aspect = aspect;
    attributes.fieldType = fieldType;
    attributes.origin = origin;
    out = MakeDeviceFrame(attributes, device);
    return out ? Ostrand::kStatus_OK : Ostrand::kStatus_OutOfMemory;
}

VideoFrameRef CreateSimilarFrame(const VideoFrameRef& frame) {
    const auto deviceFrame = Ostrand::Query<IDeviceFrame>(frame);
    return deviceFrame ? MakeDeviceFrame(GetAttributes(frame), deviceFrame->GetDevice()) : VideoFrameRef();
}

bool IsDeviceFrame(const VideoFrameRef& frame) { return static_cast<bool>(Ostrand::Query<IDeviceFrame>(frame)); }

VideoFrameRef CopyToDevice(const VideoFrameRef& uploadFrame) {
    const auto upload = Ostrand::Query<IUploadFrame>(uploadFrame);
    if (!upload) return {};
    const FrameAttributes attributes = GetAttributes(uploadFrame);
    const VideoFrameRef frame = MakeDeviceFrame(attributes, upload->GetUploadDevice());
    if (!frame) return {};
    // The pool keeps the host frame's memory from others until the copy has run, also when the frame goes before that.
    const Status status = upload->GetUploadDevice()->GetBackend().CopyToDevice(
        ViewDeviceFrame(frame).data, 0, GetHostPixels(uploadFrame), attributes.GetBytes());
    return Ostrand::Failed(status) ? VideoFrameRef() : frame;
}

DeviceFrameView ViewDeviceFrame(const VideoFrameRef& frame) {
    DeviceFrameView view;
    const auto deviceFrame = Ostrand::Query<IDeviceFrame>(frame);
    if (!deviceFrame) return view;
    view.device = deviceFrame->GetDevice();
    view.data = Ostrand::Demand<Marl::IFrameData>(frame)->GetData();
    view.rowBytes = Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes();
    view.width = frame->GetBounds().Width();
    view.height = frame->GetBounds().Height();
    view.format = frame->GetPixelFormat();
    return view;
}

Status CopyEqualFrame(const VideoFrameRef& source, const VideoFrameRef& target) {
    const DeviceFrameView from = ViewDeviceFrame(source);
    const DeviceFrameView to = ViewDeviceFrame(target);
    if (!from.device || from.device != to.device || from.width != to.width || from.height != to.height ||
        from.format != to.format) {
        return Ostrand::kStatus_Failure;
    }
    if (from.data == to.data) return Ostrand::kStatus_OK;
    const auto rows = static_cast<std::uint64_t>(from.height);
    const auto rowBytes = static_cast<std::uint64_t>(from.rowBytes);
    if (from.rowBytes == to.rowBytes) {
        return from.device->GetBackend().CopyRows(to.data, {0, rowBytes}, from.data, {0, rowBytes}, rowBytes, rows);
    }
    const std::uint64_t widthBytes = static_cast<std::uint64_t>(from.width) * Vellum::BytesPerPixel(from.format);
    return from.device->GetBackend().CopyRows(to.data, {0, static_cast<std::uint64_t>(to.rowBytes)}, from.data,
                                              {0, rowBytes}, widthBytes, rows);
}

}  // namespace Kiln
