// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/VideoNodes/VideoNode.h"

namespace Vantrel {

/// An effect of a clip.
class VideoEffectNode final : public VideoNode, public Ostrand::Allocated<VideoEffectNode> {
public:
    explicit VideoEffectNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kEffect; }

    /// The effect's place in its clip's list of operators.
    [[nodiscard]] std::int32_t GetOperatorIndex() const { return mOperatorIndex; }
    void SetOperatorIndex(std::int32_t index) { mOperatorIndex = index; }

    [[nodiscard]] std::int32_t GetRuntimeInstanceID() const { return ReadInt("EffectNode::RuntimeInstanceID", -1); }
    [[nodiscard]] WideString GetFilterMatchName() const { return ReadWideText("EffectNode::FilterMatchName"); }
    [[nodiscard]] std::int64_t GetEffectDuration() const { return ReadInt64("EffectNode::EffectDuration"); }
    [[nodiscard]] Marl::BinaryData GetFilterOpaqueData() const { return ReadBinary("EffectNode::FilterOpaqueData"); }

private:
    std::int32_t mOperatorIndex = 0;
};

using VideoEffectNodeRef = boost::shared_ptr<VideoEffectNode>;

}  // namespace Vantrel
