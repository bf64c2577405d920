// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/IdentityBook.h"

namespace Vantrel::Host {
namespace {

std::uint32_t NumberOf(std::map<std::string, std::uint32_t>& numbers, const std::string& path) {
    return numbers.try_emplace(path, static_cast<std::uint32_t>(numbers.size() + 1)).first->second;
}

}  // namespace

std::uint32_t IdentityBook::TimelineID(const std::string& path) {
    const std::lock_guard<std::mutex> lock(mMutex);
    return NumberOf(mTimelines, path);
}

std::uint32_t IdentityBook::InstanceID(const std::string& path) {
    const std::lock_guard<std::mutex> lock(mMutex);
    return NumberOf(mInstances, path);
}

MediaClipPtr IdentityBook::Clip(const Guid& identity, const MediaInfo& info, const MediaSource& source) {
    auto made = std::make_shared<MediaClip>(MediaClip{0, info, source, identity});
    const std::lock_guard<std::mutex> lock(mMutex);
    ClipEntry& entry = mClips[identity];
    if (entry.id == 0) {
        entry.id = static_cast<std::uint32_t>(mClips.size());
        mClipIdentities.emplace(entry.id, identity);
    }
    if (MediaClipPtr known = entry.clip.lock()) return known;
    made->id = entry.id;
    entry.clip = made;
    return made;
}

MediaClipPtr IdentityBook::FindClip(std::uint32_t clipID) const {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto identity = mClipIdentities.find(clipID);
    return identity == mClipIdentities.end() ? nullptr : mClips.at(identity->second).clip.lock();
}

}  // namespace Vantrel::Host
