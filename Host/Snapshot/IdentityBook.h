// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>

#include "Host/Snapshot/Node.h"

namespace Vantrel::Host {

/// Numbers that must stay the same from one snapshot to the next while the program runs. All calls may come from
/// several threads at once.
class IdentityBook {
public:
    /// From 1 up; the top sequence, of which the path is empty, is always 1.
    [[nodiscard]] std::uint32_t TimelineID(const std::string& path);
    /// Of an effect instance, from 1 up.
    [[nodiscard]] std::uint32_t InstanceID(const std::string& path);
    /// The clip of a media record. Equal identities give the same clip while anybody holds it, and the same id for
    /// ever.
    /// @param identity of everything that a frame of the clip depends on
    [[nodiscard]] MediaClipPtr Clip(const Guid& identity, const MediaInfo& info, const MediaSource& source);
    /// Null for an unknown id, and for one that no snapshot or node holds any more.
    [[nodiscard]] MediaClipPtr FindClip(std::uint32_t clipID) const;

private:
    struct ClipEntry {
        std::uint32_t id = 0;
        std::weak_ptr<const MediaClip> clip;
    };

    // Held for a look-up only; never together with another lock.
    mutable std::mutex mMutex;
    std::map<std::string, std::uint32_t> mTimelines{{"", 1}};
    std::map<std::string, std::uint32_t> mInstances;
    std::unordered_map<Guid, ClipEntry> mClips;
    std::map<std::uint32_t, Guid> mClipIdentities;
};

}  // namespace Vantrel::Host
