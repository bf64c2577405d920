// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "Host/Render/ISoftwareRenderer.h"
#include "Host/Render/PictureCache.h"
#include "Host/Render/WorkerPool.h"
#include "Host/Suites/HostServices.h"

namespace Vantrel::Host {

/// The host's side of renders: the render suite and the two Glaze suites. The suites' entries are plain functions, so
/// there is one of it at a time; while there is none, they refuse.
///
/// Each accepted request gets its callback exactly once, from one of the pool's threads and with no lock held, perhaps
/// before the request has returned.
class RenderService {
public:
    /// Offers the suites. `services` and `renderer` outlive it.
    RenderService(HostServices& services, ISoftwareRenderer& renderer, unsigned threads);
    /// Cancels what is queued, waits for what is running.
    ~RenderService();
    RenderService(const RenderService&) = delete;
    RenderService& operator=(const RenderService&) = delete;

    /// Waits until no request is under way.
    void Drain() { mPool.Drain(); }

    /// What went wrong with requests, each text once, in order.
    [[nodiscard]] std::vector<std::string> GetFailures() const;
    [[nodiscard]] std::int64_t GetRenderedClips() const { return mRenderedClips; }
    [[nodiscard]] std::int64_t GetRenderedSubtrees() const { return mRenderedSubtrees; }

private:
    struct Entries;
    using HashText = std::array<char, 37>;
    using ClipFrameKey = std::tuple<std::uint32_t, std::int64_t, std::uint64_t>;
    /// Makes a picture and says under which text it is to be cached.
    using Render = std::function<HostPictureRef(HashText& cacheText)>;

    std::uint32_t Submit(std::int64_t time, Render render, VantrelRenderCallback callback, void* context,
                         std::atomic<std::int64_t>& counter);
    [[nodiscard]] HostPictureRef RenderClipFrame(const MediaClip& clip, std::int64_t frame, Vellum::PixelFormat format);
    void NoteFailure(const std::string& text);

    HostServices& mServices;
    ISoftwareRenderer& mRenderer;
    PictureCache<ClipFrameKey> mDecoded;
    PictureCache<HashText> mFinished;
    std::atomic<std::int64_t> mRenderedClips{0};
    std::atomic<std::int64_t> mRenderedSubtrees{0};
    mutable std::mutex mFailureMutex;
    std::set<std::string> mKnownFailures;
    std::vector<std::string> mFailures;
    WorkerPool mPool;  // last: its threads use all of the above
};

}  // namespace Vantrel::Host
