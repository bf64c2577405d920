// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/MediaResolver.h"

#include <algorithm>
#include <filesystem>
#include <limits>
#include <utility>

#include "Host/Snapshot/ContentHasher.h"
#include "Host/Snapshot/TrackLayout.h"
#include "Marl/BinaryData.h"

namespace Vantrel::Host {
namespace {

constexpr std::int64_t kEndless = std::numeric_limits<std::int64_t>::max();

/// Everything that a frame of the media depends on, so that an edited file or another size is another clip.
Guid IdentityOf(const MediaInfo& info, const MediaSource& source) {
    ContentHasher hasher;
    hasher.Number(static_cast<std::int64_t>(source.index()));
    hasher.Text(info.identity.path).Number(info.identity.sizeBytes).Number(info.identity.modified);
    hasher.Number(info.identity.streamIndex).Number(info.width).Number(info.height).Number(info.rotation);
    hasher.Number(info.pixelAspectNumerator).Number(info.pixelAspectDenominator).Number(info.ticksPerFrame);
    hasher.Number(info.frameCount).Number(static_cast<std::int64_t>(info.fieldType)).Number(info.still);
    if (const auto* images = std::get_if<ImageSequenceSource>(&source)) {
        hasher.Text(images->images.PathOf(0)).Text(images->images.PathOf(1));
        hasher.Number(static_cast<std::int64_t>(images->images.missing));
    }
    if (const auto* title = std::get_if<TitleSource>(&source)) {
        const Title& t = title->title;
        hasher.Text(t.text).Text(t.font).Real(t.size).Number(t.align);
        for (const double component : t.color) hasher.Real(component);
        for (const double coordinate : t.position) hasher.Real(coordinate);
    }
    if (const auto* solid = std::get_if<SolidSource>(&source)) {
        for (const double component : solid->color) hasher.Real(component);
    }
    if (const auto* filter = std::get_if<FilterSource>(&source)) hasher.Text(filter->filter);
    if (const auto* nested = std::get_if<NestedSource>(&source)) hasher.Identifier(nested->sequence->plain.hash);
    return hasher.Finish();
}

std::int64_t CountFiles(const ImageSequence& images) {
    std::int64_t count = 0;
    while (std::filesystem::exists(images.PathOf(count))) ++count;
    return std::max<std::int64_t>(count, 1);
}

/// Where media begin in the item's own time: as the file says it, and else at its own timecode if the item uses that.
std::int64_t StartOf(const Item& clip, const MediaInfo& info) {
    if (clip.media.availableRange) return clip.media.availableRange->start;
    const bool usesTimecode = info.startTimecode && clip.sourceRange && clip.sourceRange->start >= *info.startTimecode;
    return usesTimecode ? *info.startTimecode : 0;
}

}  // namespace

MediaInfo InfoOfFormat(const SequenceFormat& format) {
    MediaInfo info;
    info.width = format.width;
    info.height = format.height;
    info.pixelAspectNumerator = format.aspectNumerator;
    info.pixelAspectDenominator = format.aspectDenominator;
    info.ticksPerFrame = format.frameTicks;
    info.alphaType = AlphaType::kStraight;
    return info;
}

MediaClipPtr MediaResolver::Register(const MediaInfo& info, const MediaSource& source) {
    return mIdentities.Clip(IdentityOf(info, source), info, source);
}

MediaProbeResult MediaResolver::ProbeFile(const std::string& path) {
    const auto known = mProbed.find(path);
    if (known != mProbed.end()) return known->second;
    return mProbed.emplace(path, mProbe.ProbeFile(path)).first->second;
}

std::vector<std::string> MediaResolver::CandidatesFor(const Item& clip) const {
    namespace fs = std::filesystem;
    std::vector<std::string> candidates;
    if (!clip.media.file.empty()) candidates.push_back(clip.media.file);
    for (const std::string& root : mOptions.mediaRoots) {
        if (!clip.media.file.empty()) {
            candidates.push_back((fs::path(root) / fs::path(clip.media.file).filename()).string());
            continue;
        }
        if (clip.name.empty()) continue;
        std::vector<std::string> named;
        std::error_code ignored;
        for (const fs::directory_entry& entry : fs::directory_iterator(root, ignored)) {
            if (entry.path().stem() == clip.name) named.push_back(entry.path().string());
        }
        std::sort(named.begin(), named.end());
        candidates.insert(candidates.end(), named.begin(), named.end());
    }
    return candidates;
}

std::optional<MediaResolver::Opened> MediaResolver::OpenImages(const Item& clip, std::string& reason) {
    namespace fs = std::filesystem;
    std::vector<std::string> directories{clip.media.images.directory};
    for (const std::string& root : mOptions.mediaRoots) directories.push_back((fs::path(root) / "").string());
    for (const std::string& directory : directories) {
        ImageSequence images = clip.media.images;
        images.directory = directory;
        const MediaProbeResult first = ProbeFile(images.PathOf(0));
        if (!first.info) {
            if (reason.empty()) reason = first.error;
            continue;
        }
        if (images.frameCount == 0) images.frameCount = CountFiles(images);
        MediaInfo info = *first.info;
        info.still = images.frameCount == 1;
        info.ticksPerFrame = clip.media.ticksPerImage;
        info.frameCount = images.frameCount;
        return Opened{info, ImageSequenceSource{images}, images.PathOf(0)};
    }
    return std::nullopt;
}

std::optional<MediaResolver::Opened> MediaResolver::Open(const Item& clip, std::string& reason) {
    const MediaReference& media = clip.media;
    if (media.kind == ReferenceKind::kImageSequence) return OpenImages(clip, reason);
    for (const std::string& candidate : CandidatesFor(clip)) {
        const MediaProbeResult result = ProbeFile(candidate);
        if (!result.info) {
            if (reason.empty()) reason = result.error;
            continue;
        }
        MediaInfo info = *result.info;
        const bool oneFrame = media.availableRange && media.availableRange->duration == media.availableFrameTicks;
        if (oneFrame && !info.still) {
            info.still = true;
            info.frameCount = 1;
            info.fieldType = FieldType::kProgressive;
        }
        return Opened{info, FileSource{candidate}, candidate};
    }
    if (reason.empty()) reason = "the file holds no reference to media";
    return std::nullopt;
}

std::optional<MediaInfo> MediaResolver::FindInfo(const Item& clip) {
    if (clip.media.kind == ReferenceKind::kGenerator) return std::nullopt;
    std::string reason;
    const auto opened = Open(clip, reason);
    return opened ? std::optional<MediaInfo>(opened->info) : std::nullopt;
}

ResolvedMedia MediaResolver::Offline(const Item& clip, const SequenceFormat& format, const std::string& reason) {
    MediaInfo info = InfoOfFormat(format);
    info.alphaType = AlphaType::kNone;
    info.frameCount = kEndless;
    // The slate shows the name, so that it is a part of what the frames depend on.
    info.identity.path = clip.media.file + "|" + clip.name;
    ResolvedMedia resolved;
    resolved.clip = Register(info, OfflineSource{reason});
    resolved.start = clip.media.availableRange ? clip.media.availableRange->start : 0;
    resolved.offline = true;
    resolved.instance = clip.media.file;
    const std::string line = clip.media.path + ": \"" + clip.name + "\": " + reason;
    if (mKnownOffline.insert(line).second) mOffline.push_back(line);
    return resolved;
}

ResolvedMedia MediaResolver::Generator(const Item& clip, const SequenceFormat& format) {
    const MediaReference& media = clip.media;
    MediaInfo info = InfoOfFormat(format);
    info.still = true;
    info.identity.path = media.generator;
    ResolvedMedia resolved;
    resolved.start = media.availableRange ? media.availableRange->start : 0;
    if (media.generator == "black") {
        resolved.instance = "1112293707";
        resolved.clip = Register(info, SolidSource{{0, 0, 0, 1}});
    } else if (media.generator == "color") {
        resolved.instance = "1129270354";
        resolved.opaqueData =
            Marl::EncodeBinaryDataToUTF8String({media.color[0], media.color[1], media.color[2], 0, 0, 0, 0, 0});
        constexpr double kWhite = 255.0;
        resolved.clip =
            Register(info, SolidSource{{media.color[0] / kWhite, media.color[1] / kWhite, media.color[2] / kWhite, 1}});
    } else if (media.generator == "transparent") {
        resolved.instance = "1414680150";
        resolved.clip = Register(info, SolidSource{});
    } else if (media.generator == "SMPTEBars") {
        resolved.instance = "1111577171";
        resolved.clip = Register(info, BarsSource{});
    } else if (media.generator == "title") {
        resolved.hasClipID = true;
        resolved.clip = Register(info, TitleSource{media.title});
    } else {
        const MediaProbeResult result =
            mProbe.ProbeFilterSource(media.filterSource, format.width, format.height, format.frameTicks);
        if (!result.info) return Offline(clip, format, result.error);
        resolved.hasClipID = true;
        resolved.instance = media.filterSource;
        resolved.clip = Register(*result.info, FilterSource{media.filterSource});
    }
    return resolved;
}

ResolvedMedia MediaResolver::Resolve(const Item& clip, const SequenceFormat& format) {
    if (clip.media.kind == ReferenceKind::kGenerator) return Generator(clip, format);
    std::string reason;
    auto opened = Open(clip, reason);
    if (!opened) return Offline(clip, format, reason);
    if (mFirstSubType == 0) mFirstSubType = opened->info.codecTag;
    if (opened->info.still || opened->info.ticksPerFrame <= 0) opened->info.ticksPerFrame = format.frameTicks;
    ResolvedMedia resolved;
    resolved.start = StartOf(clip, opened->info);
    resolved.clip = Register(opened->info, opened->source);
    resolved.instance = opened->path;
    resolved.hasClipID = true;
    return resolved;
}

MediaClipPtr MediaResolver::VirtualClip(const SequencePtr& sequence) {
    MediaInfo info = InfoOfFormat(sequence->format);
    info.identity.path = "sequence " + sequence->path;
    info.frameCount = std::max<std::int64_t>(1, (sequence->length + info.ticksPerFrame - 1) / info.ticksPerFrame);
    info.fieldType = sequence->format.fieldType;
    return Register(info, NestedSource{sequence});
}

}  // namespace Vantrel::Host
