// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/MediaLayers.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "Host/Snapshot/Fingerprint.h"
#include "Host/Software/Effects/Convert.h"
#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Resample.h"
#include "Host/Time/ExactTime.h"

namespace Vantrel::Host::Software {

namespace {

Vellum::PixelAspectRatio AspectOf(const MediaInfo& info) {
    return {info.pixelAspectNumerator, info.pixelAspectDenominator};
}

std::int32_t Rounded(double size) { return std::max(1, static_cast<std::int32_t>(size + 0.5)); }

/// The media's size in pixels of the request. Fit takes the factor with which all of the picture is in the frame, fill
/// the one with which it leaves nothing of the frame free, stretch each direction's own.
MediaLayers::Size LayerSize(const MediaInfo& info, ScalePolicy policy, const View& view) {
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

Picture ScaledTo(Picture picture, const MediaLayers::Size& size, Vellum::RenderQuality quality) {
    if (picture.width == size.width && picture.height == size.height) return picture;
    Picture scaled(size.width, size.height);
    Resample(picture, scaled, static_cast<double>(size.width) / picture.width,
             static_cast<double>(size.height) / picture.height, quality);
    return scaled;
}

/// Whether the first of a frame's fields, by the order that the media claim, is the one that is shown last.
bool ExchangesFields(const MediaDetail& detail) { return detail.reverseFieldDominance != detail.backwards; }

/// Whether the lines of the fields change places, because the sequence has them the other way round. A picture that is
/// reduced is resampled anyway, which leaves nothing of its lines.
bool PutsFieldsInOrder(const MediaDetail& detail, const View& view) {
    const FieldType fields = detail.GetFieldType();
    if (fields == FieldType::kProgressive || !Vellum::IsInterlaced(view.fieldType)) return false;
    const bool reduced = detail.scale != ScalePolicy::kNone && view.sequenceHeight < detail.clip->info.height;
    const bool upperFirst = (fields == FieldType::kTopFirst) != ExchangesFields(detail);
    return !reduced && upperFirst != (view.fieldType == Vellum::kFieldType_UpperFirst);
}

Marl::StreamTiming TimingOf(const MediaDetail& detail) {
    const Vellum::FrameRate frameRate = Vellum::FrameRate::Create(detail.clip->info.ticksPerFrame);
    const bool fields = detail.GetFieldType() != FieldType::kProgressive && !detail.deinterlace;
    return {frameRate, fields ? frameRate.Faster(2) : frameRate, detail.speed, detail.backwards};
}

}  // namespace

Picture MediaLayers::ReadFrame(const MediaDetail& detail, std::int64_t frame, std::uint32_t selection) {
    const HostPictureRef source = mPictures.GetFrame(*detail.clip, detail.name, frame);
    std::uint32_t alpha = source->alphaType;
    if (detail.alpha == AlphaChoice::kIgnore) alpha = Vellum::kAlphaType_None;
    Picture picture =
        ReadPicture(source->pixels.get(), source->rowBytes, source->width, source->height, source->format, alpha);
    const bool premultiplied =
        detail.alpha == AlphaChoice::kPremultiplied ||
        (detail.alpha == AlphaChoice::kAsMedia && detail.clip->info.alphaType == AlphaType::kPremultiplied);
    if (premultiplied) Unpremultiply(picture, detail.clip->info.alphaMatteColor);
    if (detail.alpha == AlphaChoice::kInvert) {
        for (std::size_t i = 3; i < picture.pixels.size(); i += 4) picture.pixels[i] = 1.0F - picture.pixels[i];
    }
    const FieldType fields = detail.GetFieldType();
    if (fields == FieldType::kProgressive || selection == Vellum::kFieldSelection_Frame) return picture;
    const bool lowerFirst = (fields == FieldType::kBottomFirst) != ExchangesFields(detail);
    Deinterlace(picture, lowerFirst == (selection == Vellum::kFieldSelection_First) ? 1 : 0);
    return picture;
}

Picture MediaLayers::RenderExact(const MediaDetail& detail, const Marl::TimeSample& sample, std::uint32_t selection,
                                 const View& view) {
    const auto* nested = std::get_if<NestedSource>(&detail.clip->source);
    Picture picture = nested && detail.clip->id == 0
                          ? mRenderNested(*nested->sequence, sample.time, selection)
                          : ReadFrame(detail, MediaFrameAt(detail.clip->info, sample.frameTime), selection);
    if (PutsFieldsInOrder(detail, view)) ReverseFields(picture);
    return picture;
}

Picture MediaLayers::Sum(const MediaDetail& detail, const std::vector<Marl::TimeSample>& samples, const Size& size,
                         const View& view) {
    std::vector<Picture> pictures;
    std::vector<double> weights;
    for (const Marl::TimeSample& sample : samples) {
        const std::uint32_t selection =
            sample.time == sample.frameTime ? Vellum::kFieldSelection_First : Vellum::kFieldSelection_Second;
        pictures.push_back(ScaledTo(RenderExact(detail, sample, selection, view), size, view.Quality()));
        weights.push_back(sample.weight);
    }
    return pictures.size() == 1 ? std::move(pictures.front()) : WeightedSum(pictures, weights);
}

Picture MediaLayers::Show(const Node& media, std::int64_t mediaTime, const Size& size, const View& view) {
    const MediaDetail& detail = *media.AsMedia();
    if (!detail.samplesTime) {
        std::uint32_t selection = view.fieldSelection;
        const std::int64_t fieldTicks = Vellum::HalfFrameTicks(detail.clip->info.ticksPerFrame);
        if (detail.held) selection = static_cast<std::uint32_t>(FrameNumberAt(mediaTime, fieldTicks)) & 1U;
        return ScaledTo(RenderExact(detail, {mediaTime, mediaTime}, selection, view), size, view.Quality());
    }
    const Vellum::FrameRate frameRate = Vellum::FrameRate::Create(view.frameTicks);
    const Marl::StreamTiming timing = TimingOf(detail);
    const bool interlaced = Vellum::IsInterlaced(view.fieldType);
    const Marl::SampledOutput output{frameRate, interlaced ? frameRate.Faster(2) : frameRate,
                                     detail.frameBlend && view.quality >= 2};
    Picture picture = Sum(detail, Marl::SampleMoment(mediaTime, timing, output), size, view);
    if (!interlaced || view.fieldSelection != Vellum::kFieldSelection_Frame) return picture;
    const std::int64_t laterTime = media.LaterTime(mediaTime, output.pictureRate.GetTicksPerFrame());
    const Picture later = Sum(detail, Marl::SampleMoment(laterTime, timing, output), size, view);
    WeaveField(picture, later, view.fieldType == Vellum::kFieldType_UpperFirst);
    return picture;
}

LayerPicture MediaLayers::Render(const Node& media, std::int64_t mediaTime, const View& view) {
    const MediaDetail& detail = *media.AsMedia();
    const MediaInfo& info = detail.clip->info;
    const Size size = LayerSize(info, detail.scale, view);
    LayerPicture layer;
    layer.picture = Show(media, mediaTime, size, view);
    layer.aspect = AspectOf(info);
    layer.origin = {(size.width - Rounded(view.sequenceWidth / view.ScaleX())) / 2,
                    (size.height - Rounded(view.sequenceHeight / view.ScaleY())) / 2};
    layer.mediaWidth = size.width;
    layer.mediaHeight = size.height;
    layer.mediaAspect = layer.aspect;
    return layer;
}

}  // namespace Vantrel::Host::Software
