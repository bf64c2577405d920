// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/VideoNodes/VideoNode.h"

/// The views of nodes that arrange pictures.
namespace Vantrel {

class VideoCompositorNode final : public VideoNode, public Ostrand::Allocated<VideoCompositorNode> {
public:
    explicit VideoCompositorNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kCompositor; }
};

/// Stands where a node is switched off.
class VideoDisabledNode final : public VideoNode, public Ostrand::Allocated<VideoDisabledNode> {
public:
    explicit VideoDisabledNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kDisabled; }
};

class VideoMultiCamNode final : public VideoNode, public Ostrand::Allocated<VideoMultiCamNode> {
public:
    explicit VideoMultiCamNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kMulticam; }

    /// `track` stays when none is selected.
    void GetSelectedTrack(std::int32_t& track) const {
        static_cast<void>(GetIntProperty("MulticamNode::SelectedTrack", track));
    }
    [[nodiscard]] bool GetShowProgram() const { return ReadBool("MulticamNode::ShowProgram"); }
    [[nodiscard]] bool GetRecording() const { return ReadBool("MulticamNode::Recording"); }
    [[nodiscard]] bool GetIsNonMultiCam() const { return ReadBool("MulticamNode::IsNonMultiCam"); }
};

/// A layer whose effects apply to all that lies below it.
class VideoAdjustmentNode final : public VideoNode, public Ostrand::Allocated<VideoAdjustmentNode> {
public:
    explicit VideoAdjustmentNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kAdjustment; }

    [[nodiscard]] bool GetAdjustmentMediaIsOpaque() const {
        return ReadBool("AdjustmentNode::AdjustmentMediaIsOpaque");
    }
};

}  // namespace Vantrel
