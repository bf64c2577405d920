// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/VideoNodes/VideoNodeFactory.h"

#include <array>
#include <utility>

#include <boost/make_shared.hpp>

#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/HostTexts.h"
#include "Src/VideoNodes/VideoClipNode.h"
#include "Src/VideoNodes/VideoStructureNodes.h"
#include "Src/VideoNodes/VideoTransitionNode.h"

namespace Vantrel {
namespace {

constexpr std::array<std::pair<const char*, NodeType>, 10> kKindTexts = {{
    {"RenderableNodeClipImpl", NodeType::kClip},
    {"RenderableNodeCompositorImpl", NodeType::kCompositor},
    {"RenderableNodeTransitionImpl", NodeType::kTransition},
    {"RenderableNodeEffectImpl", NodeType::kEffect},
    {"RenderableNodeMediaImpl", NodeType::kMedia},
    {"RenderableNodePreviewImpl", NodeType::kPreview},
    {"RenderableNodeSolidColorImpl", NodeType::kSolidColor},
    {"RenderableNodeDisabledImpl", NodeType::kDisabled},
    {"RenderableNodeMulticamImpl", NodeType::kMulticam},
    {"RenderableNode_AdjustmentImpl", NodeType::kAdjustment},
}};

/// Through the class's own allocation, which make_shared would go past.
template <class Node>
VideoNodeRef New(VideoNodeRecord record) {
    return VideoNodeRef(new Node(std::move(record)));
}

VideoNodeRef NewOfType(NodeType type, VideoNodeRecord record) {
    switch (type) {
        case NodeType::kClip:
            return New<VideoClipNode>(std::move(record));
        case NodeType::kCompositor:
            return New<VideoCompositorNode>(std::move(record));
        case NodeType::kTransition:
            return New<VideoTransitionNode>(std::move(record));
        case NodeType::kEffect:
            return New<VideoEffectNode>(std::move(record));
        case NodeType::kMedia:
            return New<VideoMediaNode>(std::move(record));
        case NodeType::kPreview: {
            const boost::shared_ptr<VideoMediaNode> preview(new VideoMediaNode(std::move(record)));
            preview->SetPreview(true);
            return preview;
        }
        case NodeType::kDisabled:
            return New<VideoDisabledNode>(std::move(record));
        case NodeType::kMulticam:
            return New<VideoMultiCamNode>(std::move(record));
        case NodeType::kAdjustment:
            return New<VideoAdjustmentNode>(std::move(record));
        case NodeType::kSolidColor:
        case NodeType::kUnknown:
            break;
    }
    return boost::make_shared<VideoNode>(std::move(record));
}

}  // namespace

VideoNodeIDOwner::~VideoNodeIDOwner() {
    const CorvaneVideoSegmentSuite* suite = mNodeID != 0 ? FindVideoSegmentSuite() : nullptr;
    if (suite) suite->ReleaseNode(mNodeID);
}

NodeType NodeTypeFromText(const std::string& kindText) {
    for (const auto& [text, type] : kKindTexts) {
        if (kindText == text) return type;
    }
    return NodeType::kUnknown;
}

VideoNodeRef MakeVideoNode(std::uint32_t timelineID, std::uint32_t nodeID, std::int64_t offset) {
    if (nodeID == 0) return {};
    VideoNodeRecord record;
    record.owner = boost::make_shared<VideoNodeIDOwner>(nodeID);
    record.timeOffset = offset;
    record.timelineID = timelineID;

    HostKindText kind{};
    HostHashText hash{};
    const bool known = VideoSegmentSuite().GetNodeInfo(nodeID, kind.data(), hash.data(), &record.flags) == 0;
    record.hash = ToGuid(hash);
    return NewOfType(known ? NodeTypeFromText(ToString(kind)) : NodeType::kUnknown, std::move(record));
}

VideoNodeRef AcquireRootNode(const VideoSegmentsHandle& handle, std::int32_t segmentIndex) {
    VideoSegment segment;
    HostHashText hash{};
    VideoSegmentSuite().GetSegmentInfo(handle.GetSegmentsID(), segmentIndex, &segment.start, &segment.end,
                                       &segment.offset, hash.data());
    std::uint32_t nodeID = 0;
    VideoSegmentSuite().AcquireSegmentNode(handle.GetSegmentsID(), hash.data(), &nodeID);
    return MakeVideoNode(handle.GetTimelineID(), nodeID, 0);
}

VideoNodeRef AcquireInput(std::uint32_t timelineID, std::uint32_t nodeID, std::int32_t index, std::int64_t baseOffset) {
    std::int64_t offset = 0;
    std::uint32_t inputID = 0;
    VideoSegmentSuite().AcquireInputNode(nodeID, index, &offset, &inputID);
    return MakeVideoNode(timelineID, inputID, offset + baseOffset);
}

VideoNodeRef AcquireOperator(std::uint32_t timelineID, std::uint32_t nodeID, std::int32_t index, std::int64_t offset) {
    std::uint32_t operatorID = 0;
    VideoSegmentSuite().AcquireOperatorNode(nodeID, index, &operatorID);
    return MakeVideoNode(timelineID, operatorID, offset);
}

VideoMediaNodeRef GetClipMedia(const VideoNodeRef& clip) {
    if (!clip) return {};
    VideoMediaNodeRef media = boost::dynamic_pointer_cast<VideoMediaNode>(
        AcquireInput(clip->GetTimelineID(), clip->GetNodeID(), 0, clip->GetTimeOffset()));
    if (media) media->SetParent(clip);
    return media;
}

VideoEffectNodeRef GetEffect(const VideoNodeRef& clip, std::int32_t index) {
    if (!clip) return {};
    VideoEffectNodeRef effect = boost::dynamic_pointer_cast<VideoEffectNode>(
        AcquireOperator(clip->GetTimelineID(), clip->GetNodeID(), index, clip->GetTimeOffset()));
    if (effect) {
        effect->SetOperatorIndex(index);
        effect->SetParent(clip);
    }
    return effect;
}

}  // namespace Vantrel
