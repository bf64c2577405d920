// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/FilterNode.h"

#include "Kiln/Frames.h"
#include "Ostrand/QueryTable.h"
#include "Src/Nodes/FindEffectNode.h"
#include "Src/Nodes/FinishedInputs.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/VideoNodes/VideoEffectNode.h"
#include "Src/VideoNodes/VideoTransitionNode.h"

namespace Vantrel {
namespace {

constexpr std::uint32_t kLevel_KeepHostFrames = 2;
constexpr std::uint32_t kLevel_KeepUploads = 3;
constexpr std::uint64_t kAllBytes = ~std::uint64_t{0};

/// Milliseconds below which a node isn't worth a line.
constexpr double kLeastReportedMs = 0.01;

}  // namespace

Status FilterNode::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out).Answer<FilterNode>().Otherwise<RenderNodeBase>();
}

void FilterNode::SetInput(std::size_t index, const RenderNodeRef& node) {
    RenderNodeBase::SetInput(index, mWrapInputs ? WrapInput(node) : node);
}

RenderNodeRef FilterNode::WrapInput(const RenderNodeRef& node) {
    const FilterNodeRef filter = Ostrand::Query<FilterNode>(node);
    if (!filter || filter->GetName() == u"BlackVideoSource" || FindEffectNode(filter, u"TQ.XQVE Motion") ||
        FindEffectNode(filter, u"MulticamRenderNode")) {
        return node;
    }
    RenderNodeRef wrapper = MakeIntrinsicNode();
    wrapper->SetInput(0, node);
    bool host = false;
    wrapper->Configure(filter->GetDescription(), GetRequirements(), host);
    return wrapper;
}

WideString FilterNode::GetName() {
    if (!mName.empty()) return mName;
    if (const auto* effect = dynamic_cast<const VideoEffectNode*>(mDescription.get())) {
        mName = effect->GetFilterMatchName();
    } else if (const auto* transition = dynamic_cast<const VideoTransitionNode*>(mDescription.get())) {
        mName = transition->GetTransitionMatchName();
    }
    return mName;
}

bool FilterNode::IsCacheable() const {
    return mCaching && !(mDescription && mDescription->GetNodeType() == NodeType::kDisabled);
}

bool FilterNode::IsStill() const {
    if (!mDescription || !mDescription->IsStill()) return false;
    const VideoMediaNodeRef media = GetMediaDescription();
    return media && media->IsStill();
}

VideoFrameRef FilterNode::FindCachedFrame(const Guid& hash, const RenderResultsRef& results) const {
    if (hash.IsNil()) return {};
    const auto hashOf = [](const VideoFrameRef& frame) {
        return Ostrand::Demand<Marl::IFrameIdentity>(frame)->GetHash();
    };
    // A frame that was rendered further in place, or placed anew, carries another fingerprint by now, or none where the
    // node that did so has none.
    VideoFrameRef stored = results->FindFrame(hash);
    if (stored && hashOf(stored) == hash) return stored;
    VideoFrameRef cached = mDevice->GetDeviceMemory()->GetFrameCache().FindFrame(hash);
    if (cached && hashOf(cached) != hash) cached.Reset();
    return cached;
}

Status FilterNode::RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                               VideoFrameRef& frame) {
    const bool cacheable = IsCacheable();
    const Guid hash = cacheable ? GetFrameHash(params, results) : Guid();
    VideoFrameRef result = FindCachedFrame(hash, results);
    Status status = Ostrand::kStatus_OK;
    if (!result) status = RenderMissing(token, params, results, cacheable, result);
    if (!Ostrand::Failed(status) && cacheable) KeepFrame(hash, results, result);
    if (Ostrand::Failed(status)) result.Reset();
    frame = result;
    return status;
}

Status FilterNode::RenderMissing(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                 bool cacheable, VideoFrameRef& frame) {
    VideoFrameRef input;
    if (!cacheable || !mSelfRendering) {
        const Status status = RenderNodeBase::RenderFrame(token, params, results, input);
        if (Ostrand::Failed(status)) return status;
        if (!cacheable && input) {
            frame = input;
            return status;
        }
    }
    // The slot is empty between calls, also when Render throws.
    struct SlotScope {
        VideoFrameRef& slot;
        ~SlotScope() { slot.Reset(); }
    } const scope{mFrameSlot};
    mFrameSlot.Swap(input);
    const Status status = RenderTimed(token, params, results);
    if (!Ostrand::Failed(status)) frame = mFrameSlot;
    return status;
}

