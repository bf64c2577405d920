// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <vector>

#include <boost/make_shared.hpp>

#include "Src/Nodes/FilterNode.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Support/FakeHost.h"

namespace Vantrel::Testing {

/// A sequence of one track with one clip, whose media is a file that the host reads, and the clip's motion and opacity.
class MediaScript {
public:
    static constexpr std::uint32_t kSequence = 9;
    static constexpr std::uint32_t kClip = 2;
    static constexpr std::uint32_t kMedia = 3;
    static constexpr std::uint32_t kMotion = 4;
    static constexpr std::uint32_t kOpacity = 5;
    static constexpr std::uint32_t kClipID = 77;
    /// Of the sequence and, unless a test says otherwise, of the stream.
    static constexpr std::int64_t kFrameTicks = 1000;

    using Properties = std::map<std::string, std::string>;

    explicit MediaScript(FakeHost& fakeHost, Vellum::Rect stream = {0, 0, 64, 36}) : host(fakeHost) {
        host.sequences[kSequence].segments = {{0, Vellum::kTime_Max, 0, Guid(1, 0, 0, {}), kClip}};
        host.nodes[kClip].kind = "Clip";
        host.nodes[kClip].inputs = {{kMedia}};
        host.nodes[kClip].operators = {kMotion, kOpacity};
        host.nodes[kMedia].kind = "Media";
        Set({{"MediaNode::ClipID", std::to_string(kClipID)},
             {"MediaNode::StreamFrameWidth", std::to_string(stream.Width())},
             {"MediaNode::StreamFrameHeight", std::to_string(stream.Height())},
             {"MediaNode::StreamFrameRate", std::to_string(kFrameTicks)}});
        host.nodes[kMotion].kind = "Effect";
        host.nodes[kMotion].properties["EffectNode::FilterMatchName"] = "TQ.XQVE Motion";
        host.nodes[kOpacity].kind = "Effect";
        host.nodes[kOpacity].properties["EffectNode::FilterMatchName"] = "TQ.XQVE Opacity";
        ResetEffects();
        // A file delivers its own size, whatever is wanted.
        host.clips[kClipID].deliver = [stream](VantrelClipRecord wanted) {
            wanted.width = stream.Width();
            wanted.height = stream.Height();
            return wanted;
        };
        params.outputRect = params.sequenceRect = {0, 0, 64, 36};
        params.pixelFormat = Vellum::FourCC("bgra");
        params.quality = 2;
        params.frameTicks = params.sequenceFrameTicks = kFrameTicks;
        params.sequenceID = kSequence;
    }

    /// Motion and opacity that change nothing.
    void ResetEffects() {
        host.nodes[kMotion].params = {{0, FakePoint{0.5, 0.5}}, {1, 100.0F}, {2, 100.0F},
                                      {3, std::uint8_t{1}},     {4, 0.0F},   {5, FakePoint{0.5, 0.5}}};
        host.nodes[kOpacity].params = {{0, 100.0F}, {1, std::int32_t{18}}};
    }
    /// Properties of the media.
    void Set(const Properties& properties) {
        for (const auto& [key, value] : properties) host.nodes[kMedia].properties[key] = value;
    }
    /// Asks for the whole sequence in a smaller picture.
    void Output(std::int32_t width, std::int32_t height) {
        params.outputRect = {0, 0, width, height};
        params.scaleX = static_cast<float>(params.sequenceRect.Width()) / static_cast<float>(width);
        params.scaleY = static_cast<float>(params.sequenceRect.Height()) / static_cast<float>(height);
    }

    // New views at each call: they read the script as it is then.
    [[nodiscard]] static VideoNodeRef Clip() {
        const VideoSegmentsHandle handle(kSequence, SegmentsMode::kPlain, "");
        return AcquireRootNode(handle, 0);
    }
    [[nodiscard]] static VideoNodeRef Media() { return GetClipMedia(Clip()); }
    [[nodiscard]] static VideoNodeRef Motion() { return GetEffect(Clip(), 0); }
    [[nodiscard]] static VideoNodeRef Opacity() { return GetEffect(Clip(), 1); }

    [[nodiscard]] RenderRequirements Requirements(const Kiln::DeviceRef& device) const {
        return {params.sequenceRect, kFrameTicks, params.pixelAspectRatio, params.fieldType, device};
    }
    /// @return the node's status.
    Status Configure(IRenderNode& node, const VideoNodeRef& description, const Kiln::DeviceRef& device) {
        return node.Configure(description, Requirements(device), isHost);
    }
    template <class Node>
    [[nodiscard]] InterfaceRef<Node> Make(const VideoNodeRef& description, const Kiln::DeviceRef& device) {
        InterfaceRef<Node> node(new Node);
        if (Ostrand::Failed(Configure(*node, description, device))) node.Reset();
        return node;
    }

    [[nodiscard]] static RenderResultsRef MakeResults() {
        return boost::make_shared<RenderResults>([] {}, 1);
    }

    FakeHost& host;
    RenderParams params;
    bool isHost = false;
};

}  // namespace Vantrel::Testing
