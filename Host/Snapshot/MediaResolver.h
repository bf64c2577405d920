// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "Host/Snapshot/Snapshot.h"

namespace Vantrel::Host {

struct ResolvedMedia {
    MediaClipPtr clip;
    /// The item's own time at which the media start.
    std::int64_t start = 0;
    bool offline = false;
    /// Path, or the code of a generator that the engine draws itself; empty if neither.
    std::string instance;
    /// Base64; only of the generators that need it.
    std::string opaqueData;
    /// The engine asks the host for the frames.
    bool hasClipID = false;
};

/// Finds and probes media, each file once.
class MediaResolver {
public:
    MediaResolver(const SnapshotOptions& options, IMediaProbe& probe, IdentityBook& identities)
        : mOptions(options), mProbe(probe), mIdentities(identities) {}

    [[nodiscard]] ResolvedMedia Resolve(const Item& clip, const SequenceFormat& format);
    /// What a file says of its size and rate, before any format is known; empty for generators and what can't be
    /// opened.
    [[nodiscard]] std::optional<MediaInfo> FindInfo(const Item& clip);
    /// A clip of frames that the host makes from a sequence.
    [[nodiscard]] MediaClipPtr VirtualClip(const SequencePtr& sequence);
    [[nodiscard]] MediaProbeResult ProbeFile(const std::string& path);
    /// The clip of a media record.
    [[nodiscard]] MediaClipPtr Register(const MediaInfo& info, const MediaSource& source);

    /// Media that couldn't be opened, each once.
    [[nodiscard]] const std::vector<std::string>& GetOffline() const { return mOffline; }
    [[nodiscard]] std::uint32_t GetFirstSubType() const { return mFirstSubType; }

private:
    struct Opened {
        MediaInfo info;
        MediaSource source;
        std::string path;
    };

    [[nodiscard]] std::optional<Opened> Open(const Item& clip, std::string& reason);
    [[nodiscard]] std::optional<Opened> OpenImages(const Item& clip, std::string& reason);
    [[nodiscard]] std::vector<std::string> CandidatesFor(const Item& clip) const;
    [[nodiscard]] ResolvedMedia Offline(const Item& clip, const SequenceFormat& format, const std::string& reason);
    [[nodiscard]] ResolvedMedia Generator(const Item& clip, const SequenceFormat& format);

    const SnapshotOptions& mOptions;
    IMediaProbe& mProbe;
    IdentityBook& mIdentities;
    std::map<std::string, MediaProbeResult> mProbed;
    std::vector<std::string> mOffline;
    std::set<std::string> mKnownOffline;
    std::uint32_t mFirstSubType = 0;
};

/// Media of a format, as generators, titles, slates and nested sequences have them.
[[nodiscard]] MediaInfo InfoOfFormat(const SequenceFormat& format);

}  // namespace Vantrel::Host
