// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <utility>

#include <boost/function.hpp>
#include <boost/shared_ptr.hpp>

#include "Marl/IVideoFrame.h"
#include "Ostrand/CriticalSection.h"

namespace Vantrel {

using Halden::utility::Guid;
using Marl::IVideoFrame;
using Marl::VideoFrameRef;
using Ostrand::InterfaceRef;
using Ostrand::Status;

class IRenderNode;

/// One render request's frames, memo, log and outstanding work. The host makes one per request and keeps it until the
/// frame is done. Thread safe, but for the pending requests, which only the thread of the request walk touches.
///
/// The completion function runs once, on whatever thread ends the last asynchronous piece. The host counts the piece of
/// RenderSystem::PrepareRender itself: it sets `outstanding` to 1 when it sets the completion.
class RenderResults {
public:
    RenderResults() = default;
    explicit RenderResults(boost::function<void()> completion, std::uint32_t outstanding = 1)
        : mHasCompletion(!completion.empty()), mOutstanding(outstanding), mCompletion(std::move(completion)) {}

    /// Answered by FindPendingRequest for a fingerprint without a request.
    static constexpr Status kStatus_NoRequest = static_cast<Status>(0x80000000);

    [[nodiscard]] VideoFrameRef FindFrame(const Guid& hash) const;
    /// Keeps the frame, which may be empty, unless one stands under that fingerprint already.
    void StoreFrame(const Guid& hash, const VideoFrameRef& frame);
    void RemoveFrame(const Guid& hash);

    /// 0 and the id of the host request in flight, or kStatus_NoRequest.
    [[nodiscard]] Status FindPendingRequest(const Guid& hash, std::uint32_t& id) const;
    void AddPendingRequest(const Guid& hash, std::uint32_t id);

    [[nodiscard]] bool FindHash(const IRenderNode* node, std::int64_t time, Guid& hash) const;
    void StoreHash(const IRenderNode* node, std::int64_t time, const Guid& hash);

    /// Puts text before the log, once per fingerprint.
    void AppendLog(const Guid& hash, const std::string& text);
    [[nodiscard]] std::string GetLog() const;

    /// The input frame that a multicam node marks as the one on air.
    [[nodiscard]] VideoFrameRef GetSelectedFrame() const;
    void SetSelectedFrame(const VideoFrameRef& frame);

    /// Has a host render of this request delivered nothing?
    [[nodiscard]] bool HasFailed() const { return mFailed != 0; }
    void SetFailed() { mFailed = 1; }

    /// Without a completion function both do nothing.
    void BeginAsyncPiece();
    void EndAsyncPiece();
    [[nodiscard]] std::uint32_t GetOutstanding() const { return mOutstanding; }

private:
    mutable Ostrand::CriticalSection mLock{"RenderResults"};
    VideoFrameRef mSelectedFrame;
    std::map<Guid, VideoFrameRef> mFrames;
    std::map<Guid, std::uint32_t> mPendingRequests;
    std::map<std::pair<const IRenderNode*, std::int64_t>, Guid> mHashes;
    std::atomic<std::uint32_t> mFailed{0};
    std::set<Guid> mLoggedFrames;
    std::string mLog;
    /// Falls once, by whoever then runs the completion; a render may begin pieces meanwhile.
    std::atomic<bool> mHasCompletion{false};
    std::atomic<std::uint32_t> mOutstanding{0};
    boost::function<void()> mCompletion;
};

using RenderResultsRef = boost::shared_ptr<RenderResults>;

// Written here because a host links three functions of the engine and nothing else. The lock is held for the
// container's work only.

inline VideoFrameRef RenderResults::FindFrame(const Guid& hash) const {
    const Ostrand::ScopedLock lock(mLock);
    const auto found = mFrames.find(hash);
    return found == mFrames.end() ? VideoFrameRef() : found->second;
}

inline void RenderResults::StoreFrame(const Guid& hash, const VideoFrameRef& frame) {
    const Ostrand::ScopedLock lock(mLock);
    mFrames.emplace(hash, frame);
}

inline void RenderResults::RemoveFrame(const Guid& hash) {
    VideoFrameRef last;  // ends behind the lock: a frame's end may be long
    const Ostrand::ScopedLock lock(mLock);
    const auto found = mFrames.find(hash);
    if (found == mFrames.end()) return;
    last.Swap(found->second);
    mFrames.erase(found);
}

inline Status RenderResults::FindPendingRequest(const Guid& hash, std::uint32_t& id) const {
    const auto found = mPendingRequests.find(hash);
    if (found == mPendingRequests.end() || found->second == 0) return kStatus_NoRequest;
    id = found->second;
    return Ostrand::kStatus_OK;
}

inline void RenderResults::AddPendingRequest(const Guid& hash, std::uint32_t id) { mPendingRequests[hash] = id; }

inline bool RenderResults::FindHash(const IRenderNode* node, std::int64_t time, Guid& hash) const {
    const Ostrand::ScopedLock lock(mLock);
    const auto found = mHashes.find({node, time});
    if (found == mHashes.end()) return false;
    hash = found->second;
    return true;
}

inline void RenderResults::StoreHash(const IRenderNode* node, std::int64_t time, const Guid& hash) {
    const Ostrand::ScopedLock lock(mLock);
    mHashes[{node, time}] = hash;
}

inline void RenderResults::AppendLog(const Guid& hash, const std::string& text) {
    const Ostrand::ScopedLock lock(mLock);
    if (mLoggedFrames.insert(hash).second) mLog.insert(0, text);
}

inline std::string RenderResults::GetLog() const {
    const Ostrand::ScopedLock lock(mLock);
    return mLog;
}

inline VideoFrameRef RenderResults::GetSelectedFrame() const {
    const Ostrand::ScopedLock lock(mLock);
    return mSelectedFrame;
}

inline void RenderResults::SetSelectedFrame(const VideoFrameRef& frame) {
    VideoFrameRef selected(frame);
    const Ostrand::ScopedLock lock(mLock);
    mSelectedFrame.Swap(selected);
}

inline void RenderResults::BeginAsyncPiece() {
    if (mHasCompletion) ++mOutstanding;
}

inline void RenderResults::EndAsyncPiece() {
    if (!mHasCompletion || --mOutstanding != 0 || !mHasCompletion.exchange(false)) return;
    boost::function<void()> completion;
    completion.swap(mCompletion);
    completion();
}

}  // namespace Vantrel
