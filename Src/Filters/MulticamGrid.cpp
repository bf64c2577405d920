// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/MulticamGrid.h"

#include "Kiln/FrameOperations.h"
#include "Src/Nodes/FrameBuffer.h"
#include "Tarn/Multicam.h"

namespace Vantrel {
namespace {

using Marl::VideoFrameRef;
using Ostrand::Failed;
using Ostrand::kStatus_OK;
using Ostrand::Status;
using Vellum::Rect;

constexpr std::int32_t kBorder = 2;
constexpr Kiln::float4 kRecordingColor{0.0F, 0.0F, 1.0F, 1.0F};
constexpr Kiln::float4 kSelectedColor{0.0F, 1.0F, 1.0F, 1.0F};

/// The picture that tiles are drawn into.
class Monitor {
public:
    Monitor(const Kiln::DeviceRef& device, const VideoFrameRef& output, Vellum::RenderQuality quality)
        : mDevice(device),
          mBuffer(FrameBuffer::Demand(output)),
          mAspect(output->GetPixelAspectRatio()),
          mQuality(quality) {}

    [[nodiscard]] std::int32_t Width() const { return mBuffer.Width(); }
    [[nodiscard]] std::int32_t Height() const { return mBuffer.Height(); }

    [[nodiscard]] Status DrawTile(const VideoFrameRef& source, const Rect& place) const {
        const std::int32_t width = place.Width();
        const std::int32_t height = place.Height();
        if (width <= 0 || height <= 0) return kStatus_OK;
        if (!source) {
            return Kiln::FillWithOpaqueBlack(mDevice, mBuffer.data, mBuffer.rowBytes, mBuffer.format, place.left,
                                             place.top, width, height);
        }
        const FrameBuffer from = FrameBuffer::Demand(source);
        if (from.format != mBuffer.format) return Ostrand::kStatus_Failure;
        const Vellum::PixelAspectRatio aspect = source->GetPixelAspectRatio();
        const float ratio = static_cast<float>(mAspect.Value()) / static_cast<float>(aspect.Value());
        const float scaleX = static_cast<float>(width) * ratio / static_cast<float>(from.Width());
        const float scaleY = static_cast<float>(height) / static_cast<float>(from.Height());
        return Kiln::Motion(mDevice, from.data, from.rowBytes, 0, 0, from.Width(), from.Height(), aspect.numerator,
                            aspect.denominator, mBuffer.data, mBuffer.rowBytes, place.left, place.top, width, height,
                            mAspect.numerator, mAspect.denominator, mBuffer.format, 0.5F, 0.5F, 0.5F, 0.5F, scaleX,
                            scaleY, 0.0F, 1.0F, Kiln::kBlend_Normal, false, mQuality);
    }

    [[nodiscard]] Status DrawTileBorder(bool recording, const Rect& place) const {
        if (place.Width() < 3 || place.Height() < 3) return kStatus_OK;
        const std::int32_t inner = place.Width() - 2 * kBorder;
        const struct {
            std::int32_t left, top, width, height;
        } bands[] = {{place.left, place.top, kBorder, place.Height()},
                     {place.left + kBorder, place.top, inner, kBorder},
                     {place.right - kBorder, place.top, kBorder, place.Height()},
                     {place.left + kBorder, place.bottom - kBorder, inner, kBorder}};
        for (const auto& band : bands) {
            const Status status =
                Kiln::FillWithColor(mDevice, mBuffer.data, mBuffer.rowBytes, mBuffer.format, band.left, band.top,
                                    band.width, band.height, recording ? kRecordingColor : kSelectedColor);
            if (Failed(status)) return status;
        }
        return kStatus_OK;
    }

    /// From that column on.
    [[nodiscard]] Status Clear(std::int32_t left) const {
        return Kiln::FillWithTransparentBlack(mDevice, mBuffer.data, mBuffer.rowBytes, mBuffer.format, left, 0,
                                              Width() - left, Height());
    }

private:
    const Kiln::DeviceRef& mDevice;
    FrameBuffer mBuffer;
    Vellum::PixelAspectRatio mAspect;
    Vellum::RenderQuality mQuality;
};

Status DrawGrid(const Monitor& monitor, const std::vector<VideoFrameRef>& cameras, std::int32_t width, bool hasSelected,
                const MulticamLook& look) {
    const auto count = static_cast<std::int32_t>(cameras.size());
    const std::int32_t factor = Tarn::GetMulticamDownsampleFactor(count);
    const auto placeOf = [&](std::int32_t index) {
        return Tarn::GetMulticamBoundsBoundsForTrackIndex(index, width, monitor.Height(), factor);
    };
    for (std::int32_t i = 0; i < count; ++i) {
        const Status status = monitor.DrawTile(cameras[static_cast<std::size_t>(i)], placeOf(i));
        if (Failed(status)) return status;
    }
    return hasSelected ? monitor.DrawTileBorder(look.recording, placeOf(look.selected)) : kStatus_OK;
}

}  // namespace

Status DrawMulticamGrid(const Kiln::DeviceRef& device, const std::vector<VideoFrameRef>& cameras,
                        const VideoFrameRef& output, const MulticamLook& look, Vellum::RenderQuality quality) {
    const Monitor monitor(device, output, quality);
    const std::int32_t width = look.showProgram ? monitor.Width() / 2 : monitor.Width();
    const auto selected = static_cast<std::size_t>(look.selected);
    const bool hasSelected = look.selected >= 0 && selected < cameras.size();

    Status status = look.isNonMulticam ? monitor.DrawTile(cameras.at(0), {0, 0, width, monitor.Height()})
                                       : DrawGrid(monitor, cameras, width, hasSelected, look);
    if (Failed(status) || !look.showProgram) return status;
    // Two halves leave an odd picture's last column over, and without a programme the right one stays empty.
    const std::int32_t reached = hasSelected ? 2 * width : width;
    if (reached < monitor.Width()) status = monitor.Clear(reached);
    if (Failed(status) || !hasSelected) return status;
    return monitor.DrawTile(cameras[selected], {width, 0, 2 * width, monitor.Height()});
}

}  // namespace Vantrel
