// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/RenderNodeBase.h"

#include <boost/smart_ptr/shared_ptr.hpp>

#include "Ostrand/MixHash.h"
#include "Ostrand/QueryTable.h"
#include "Src/Nodes/RenderDescription.h"
#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoClipNode.h"
#include "Src/VideoNodes/VideoEffectNode.h"
#include "Src/VideoNodes/VideoNodeFactory.h"

namespace Vantrel {
namespace {

/// Where the host writes a fingerprint: its text and a terminator.
using FingerprintText = char[37];

}  // namespace

void RenderNodeBase::AddRef() { ++GetRef(); }

void RenderNodeBase::Release() {
    if (--GetRef() == 0) delete this;
}

Status RenderNodeBase::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out).Answer<RenderNodeBase>().Answer<IRenderNode>().Result();
}

void RenderNodeBase::SetInput(std::size_t index, const RenderNodeRef& node) {
    if (index >= mInputs.size()) mInputs.resize(index + 1);
    mInputs[index] = node;
}

Status RenderNodeBase::WalkPhase(const RenderParams& params, const InputCall& call) {
    return WalkInputs([&](IRenderNode& input, std::size_t) { return call(input, params); });
}

Status RenderNodeBase::RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    return WalkPhase(params, [&](IRenderNode& input, const RenderParams& wanted) {
        return input.RequestHostFrames(wanted, results);
    });
}

Status RenderNodeBase::CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    return WalkPhase(params, [&](IRenderNode& input, const RenderParams& wanted) {
        input.CancelHostFrames(wanted, results);
        return Ostrand::kStatus_OK;
    });
}

Status RenderNodeBase::BeginUpload(const RenderToken& token, const RenderParams& params,
                                   const RenderResultsRef& results, bool blocking, VideoFrameRef& frame) {
    return WalkPhase(params, [&](IRenderNode& input, const RenderParams& wanted) {
        return input.BeginUpload(token, wanted, results, blocking, frame);
    });
}

Status RenderNodeBase::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                 bool& /*host*/) {
    mFrameRect = requirements.frameRect;
    mFrameTicks = requirements.frameTicks;
    mPixelAspectRatio = requirements.pixelAspectRatio;
    mFieldType = requirements.fieldType;
    mDevice = requirements.device;
    mDescription = description;
    return Ostrand::kStatus_OK;
}

Status RenderNodeBase::FetchHostFrame(const RenderToken& token, const RenderParams& params,
                                      const RenderResultsRef& results, bool blocking, VideoFrameRef& frame) {
    return WalkPhase(params, [&](IRenderNode& input, const RenderParams& wanted) {
        return input.FetchHostFrame(token, wanted, results, blocking, frame);
    });
}

Status RenderNodeBase::RenderFrame(const RenderToken& token, const RenderParams& params,
                                   const RenderResultsRef& results, VideoFrameRef& frame) {
    return WalkInputs(
        [&](IRenderNode& input, std::size_t) { return input.RenderFrame(token, params, results, frame); });
}

Status RenderNodeBase::EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                std::uint32_t level) {
    VisitInputs([&](IRenderNode& input, std::size_t) { input.EndFrame(token, params, results, level); });
    return Ostrand::kStatus_OK;
}

Status RenderNodeBase::CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                                         const RenderResultsRef& previous) {
    return WalkPhase(params, [&](IRenderNode& input, const RenderParams& wanted) {
        return input.CollectHostFrames(wanted, results, previous);
    });
}

Guid RenderNodeBase::GetFrameHash(const RenderParams& params, const RenderResultsRef& results) {
    Guid hash;
    if (results->FindHash(this, params.time, hash)) return hash;
    if (!mDescription) return {};

    const RenderDescription wanted(params);
    const Vellum::PixelAspectRatio aspect = params.pixelAspectRatio;
    FingerprintText text = {};
    VantrelHostStatus status = 0;
    if (const auto* effect = dynamic_cast<const VideoEffectNode*>(mDescription.get())) {
        if (!effect->GetParent()) return {};
        status = VideoSegmentRenderSuite().GetOperatorsFrameHash(
            params.sequenceID, effect->GetParent()->GetNodeID(), 0, effect->GetOperatorIndex() + 1, params.time,
            GetNodeTime(params.clipTime, true), params.sequenceFrameTicks, params.sequenceRect.Width(),
            params.sequenceRect.Height(), aspect.numerator, aspect.denominator, 0, wanted.Get(), text);
    } else {
        status = VideoSegmentRenderSuite().GetNodeFrameHash(
            params.sequenceID, mDescription->GetNodeID(), params.time, GetNodeTime(params.clipTime, false),
            params.sequenceFrameTicks, params.sequenceRect.Width(), params.sequenceRect.Height(), aspect.numerator,
            aspect.denominator, wanted.Get(), text);
    }
    if (status < 0) return {};

    // A host's picture of a subtree isn't the node's own, though the host describes both with one text.
    if (HasInterface(this, kHostRenderSubtreeID)) {
        hash = Ostrand::NodeHasher().Text("SubtreeRenderNode").Bytes(text, sizeof text).Finish();
    } else {
        text[sizeof text - 1] = 0;
        hash = Guid(std::string(text));
    }
    // The query above counted up before it counted down, so whoever called still holds this node.
    results->StoreHash(this, params.time, hash);  // NOLINT(clang-analyzer-cplusplus.NewDelete)
    return hash;
}

VideoMediaNodeRef RenderNodeBase::GetMediaDescription() const {
    VideoMediaNodeRef media = boost::atomic_load(&mMediaDescription);
    if (!media && mDescription) {
        media = GetClipMedia(mDescription->GetParent());
        if (media) boost::atomic_store(&mMediaDescription, media);
    }
    return media;
}

RenderRequirements RenderNodeBase::GetRequirements() const {
    return {mFrameRect, mFrameTicks, mPixelAspectRatio, mFieldType, mDevice};
}

std::int64_t RenderNodeBase::GetNodeTime(std::int64_t time, bool raw) const {
    VideoNodeRef described = mDescription;
    if (!raw && described && described->GetNodeType() == NodeType::kEffect) {
        // An effect's keyframes lie on the time of its media, unless the media is held.
        const auto* clip = dynamic_cast<const VideoClipNode*>(described->GetParent().get());
        if (clip && !clip->HasFrameHold()) {
            if (const VideoMediaNodeRef media = GetMediaDescription()) described = media;
        }
    }
    return described ? described->ToNodeTime(time, !raw) : time;
}

}  // namespace Vantrel
