// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/MediaLayers.h"

#include <algorithm>
#include <cstdlib>
#include <utility>
#include <vector>

#include "Host/Snapshot/Fingerprint.h"
#include "Host/Software/Effects/Convert.h"
#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Resample.h"
#include "Marl/TimeSampling.h"

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

/// The instants whose frames show what happens from a media time on, with their shares: the nearest frame, or where
/// frames are to be blended, all that one frame of the sequence covers. Fields aren't told apart.
std::vector<Marl::TimeSample> SampleTimes(const Node& media, std::int64_t mediaTime, const View& view) {
    const MediaDetail& detail = *media.AsMedia();
    const Vellum::FrameRate rate = Vellum::FrameRate::Create(detail.clip->info.ticksPerFrame);
    const bool blend = detail.frameBlend && view.quality >= 2;
    const std::string* speed = media.FindProperty("MediaNode::ClipSpeed");
    const Marl::TimeSpan span = Marl::CalculateDurationInMediaTime(
        mediaTime, Vellum::FrameRate::Create(view.frameTicks), speed ? std::strtod(speed->c_str(), nullptr) : 1.0);
    std::vector<Marl::TimeSample> samples;
    if (!detail.samplesTime) {
        samples.push_back({mediaTime, mediaTime, 0, 1.0});
        return samples;
    }
    if (blend && !Marl::IsDegenerate(span, rate)) {
        Marl::GetWeightedSamplesForRange(span, rate, rate, 0, samples);
        Marl::NormalizeSampleWeights(samples);
        return samples;
    }
    std::int64_t before = 0;
    std::int64_t after = 0;
    Marl::GetSamplesAroundTime(mediaTime, rate, blend, before, after);
    const double share = Marl::CalculateSampleWeight(mediaTime, before, after);
    if (share > 0.0) samples.push_back({before, before, 0, share});
    if (share < 1.0) samples.push_back({after, after, 0, 1.0 - share});
    return samples;
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
    if (premultiplied) Unpremultiply(picture, detail.clip->info.alphaMatteColor);
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

Picture MediaLayers::RenderExact(const MediaDetail& detail, std::int64_t mediaTime) {
    const auto* nested = std::get_if<NestedSource>(&detail.clip->source);
    if (nested && detail.clip->id == 0) return mRenderSequence(*nested->sequence, mediaTime);
    return ReadFrame(detail, MediaFrameAt(detail.clip->info, mediaTime));
}

LayerPicture MediaLayers::Render(const Node& media, std::int64_t mediaTime, const View& view) {
    const MediaDetail& detail = *media.AsMedia();
    const MediaInfo& info = detail.clip->info;
    const Size size = LayerSize(info, detail.scale, view);
    LayerPicture layer;
    std::vector<Picture> pictures;
    std::vector<double> weights;
    for (const Marl::TimeSample& sample : SampleTimes(media, mediaTime, view)) {
        pictures.push_back(ScaledTo(RenderExact(detail, sample.time), size, view.Quality()));
        weights.push_back(sample.weight);
    }
    layer.picture = pictures.size() == 1 ? std::move(pictures.front()) : WeightedSum(pictures, weights);
    layer.aspect = AspectOf(info);
    layer.origin = {(size.width - Rounded(view.sequenceWidth / view.ScaleX())) / 2,
                    (size.height - Rounded(view.sequenceHeight / view.ScaleY())) / 2};
    layer.mediaWidth = size.width;
    layer.mediaHeight = size.height;
    return layer;
}

}  // namespace Vantrel::Host::Software
