// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/MediaPictures.h"

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <utility>

#include "Host/Software/Effects/ColorBars.h"
#include "Host/Software/Effects/Convert.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/TextPictures.h"

namespace Vantrel::Host::Software {

namespace {

constexpr std::size_t kStillBytes = std::size_t{128} << 20;
constexpr std::size_t kRestingFilters = 8;

constexpr Pixel kOpaqueBlack{0, 0, 0, 1};

Picture Filled(const MediaInfo& info, const Pixel& color) {
    Picture picture(info.width, info.height);
    Fill(picture, 0, 0, info.width, info.height, color);
    return picture;
}

bool Exists(const std::string& path) {
    std::error_code ignored;
    return std::filesystem::exists(path, ignored);
}

/// The picture of the last image before a missing one, else of the first one after it.
std::string FindNeighbour(const ImageSequence& images, std::int64_t frame) {
    for (std::int64_t i = frame - 1; i >= 0; --i) {
        if (Exists(images.PathOf(i))) return images.PathOf(i);
    }
    for (std::int64_t i = frame + 1; i < images.frameCount; ++i) {
        if (Exists(images.PathOf(i))) return images.PathOf(i);
    }
    throw MediaError(images.PathOf(frame) + " is missing, as is every other image of its sequence");
}

}  // namespace

std::shared_ptr<HostPicture> ToHostPicture(PixelBufferPool& pool, const Picture& picture, Vellum::PixelFormat format) {
    auto result = MakeHostPicture(pool, format, picture.width, picture.height);
    if (format == Vellum::kPixelFormat_BGRA_4444_8u) {
        WritePicture8(picture, result->pixels.get(), result->rowBytes);
        return result;
    }
    for (int y = 0; y < picture.height; ++y) {
        std::memcpy(result->GetRow(y), picture.At(0, y), static_cast<std::size_t>(picture.width) * 4 * sizeof(float));
    }
    return result;
}

MediaPictures::MediaPictures(std::shared_ptr<PixelBufferPool> pool, std::shared_ptr<MediaReader> reader,
                             SequenceRenderer renderSequence)
    : mPool(std::move(pool)),
      mReader(std::move(reader)),
      mRenderSequence(std::move(renderSequence)),
      mStills(kStillBytes) {}

HostPictureRef MediaPictures::GetFrame(const MediaClip& clip, const std::string& name, std::int64_t frame) {
    if (!clip.info.still || clip.identity.IsNil()) return MakeFrame(clip, name, frame);
    const StillKey key{clip.identity, name};
    if (HostPictureRef known = mStills.Find(key)) return known;
    HostPictureRef picture = MakeFrame(clip, name, frame);
    mStills.Store(key, picture);
    return picture;
}

HostPictureRef MediaPictures::MakeFrame(const MediaClip& clip, const std::string& name, std::int64_t frame) {
    const MediaInfo& info = clip.info;
    frame = std::clamp<std::int64_t>(frame, 0, info.frameCount - 1);
    const auto asFloat = [this](const Picture& picture) {
        return ToHostPicture(*mPool, picture, Vellum::kPixelFormat_BGRA_4444_32f);
    };
    if (const auto* file = std::get_if<FileSource>(&clip.source)) return mReader->Read(file->path, frame);
    if (const auto* images = std::get_if<ImageSequenceSource>(&clip.source)) {
        return ReadImage(images->images, info, frame);
    }
    if (const auto* filter = std::get_if<FilterSource>(&clip.source)) return ReadFilter(filter->filter, info, frame);
    if (const auto* solid = std::get_if<SolidSource>(&clip.source)) {
        const auto& [red, green, blue, alpha] = solid->color;
        return asFloat(Filled(info, {blue, green, red, alpha}));
    }
    if (std::holds_alternative<BarsSource>(clip.source)) {
        Picture picture(info.width, info.height);
        DrawColorBars(picture);
        return asFloat(picture);
    }
    const double aspect = static_cast<double>(info.pixelAspectNumerator) / info.pixelAspectDenominator;
    if (const auto* title = std::get_if<TitleSource>(&clip.source)) {
        Picture picture(info.width, info.height);
        DrawTitle(title->title, aspect, picture);
        return asFloat(picture);
    }
    if (const auto* nested = std::get_if<NestedSource>(&clip.source)) {
        return asFloat(mRenderSequence(*nested->sequence, frame * info.ticksPerFrame));
    }
    Picture picture(info.width, info.height);
    DrawSlate(name, std::get<OfflineSource>(clip.source).reason, aspect, picture);
    return asFloat(picture);
}

HostPictureRef MediaPictures::ReadImage(const ImageSequence& images, const MediaInfo& info, std::int64_t frame) {
    std::string path = images.PathOf(frame);
    if (!Exists(path)) {
        switch (images.missing) {
            case MissingFramePolicy::kError:
                throw MediaError(path + " is missing from its image sequence");
            case MissingFramePolicy::kBlack:
                return ToHostPicture(*mPool, Filled(info, kOpaqueBlack), Vellum::kPixelFormat_BGRA_4444_8u);
            case MissingFramePolicy::kHold:
                path = FindNeighbour(images, frame);
                break;
        }
    }
    return mReader->Read(path, 0);
}

MediaPictures::OpenFilter MediaPictures::TakeFilter(const std::string& filter, const MediaInfo& info,
                                                    std::int64_t frame) {
    const std::string key = filter + "|" + std::to_string(info.width) + "x" + std::to_string(info.height) + "|" +
                            std::to_string(info.ticksPerFrame);
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        auto best = mFilters.end();
        for (auto it = mFilters.begin(); it != mFilters.end(); ++it) {
            if (it->key != key || it->position > frame) continue;
            if (best == mFilters.end() || it->position > best->position) best = it;
        }
        if (best != mFilters.end()) {
            OpenFilter taken = std::move(*best);
            mFilters.erase(best);
            return taken;
        }
    }
    AVRational rate{};
    av_reduce(&rate.num, &rate.den, Vellum::kTicksPerSecond, info.ticksPerFrame, INT32_MAX);
    OpenFilter opened;
    opened.key = key;
    opened.reader = std::make_unique<FilterSourceReader>(filter, info.width, info.height, rate);
    opened.converter = std::make_unique<PictureConverter>(mPool);
    return opened;
}

HostPictureRef MediaPictures::ReadFilter(const std::string& filter, const MediaInfo& info, std::int64_t frame) {
    OpenFilter open = TakeFilter(filter, info, frame);
    HostPictureRef picture = open.converter->Convert(*open.reader->ReadFrame(frame), 0);
    open.position = frame;
    const std::lock_guard<std::mutex> hold(mMutex);
    mFilters.push_front(std::move(open));
    if (mFilters.size() > kRestingFilters) mFilters.pop_back();
    return picture;
}

}  // namespace Vantrel::Host::Software
