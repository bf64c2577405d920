// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "Host/Software/EffectContext.h"
#include "Src/Nodes/RenderNodeBase.h"
#include "Tests/Effects/KernelArguments.h"
#include "Tests/Support/DevicePictures.h"
#include "Tests/Support/FakeHost.h"
#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel::Testing {

/// A render tree's leaf that hands out one frame.
class FrameSource final : public RenderNodeBase, public Ostrand::Allocated<FrameSource> {
public:
    explicit FrameSource(VideoFrameRef frame) : mFrame(std::move(frame)) {}
    Status RenderFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&,
                       VideoFrameRef& frame) override {
        frame = mFrame;
        return Ostrand::kStatus_OK;
    }

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    VideoFrameRef mFrame;
};

/// A device frame whose rows are longer than the picture, by a pattern that nobody may touch.
[[nodiscard]] VideoFrameRef MakePaddedFrame(const Kiln::DeviceRef& device, Vellum::PixelFormat format,
                                            const Picture& picture, int sparePixels);

/// A parameter of the row's type.
[[nodiscard]] FakeParam ToParam(const ParameterRow& row, const std::array<double, 4>& value);
/// By index: a number, a place's two or a colour's four.
using ParameterValues = std::map<std::int32_t, std::array<double, 4>>;
/// All parameters of an effect: at their defaults but for the values given.
[[nodiscard]] std::map<std::int32_t, FakeParam> ToParams(const EffectRow& effect, const ParameterValues& values);
[[nodiscard]] std::map<std::int32_t, FakeParam> MakeParams(const EffectRow& effect,
                                                           const std::map<std::int32_t, double>& overrides);
/// All parameters of an effect, most at their defaults or all at random.
[[nodiscard]] ParameterValues RandomValues(Random& random, const EffectRow& effect);
/// The effect and what isn't at its default.
[[nodiscard]] std::string Describe(const EffectRow& effect, const ParameterValues& values);

/// Runs one effect as the engine does: made by its match name from the registry, over a frame, with the parameters of a
/// scripted clip, on each device and in each pixel format.
class EffectTest : public DeviceTest {
protected:
    EffectTest();
    ~EffectTest() override;

    using Params = std::map<std::int32_t, FakeParam>;

    /// The clip's effect as the host describes it.
    [[nodiscard]] VideoNodeRef DescribeEffect(const std::string& matchName, const Params& params);
    /// The node for an effect of the clip; empty, and the test fails, when there is none of its own.
    [[nodiscard]] RenderNodeRef MakeEffect(const std::string& matchName, const Params& params);
    /// The node of a key of the registry, or the host's where that one refuses.
    [[nodiscard]] RenderNodeRef MakeNode(const std::string& key, const VideoNodeRef& description,
                                         Vellum::Rect frameRect = {0, 0, 64, 36});
    /// Configures a node for the device; false where it refuses.
    bool Configure(const RenderNodeRef& node, const VideoNodeRef& description,
                   Vellum::Rect frameRect = {0, 0, 64, 36}) {
        bool needsHost = false;
        RenderRequirements requirements;
        requirements.frameRect = frameRect;
        requirements.pixelAspectRatio = Vellum::kPixelAspectRatio_Square;
        requirements.device = GetDevice();
        return !Ostrand::Failed(node->Configure(description, requirements, needsHost));
    }

    /// Renders `node` over a frame at a clip time. Failures fail the test.
    VideoFrameRef RenderOver(const RenderNodeRef& node, const VideoFrameRef& input, std::int64_t clipTime = 0);
    Status TryRenderOver(const RenderNodeRef& node, const VideoFrameRef& input, VideoFrameRef& output,
                         std::int64_t clipTime = 0);
    /// A request for a picture of the frame's size, of a sequence of that size; and a render by such a request.
    [[nodiscard]] RenderParams MakeRequest(const VideoFrameRef& input, std::int64_t clipTime = 0) const;
    Status TryRender(const RenderNodeRef& node, const VideoFrameRef& input, const RenderParams& params,
                     VideoFrameRef& output);
    /// The effect on a picture, as the device holds it.
    [[nodiscard]] Picture Apply(const std::string& matchName, const Params& params, const Picture& picture);

    /// A render over a frame with spare pixels, and what its kernels were handed.
    struct Recorded {
        Status status;
        VideoFrameRef input;
        Picture picture;  ///< the input's where nothing came out
        std::vector<KernelArguments::List> kernels;
    };
    [[nodiscard]] Recorded Record(const std::string& matchName, const Params& params, const Picture& picture);

    /// The effect's scalar version on a layer, for a sequence of the picture's size unless the context has a view.
    [[nodiscard]] static Host::Software::LayerPicture OnHost(const EffectRow& effect, const ParameterValues& values,
                                                             Host::Software::LayerPicture layer,
                                                             Host::Software::EffectContext context = {});

    /// Renders an effect's node over a picture and expects the place and the pixels of its scalar version.
    void ExpectAgreement(const RenderNodeRef& node, const EffectRow& effect, const ParameterValues& values,
                         const Picture& picture, const Tolerance& tolerance, Vellum::PixelAspectRatio aspect = {1, 1});

    /// What the plain solution reaches on every device, for values of about 1.
    [[nodiscard]] Tolerance GetTolerance() const {
        // 32 bits: some roundings of a short chain. 16 bits: half a step from rounding the result, one for a sum that
        // the device rounded to the other side.
        return IsHalf() ? Tolerance{1e-3, 1e-3} : Tolerance{2e-6, 1e-5};
    }

    static constexpr std::uint32_t kSequence = 1;
    static constexpr std::uint32_t kClip = 1;
    static constexpr std::uint32_t kMedia = 2;
    static constexpr std::uint32_t kEffect = 3;

    FakeHost host;
};

}  // namespace Vantrel::Testing
