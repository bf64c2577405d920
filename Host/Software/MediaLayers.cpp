// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/MediaLayers.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "Host/Snapshot/Fingerprint.h"
#include "Host/Software/Effects/Convert.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Resample.h"

namespace Vantrel::Host::Software {

namespace {

struct Size {
    std::int32_t width = 0;
    std::int32_t height = 0;
};

Vellum::PixelAspectRatio AspectOf(const MediaInfo& info) {
    return {info.pixelAspectNumerator, info.pixelAspectDenominator};
}

std::int32_t Rounded(double size) { return std::max(1, static_cast<std::int32_t>(size + 0.5)); }

/// The media's size in pixels of the request. Fit takes the factor with which all of the picture is in the frame, fill
/// the one with which it leaves nothing of the frame free, stretch each direction's own.
Size LayerSize(const MediaInfo& info, ScalePolicy policy, const View& view) {
    double factorX = view.ScaleX();
    double factorY = view.ScaleY();
    if (policy != ScalePolicy::kNone) {
        double ratioX = info.width * (AspectOf(info).Value() / view.aspect.Value()) / view.sequenceWidth;
        double ratioY = static_cast<double>(info.height) / view.sequenceHeight;
        if (policy == ScalePolicy::kFit) ratioX = ratioY = std::max(ratioX, ratioY);
        if (policy == ScalePolicy::kFill) ratioX = ratioY = std::min(ratioX, ratioY);
        factorX *= ratioX;
        factorY *= ratioY;
    }
    return {Rounded(info.width / factorX), Rounded(info.height / factorY)};
}

Picture ScaledTo(Picture picture, Size size, Vellum::RenderQuality quality) {
    if (picture.width == size.width && picture.height == size.height) return picture;
    Picture scaled(size.width, size.height);
    Resample(picture, scaled, static_cast<double>(size.width) / picture.width,
             static_cast<double>(size.height) / picture.height, quality);
    return scaled;
}

/// The frame at whose beginning or in whose first half a time lies, or the next one.
std::int64_t NearestFrameTime(std::int64_t time, std::int64_t frameTicks) {
    const std::int64_t into = (time % frameTicks + frameTicks) % frameTicks;
    return time - into + (2 * into > frameTicks ? frameTicks : 0);
}

}  // namespace

Picture MediaLayers::ReadFrame(const MediaDetail& detail, std::int64_t frame) {
    const HostPictureRef source = mPictures.GetFrame(*detail.clip, detail.name, frame);
    std::uint32_t alpha = source->alphaType;
    if (detail.alpha == AlphaChoice::kIgnore) alpha = Vellum::kAlphaType_None;
    Picture picture =
        ReadPicture(source->pixels.get(), source->rowBytes, source->width, source->height, source->format, alpha);
    const bool premultiplied =
        detail.alpha == AlphaChoice::kPremultiplied ||
        (detail.alpha == AlphaChoice::kAsMedia && detail.clip->info.alphaType == AlphaType::kPremultiplied);
    if (premultiplied) {
        const std::uint32_t matte = detail.clip->info.alphaMatteColor;
        // Unpremultiply takes blue in the lowest byte, as the media's colour has it.
        Unpremultiply(picture, matte);
    }
    if (detail.alpha == AlphaChoice::kInvert) {
        for (std::size_t i = 3; i < picture.pixels.size(); i += 4) picture.pixels[i] = 1.0F - picture.pixels[i];
    }
    const FieldType fields = detail.clip->info.fieldType;
    if (detail.deinterlace && fields != FieldType::kProgressive) {
        const bool upperFirst = (fields == FieldType::kTopFirst) != detail.reverseFieldDominance;
        Deinterlace(picture, upperFirst ? 0 : 1);
    }
    return picture;
}

Picture MediaLayers::RenderInstant(const Node& media, std::int64_t mediaTime) {
    const MediaDetail& detail = *media.AsMedia();
    const MediaInfo& info = detail.clip->info;
    const std::int64_t time = detail.samplesTime ? NearestFrameTime(mediaTime, info.ticksPerFrame) : mediaTime;
    const auto* nested = std::get_if<NestedSource>(&detail.clip->source);
    if (nested && detail.clip->id == 0) return mRenderSequence(*nested->sequence, time);
    return ReadFrame(detail, MediaFrameAt(info, time));
}

LayerPicture MediaLayers::Render(const Node& media, std::int64_t mediaTime, const View& view) {
    const MediaDetail& detail = *media.AsMedia();
    const MediaInfo& info = detail.clip->info;
    const Size size = LayerSize(info, detail.scale, view);
    LayerPicture layer;
    layer.picture = ScaledTo(RenderInstant(media, mediaTime), size, view.Quality());
    layer.aspect = AspectOf(info);
    layer.origin = {(size.width - Rounded(view.sequenceWidth / view.ScaleX())) / 2,
                    (size.height - Rounded(view.sequenceHeight / view.ScaleY())) / 2};
    layer.mediaWidth = size.width;
    layer.mediaHeight = size.height;
    return layer;
}

}  // namespace Vantrel::Host::Software
