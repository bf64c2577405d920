// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/VideoNodes/VideoNode.h"

namespace Vantrel {

/// A transition between two inputs.
class VideoTransitionNode final : public VideoNode, public Ostrand::Allocated<VideoTransitionNode> {
public:
    explicit VideoTransitionNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kTransition; }

    [[nodiscard]] WideString GetTransitionMatchName() const {
        return ReadWideText("TransitionNode::TransitionMatchName");
    }
    [[nodiscard]] Marl::BinaryData GetTransitionOpaqueData() const {
        return ReadBinary("TransitionNode::TransitionOpaqueData");
    }
    [[nodiscard]] std::int64_t GetTransitionDuration() const { return ReadInt64("TransitionNode::TransitionDuration"); }
    [[nodiscard]] bool GetTransitionReverse() const { return ReadBool("TransitionNode::TransitionReverse"); }

    // Each leaves its preset when the transition has none.
    void GetTransitionBorderWidth(double& width) const {
        static_cast<void>(GetDoubleProperty("TransitionNode::TransitionBorderWidth", width));
    }
    void GetTransitionDirection(std::int32_t& direction) const {
        static_cast<void>(GetIntProperty("TransitionNode::TransitionDirection", direction));
    }
    void GetTransitionBorderColor(std::int32_t& color) const {
        static_cast<void>(GetIntProperty("TransitionNode::TransitionBorderColor", color));
    }
};

}  // namespace Vantrel
