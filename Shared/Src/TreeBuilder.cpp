// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/TreeBuilder.h"

#include "Ostrand/Exceptions.h"
#include "Shared/Src/VerdictFolding.h"
#include "Src/VideoNodes/VideoClipNode.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Src/VideoNodes/VideoStructureNodes.h"
#include "Src/VideoNodes/VideoTransitionNode.h"

namespace Vantrel {
namespace {

using Ostrand::Failed;
using Ostrand::kStatus_OK;

constexpr const char* kSourcePath = R"(..\..\..\Shared\Src\Timeline)";
constexpr const char* kContractMessage =
    "$$$/Halden/utility/Error/Contract/InputContractViolation=An input contract violation has occurred!";

/// Motion and opacity: the effects that every clip has.
bool IsIntrinsic(const WideString& matchName) {
    return matchName == u"TQ.XQVE Motion" || matchName == u"TQ.XQVE Opacity";
}

void CountEffect(SegmentInfo& info, const WideString& matchName, bool host) {
    if (host) {
        info.hostPart = true;
        ResetCounters(info);
    } else if (IsIntrinsic(matchName)) {
        ++info.intrinsicCount;
    } else {
        ++info.effectCount;
    }
}

/// A record for one layer of a stretch.
SegmentInfo LayerOf(const SegmentInfo& parent) {
    SegmentInfo layer;
    layer.in = parent.in;
    layer.out = parent.out;
    layer.offset = parent.offset;
    return layer;
}

VideoNodeRef InputOf(const VideoNodeRef& node, std::int32_t index) {
    return AcquireInput(node->GetTimelineID(), node->GetNodeID(), index, node->GetTimeOffset());
}

/// Gives up on a branch; whoever asked for it sees that.
Status CannotBuild(Branch& branch) {
    branch.ok = false;
    branch.tree.Reset();
    return kStatus_OK;
}

}  // namespace

RenderRequirements TreeBuilder::MakeRequirements() const {
    return {mState.rectStack.back(), mState.mRealTimeFileFPS.back().GetTicksPerFrame(), mState.aspectStack.back(),
            mState.fieldStack.back(), mState.device};
}

RenderNodeRef TreeBuilder::BuildBlackTree() {
    SegmentInfo info;
    Branch branch(info);
    static_cast<void>(BuildNode(nullptr, branch, MakeRequirements()));
    return branch.tree;
}

Status TreeBuilder::BuildSegmentTree(const VideoNodeRef& root, Branch& branch) {
    if (mState.mRealTimeFileFPS.empty()) {
        throw Ostrand::ContractException(kContractMessage, "!mRealTimeFileFPS.empty()", kSourcePath);
    }
    const Status status = BuildWithFallback(root, branch, MakeRequirements());
    return Failed(status) ? kStatus_NotBuilt : kStatus_OK;
}

Status TreeBuilder::BuildWithFallback(const VideoNodeRef& root, Branch& branch, Requirements requirements) {
    Branch attempt(branch.info, branch.host);
    const Status status = BuildNode(root, attempt, requirements);
    branch.host = attempt.host;
    if (Failed(status)) return status;

    SegmentInfo& info = branch.info;
    branch.ok = attempt.ok;
    branch.tree = attempt.tree;
    if (!branch.ok) {
        branch.tree = mState.createNode(kKey_HostSource, root, requirements, branch.host);
        branch.host = true;
        info.realTime = info.accelerated = false;
        info.hostWhole = true;
    }
    if (branch.host) {
        info.hostPart = true;
        info.realTime = info.accelerated = false;
    }
    return kStatus_OK;
}

Status TreeBuilder::BuildNode(const VideoNodeRef& node, Branch& branch, Requirements requirements) {
    if (!node) return BuildBlack(branch, requirements);
    switch (node->GetNodeType()) {
        case NodeType::kClip:
            return BuildClip(node, branch, requirements);
        case NodeType::kCompositor:
            return BuildCompositor(node, branch, requirements);
        case NodeType::kTransition:
            return BuildTransition(node, branch, requirements);
        case NodeType::kEffect:
            return BuildEffect(node, branch, requirements);
        case NodeType::kMedia:
            return BuildMedia(boost::dynamic_pointer_cast<VideoMediaNode>(node), branch, requirements);
        case NodeType::kPreview:
            return BuildPreview(boost::dynamic_pointer_cast<VideoMediaNode>(node), branch, requirements);
        case NodeType::kDisabled:
            return BuildDisabled(node, branch, requirements);
        case NodeType::kMulticam:
            return BuildMulticam(node, branch, requirements);
        case NodeType::kAdjustment:
            return BuildAdjustment(node, branch, requirements);
        case NodeType::kSolidColor:
        case NodeType::kUnknown:
            break;
    }
    return CannotBuild(branch);
}

Status TreeBuilder::BuildInput(const VideoNodeRef& node, std::int32_t index, Branch& branch,
                               Requirements requirements) {
    return BuildNode(InputOf(node, index), branch, requirements);
}

Status TreeBuilder::BuildBlack(Branch& branch, Requirements requirements) {
    branch.tree = mState.createNode(kKey_Black, nullptr, requirements, branch.host);
    if (!branch.tree) branch.ok = false;
    return kStatus_OK;
}

Status TreeBuilder::BuildClip(const VideoNodeRef& node, Branch& branch, Requirements requirements) {
    const auto clip = boost::dynamic_pointer_cast<VideoClipNode>(node);
    if (!clip || clip->GetInputCount() != 1) return CannotBuild(branch);
    const VideoMediaNodeRef media = GetClipMedia(clip);
    if (clip->GetClipSpeed() != 1.0 || clip->GetTimeRemapping()) ++branch.info.intrinsicCount;
    const std::int32_t effectCount = clip->GetOperatorCount();
    if (effectCount > 0 && !mState.isRegistered(kKey_Compositor)) return CannotBuild(branch);

    Branch source(branch.info, branch.host);
    const Status status = BuildMedia(media, source, requirements);
    branch.host = source.host;
    if (Failed(status)) return status;
    if (!source.ok) return CannotBuild(branch);

    branch.tree = source.tree;
    for (std::int32_t index = 0; index < effectCount && branch.ok; ++index) {
        AddEffect(GetEffect(clip, index), branch, requirements);
    }
    return kStatus_OK;
}

void TreeBuilder::AddEffect(const VideoEffectNodeRef& effect, Branch& branch, Requirements requirements) {
    const WideString matchName = effect ? effect->GetFilterMatchName() : WideString();
    const RenderNodeRef node =
        effect ? mState.createNode(matchName, effect, requirements, branch.host) : RenderNodeRef();
    if (!node) {
        branch.ok = false;
        return;
    }
    node->SetInput(0, branch.tree);
    CountEffect(branch.info, matchName, branch.host);
    branch.tree = node;
}

Status TreeBuilder::BuildEffect(const VideoNodeRef& description, Branch& branch, Requirements requirements) {
    const auto effect = boost::dynamic_pointer_cast<VideoEffectNode>(description);
    const WideString matchName = effect ? effect->GetFilterMatchName() : WideString();
    Branch input(branch.info);
    const RenderNodeRef node = mState.createNode(matchName, description, requirements, input.host);
    if (!node) {
        branch.host = true;
        return CannotBuild(branch);
    }
    const Status status = BuildInput(description, 0, input, requirements);
    if (Failed(status)) return status;
    if (!input.ok) return CannotBuild(branch);

    node->SetInput(0, input.tree);
    branch.tree = node;
    branch.host = branch.host || input.host;
    CountEffect(branch.info, matchName, input.host);
    return kStatus_OK;
}

Status TreeBuilder::BuildCompositor(const VideoNodeRef& compositor, Branch& branch, Requirements requirements) {
    if (!mState.isRegistered(kKey_Compositor)) return BuildSingleLayer(compositor, branch, requirements);
    const RenderNodeRef node = mState.createNode(kKey_Compositor, compositor, requirements, branch.host);
    if (!node) return CannotBuild(branch);

    const std::int32_t count = compositor->GetInputCount();
    for (std::int32_t index = 0; index < count; ++index) {
        SegmentInfo layerInfo = LayerOf(branch.info);
        Branch layer(layerInfo, branch.host);
        const Status status = BuildInput(compositor, index, layer, requirements);
        branch.host = layer.host;
        if (Failed(status)) return status;
        if (!layer.ok) return CannotBuild(branch);
        FoldIntoCompositor(branch.info, layerInfo);
        node->SetInput(static_cast<std::size_t>(index), layer.tree);
    }
    if (count > 1 || branch.info.layerCount == 0) branch.info.layerCount += count;
    branch.tree = node;
    return kStatus_OK;
}

Status TreeBuilder::BuildSingleLayer(const VideoNodeRef& compositor, Branch& branch, Requirements requirements) {
    if (compositor->GetInputCount() > 1) return CannotBuild(branch);
    const VideoNodeRef layer = InputOf(compositor, 0);
    if (!layer || layer->GetNodeType() != NodeType::kClip) return CannotBuild(branch);
    const Status status = BuildClip(layer, branch, requirements);
    if (!Failed(status) && !branch.ok) return CannotBuild(branch);
    return status;
}

Status TreeBuilder::BuildTransition(const VideoNodeRef& description, Branch& branch, Requirements requirements) {
    const auto transition = boost::dynamic_pointer_cast<VideoTransitionNode>(description);
    const WideString matchName = transition ? transition->GetTransitionMatchName() : WideString();
    bool nodeNeedsHost = false;
    const RenderNodeRef node = mState.createNode(matchName, description, requirements, nodeNeedsHost);
    if (!node) return CannotBuild(branch);

    bool host = nodeNeedsHost;
    for (const std::int32_t index : {0, 1}) {
        Branch input(branch.info);
        const Status status = BuildInput(description, index, input, requirements);
        if (Failed(status) || !input.ok) {
            branch.ok = false;
            return status;
        }
        node->SetInput(static_cast<std::size_t>(index), input.tree);
        host = host || input.host;
    }
    branch.tree = node;
    branch.host = branch.host || host;
    if (nodeNeedsHost) {
        branch.info.hostPart = true;
        ResetCounters(branch.info);
    } else {
        ++branch.info.transitionCount;
    }
    return kStatus_OK;
}

Status TreeBuilder::BuildDisabled(const VideoNodeRef& disabled, Branch& branch, Requirements requirements) {
    const RenderNodeRef node = mState.createNode(kKey_Disabled, disabled, requirements, branch.host);
    if (!node) return CannotBuild(branch);
    Branch input(branch.info, branch.host);
    const Status status = BuildInput(disabled, 0, input, requirements);
    branch.host = input.host;
    if (Failed(status)) return status;
    branch.ok = input.ok;
    if (input.tree) node->SetInput(0, input.tree);
    branch.tree = node;
    return kStatus_OK;
}

Status TreeBuilder::BuildMulticam(const VideoNodeRef& multicam, Branch& branch, Requirements requirements) {
    const RenderNodeRef node = mState.createNode(kKey_Multicam, multicam, requirements, branch.host);
    if (!node) return CannotBuild(branch);
    // Angles show as tiles of half the width.
    RenderRequirements tile = requirements;
    tile.pixelAspectRatio.numerator >>= 1;
    tile.fieldType = Vellum::kFieldType_Any;

    const std::int32_t count = multicam->GetInputCount();
    for (std::int32_t index = 0; index < count; ++index) {
        const VideoNodeRef angle = InputOf(multicam, index);
        SegmentInfo angleInfo = LayerOf(branch.info);
        Branch built(angleInfo, branch.host);
        if (angle && mState.isRegistered(kKey_NestedTimeline)) {
            const Status status = BuildNode(angle, built, tile);
            branch.host = built.host;
            if (Failed(status) || !built.ok) {
                branch.ok = false;
                return status;
            }
            FoldIntoMulticam(branch.info, angleInfo);
        } else if (angle) {
            // The host renders the angle by itself, in its own time.
            const VideoNodeRef own = AcquireInput(multicam->GetTimelineID(), multicam->GetNodeID(), index, 0);
            static_cast<void>(BuildHostSubtree(own, built, tile));
            branch.host = built.host;
            branch.ok = built.ok;
            if (!branch.ok) break;
        }
        node->SetInput(static_cast<std::size_t>(index), built.tree);
    }
    branch.tree = node;
    return kStatus_OK;
}

Status TreeBuilder::BuildAdjustment(const VideoNodeRef& description, Branch& branch, Requirements requirements) {
    const RenderNodeRef node = mState.createNode(kKey_Adjustment, description, requirements, branch.host);
    if (!node) return CannotBuild(branch);

    const VideoNodeRef stack = InputOf(description, 0);
    Branch below(branch.info, branch.host);
    Status status = stack ? BuildCompositor(stack, below, requirements) : BuildBlack(below, requirements);
    branch.host = below.host;
    if (Failed(status)) return status;
    if (!below.ok) return CannotBuild(branch);
    node->SetInput(0, below.tree);

    Branch chain(branch.info, branch.host);
    bool needsHost = false;
    status = BuildAdjustmentChain(InputOf(description, 1), chain, needsHost, requirements);
    branch.host = chain.host;
    if (Failed(status)) return status;
    if (!chain.ok) return CannotBuild(branch);
    if (needsHost) return BuildHostSubtree(description, branch, requirements);
    node->SetInput(1, chain.tree);

    const auto adjustment = boost::dynamic_pointer_cast<VideoAdjustmentNode>(description);
    if (!adjustment->GetAdjustmentMediaIsOpaque()) {
        Branch media(branch.info, branch.host);
        status = BuildInput(description, 2, media, requirements);
        branch.host = media.host;
        if (Failed(status)) return status;
        if (!media.ok) return CannotBuild(branch);
        node->SetInput(2, media.tree);
    }
    branch.tree = node;
    return kStatus_OK;
}

/// The layer's effects on its media. Stops, with `needsHost` set, at the first effect that the device can't do.
Status TreeBuilder::BuildAdjustmentChain(const VideoNodeRef& layer, Branch& chain, bool& needsHost,
                                         Requirements requirements) {
    if (!layer || layer->GetNodeType() != NodeType::kClip) return CannotBuild(chain);
    const Status status = BuildInput(layer, 0, chain, requirements);
    if (Failed(status) || !chain.ok) return status;

    const bool mediaNeedsHost = chain.host;
    chain.host = false;
    const std::int32_t effectCount = layer->GetOperatorCount();
    for (std::int32_t index = 0; index < effectCount && chain.ok && !needsHost; ++index) {
        AddEffect(GetEffect(layer, index), chain, requirements);
        needsHost = chain.host;
    }
    chain.host = mediaNeedsHost;
    return kStatus_OK;
}

Status TreeBuilder::BuildHostSubtree(const VideoNodeRef& node, Branch& branch, Requirements requirements) {
    branch.ok = true;
    branch.host = false;
    branch.tree = mState.createNode(kKey_HostSubtree, node, requirements, branch.host);
    if (!branch.tree) {
        branch.ok = false;
        branch.host = true;
    }
    return kStatus_OK;
}

}  // namespace Vantrel