Status FilterNode::RenderTimed(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    mRenderTime = 0.0F;
    const Kiln::TimingMarkRef start = mSelfRendering ? Kiln::TimingMarkRef() : MarkWhenTiming();
    const auto render = [&] { return Render(token, params, results); };
    const Status status = mSelfRendering ? render() : TryWithPurge(token, params, results, render);
    if (!Ostrand::Failed(status)) MakeRoom(token, params, results);
    if (start) mRenderTime = start->ElapsedMs(*mDevice->GetCommands()->CreateMark());
    return status;
}

void FilterNode::KeepFrame(const Guid& hash, const RenderResultsRef& results, const VideoFrameRef& frame) {
    Ostrand::Demand<Marl::IFrameIdentity>(frame)->SetHash(hash);
    if (hash.IsNil()) return;
    results->StoreFrame(hash, frame);
    // Only stills outlive the request: a moving picture's frame won't be asked for again soon.
    if (IsStill()) mDevice->GetDeviceMemory()->GetFrameCache().CacheFrame(hash, frame);
}

Status FilterNode::EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                            std::uint32_t level) {
    if (IsCacheable()) results->RemoveFrame(GetFrameHash(params, results));
    mCaching = true;
    return RenderNodeBase::EndFrame(token, params, results, level);
}

Status FilterNode::RenderInput(const RenderNodeRef& input, const RenderToken& token, const RenderParams& params,
                               const RenderResultsRef& results, VideoFrameRef& frame) {
    const auto render = [&] {
        const FinishedInputs::BusyScope busy(input.Get());
        return TryWithPurge(token, params, results, [&] { return input->RenderFrame(token, params, results, frame); });
    };
    const Status status = render();
    if (!Ostrand::Failed(status)) FinishedInputs::Append(input, token, params, results);
    return status;
}

Kiln::TimingMarkRef FilterNode::MarkWhenTiming() const {
    return mDevice && mDevice->IsTimingEnabled() ? mDevice->GetCommands()->CreateMark() : Kiln::TimingMarkRef();
}

void FilterNode::Purge(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    while (FinishedInputs::Release(kLevel_KeepHostFrames)) {
    }
    FinishedInputs::Clear();
    // Not the inputs themselves: the caller may be using their frames.
    VisitInputs([&](IRenderNode& input, std::size_t) {
        const auto base = Ostrand::Query<RenderNodeBase>(&input);
        if (!base) return;
        for (std::size_t index = 0; index < base->GetInputCount(); ++index) {
            const RenderNodeRef below = base->GetInput(index);
            if (below) below->EndFrame(token, params, results, kLevel_KeepHostFrames);
        }
    });
    mDevice->GetDeviceMemory()->ReleaseUnused(kAllBytes);
    mDevice->GetHostMemory()->ReleaseUnused(kAllBytes);
}

void FilterNode::MakeRoom(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    Kiln::MemoryManager& memory = *mDevice->GetDeviceMemory();
    const std::uint64_t need = 2 * Vellum::PixelFormatSize(Kiln::kPixelFormat_GPU_BGRA_4444_32f,
                                                           params.outputRect.Width(), params.outputRect.Height());
    const Kiln::MemoryFigures limits = memory.GetFigures();
    std::uint64_t wanted = need + limits.bytesInUse;
    const auto refresh = [&] { wanted = need + memory.GetFigures().bytesInUse; };
    const auto releaseFinished = [&](std::uint64_t limit, std::uint32_t level) {
        while (wanted > limit && FinishedInputs::Release(level)) refresh();
    };
    const auto endInputs = [&](std::uint64_t limit, std::uint32_t level) {
        VisitInputs([&](IRenderNode& input, std::size_t) {
            if (wanted <= limit) return;
            input.EndFrame(token, params, results, level);
            refresh();
        });
    };

    releaseFinished(limits.gentleLimit, kLevel_KeepUploads);
    endInputs(limits.gentleLimit, kLevel_KeepUploads);
    if (wanted > limits.hardLimit) {
        memory.GetFrameCache().Purge(wanted - limits.hardLimit);
        refresh();
    }
    releaseFinished(limits.hardLimit, kLevel_KeepHostFrames);
    endInputs(limits.hardLimit, kLevel_KeepHostFrames);
}

void FilterNode::WriteTimings(std::ostream& stream) {
    if (static_cast<double>(mRenderTime) > kLeastReportedMs) {
        const WideString name = GetName();
        if (!name.empty()) stream << Halden::ToUTF8(name) << ": " << mRenderTime << "ms" << '\n';
    }
    VisitInputs([&](IRenderNode& input, std::size_t) {
        if (const auto filter = Ostrand::Query<FilterNode>(&input)) filter->WriteTimings(stream);
    });
}

}  // namespace Vantrel
