// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Effects/EffectTester.h"

#include <memory>
#include <sstream>
#include <utility>

#include <boost/make_shared.hpp>

#include "Ostrand/QueryTable.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Support/FakeFrame.h"
#include "Vantrel/RenderSystem.h"

namespace Vantrel::Testing {
namespace {

class PaddedFrame final
    : public Ostrand::Counted<PaddedFrame, FrameAttributes, Marl::IFrameData, Marl::IFrameRows, Kiln::IDeviceFrame> {
public:
    PaddedFrame(const Kiln::DeviceRef& device, std::unique_ptr<DevicePicture> picture, Vellum::PixelFormat format)
        : Counted(Vellum::Rect{0, 0, picture->GetWidth(), picture->GetHeight()}, format),
          mDevice(device),
          mPicture(std::move(picture)) {}

    Status QueryInterface(const Guid& iid, void** out) override {
        return Ostrand::QueryTable(this, iid, out)
            .Answer<Marl::IVideoFrame>()
            .Answer<Marl::IFrameIdentity>()
            .Answer<Marl::IFrameData>()
            .Answer<Marl::IFrameRows>()
            .Answer<Kiln::IDeviceFrame>()
            .Result();
    }
    std::uint64_t GetData() const override { return mPicture->GetData(); }
    std::int32_t GetRowBytes() const override { return mPicture->GetRowBytes(); }
    const Kiln::DeviceRef& GetDevice() const override { return mDevice; }

private:
    Kiln::DeviceRef mDevice;
    std::unique_ptr<DevicePicture> mPicture;
};

std::array<double, 4> RandomValue(Random& random, const ParameterRow& row) {
    std::array<double, 4> value = row.value;
    const auto uniform = [&] {
        return static_cast<double>(random.Uniform(static_cast<float>(row.minimum), static_cast<float>(row.maximum)));
    };
    switch (row.type) {
        case ParameterType::kBool:
            value[0] = random.Chance(0.3F) ? 1.0 : 0.0;
            break;
        case ParameterType::kFloat:
        case ParameterType::kDouble:
            // Extremes are far apart in many tables: half of the values stay near the default.
            value[0] = random.Chance(0.5F) ? uniform() : static_cast<float>(0.8 * row.value[0] + 0.2 * uniform());
            break;
        case ParameterType::kColor:
            for (double& c : value) c = random.Int(0, 4) * 0.25;
            break;
        case ParameterType::kPoint:
            for (std::size_t c = 0; c < 2; ++c) value[c] = static_cast<double>(random.Uniform(-0.2F, 1.2F));
            break;
        default:
            value[0] = random.Int(static_cast<int>(row.minimum), static_cast<int>(row.maximum));
            if (row.choiceName && !row.choiceName(static_cast<std::int32_t>(value[0]))) value = row.value;
    }
    return value;
}

}  // namespace

VideoFrameRef MakePaddedFrame(const Kiln::DeviceRef& device, Vellum::PixelFormat format, const Picture& picture,
                              int sparePixels) {
    auto padded = std::make_unique<DevicePicture>(device, format, picture, sparePixels);
    return VideoFrameRef(new PaddedFrame(device, std::move(padded), format));
}

FakeParam ToParam(const ParameterRow& row, const std::array<double, 4>& value) {
    switch (row.type) {
        case ParameterType::kBool:
            return value[0] != 0.0;
        case ParameterType::kFloat:
            return static_cast<float>(value[0]);
        case ParameterType::kDouble:
            return value[0];
        case ParameterType::kPoint:
            return FakePoint{value[0], value[1]};
        case ParameterType::kColor: {
            std::array<std::uint16_t, 4> words{};  // blue, green, red, alpha
            const std::size_t order[] = {2, 1, 0, 3};
            for (std::size_t c = 0; c < 4; ++c) words[c] = static_cast<std::uint16_t>(value[order[c]] * 65280.0);
            return words;
        }
        default:
            return static_cast<std::int32_t>(value[0]);
    }
}

std::map<std::int32_t, FakeParam> ToParams(const EffectRow& effect, const ParameterValues& values) {
    std::map<std::int32_t, FakeParam> params;
    for (std::size_t i = 0; i < effect.parameterCount; ++i) {
        const ParameterRow& row = effect.parameters[i];
        const auto found = values.find(row.index);
        params[row.index] = ToParam(row, found == values.end() ? row.value : found->second);
    }
    return params;
}

std::map<std::int32_t, FakeParam> MakeParams(const EffectRow& effect, const std::map<std::int32_t, double>& overrides) {
    ParameterValues values;
    for (const auto& [index, value] : overrides) values[index] = {value};
    return ToParams(effect, values);
}

ParameterValues RandomValues(Random& random, const EffectRow& effect) {
    const float share = random.Chance(0.5F) ? 1.0F : 0.3F;
    ParameterValues values;
    for (std::size_t i = 0; i < effect.parameterCount; ++i) {
        const ParameterRow& row = effect.parameters[i];
        values[row.index] = random.Chance(share) ? RandomValue(random, row) : row.value;
    }
    return values;
}

std::string Describe(const EffectRow& effect, const ParameterValues& values) {
    std::ostringstream text;
    text << effect.matchName;
    for (std::size_t i = 0; i < effect.parameterCount; ++i) {
        const auto found = values.find(effect.parameters[i].index);
        if (found == values.end()) continue;
        const auto& value = found->second;
        if (value != effect.parameters[i].value) text << ", " << effect.parameters[i].name << " " << value[0];
    }
    return text.str();
}

EffectTest::EffectTest() {
    Initialize(host.GetBasicSuite());
    host.nodes[kMedia].kind = "Media";
    host.nodes[kClip].kind = "Clip";
    host.nodes[kClip].inputs = {{kMedia}};
    host.nodes[kClip].operators = {kEffect};
    host.nodes[kEffect].kind = "Effect";
    host.sequences[kSequence].segments = {{0, Vellum::kTime_Max, 0, Guid(1, 0, 0, {}), kClip}};
}

EffectTest::~EffectTest() { Terminate(); }

VideoNodeRef EffectTest::DescribeEffect(const std::string& matchName, const Params& params) {
    host.nodes[kEffect].properties["EffectNode::FilterMatchName"] = matchName;
    host.nodes[kEffect].params = params;
    const VideoSegmentsHandle handle(kSequence, SegmentsMode::kPlain, "");
    return GetEffect(AcquireRootNode(handle, 0), 0);
}

RenderNodeRef EffectTest::MakeEffect(const std::string& matchName, const Params& params) {
    return MakeNode(matchName, DescribeEffect(matchName, params));
}

RenderNodeRef EffectTest::MakeNode(const std::string& key, const VideoNodeRef& description, Vellum::Rect frameRect) {
    RenderRequirements requirements;
    requirements.frameRect = frameRect;
    requirements.pixelAspectRatio = Vellum::kPixelAspectRatio_Square;
    requirements.device = GetDevice();
    bool needsHost = false;
    const Halden::WideString wideKey = Halden::ToWide(key);
    EXPECT_TRUE(isRegistered(wideKey, GetDevice())) << key;
    return createNode(wideKey, GetDevice(), description, requirements, needsHost);
}

RenderParams EffectTest::MakeRequest(const VideoFrameRef& input, std::int64_t clipTime) const {
    RenderParams params;
    params.time = params.clipTime = clipTime;
    params.outputRect = params.sequenceRect = input->GetBounds();
    params.pixelAspectRatio = input->GetPixelAspectRatio();
    params.quality = IsHalf() ? 1 : 3;
    params.sequenceID = kSequence;
    return params;
}

Status EffectTest::TryRenderOver(const RenderNodeRef& node, const VideoFrameRef& input, VideoFrameRef& output,
                                 std::int64_t clipTime) {
    return TryRender(node, input, MakeRequest(input, clipTime), output);
}

Status EffectTest::TryRender(const RenderNodeRef& node, const VideoFrameRef& input, const RenderParams& params,
                             VideoFrameRef& output) {
    node->SetInput(0, RenderNodeRef(new FrameSource(input)));
    const auto results = boost::make_shared<RenderResults>();
    const Status status = node->RenderFrame({}, params, results, output);
    node->EndFrame({}, params, results, 0);
    return status;
}

VideoFrameRef EffectTest::RenderOver(const RenderNodeRef& node, const VideoFrameRef& input, std::int64_t clipTime) {
    VideoFrameRef output;
    EXPECT_EQ(TryRenderOver(node, input, output, clipTime), Ostrand::kStatus_OK);
    return output ? output : input;
}

Picture EffectTest::Apply(const std::string& matchName, const Params& params, const Picture& picture) {
    const RenderNodeRef node = MakeEffect(matchName, params);
    if (!node) return {};
    constexpr int kSparePixels = 3;
    return DownloadFrame(GetDevice(),
                         RenderOver(node, MakePaddedFrame(GetDevice(), GetFormat(), picture, kSparePixels)));
}

EffectTest::Recorded EffectTest::Record(const std::string& matchName, const Params& params, const Picture& picture) {
    constexpr int kSparePixels = 3;
    const KernelArguments recorder;
    const RenderNodeRef node = MakeEffect(matchName, params);
    const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), picture, kSparePixels);
    VideoFrameRef output;
    const Status status = TryRenderOver(node, input, output);
    return {status, input, DownloadFrame(GetDevice(), output ? output : input), recorder.kernels};
}

Host::Software::LayerPicture EffectTest::OnHost(const EffectRow& effect, const ParameterValues& values,
                                                Host::Software::LayerPicture layer,
                                                Host::Software::EffectContext context) {
    const Host::Software::EffectFunction function = Host::Software::FindEffectFunction(effect.matchName);
    EXPECT_NE(function, nullptr) << effect.matchName << " has no scalar version";
    context.matchName = effect.matchName;
    context.value = [&values](std::int32_t index) {
        const auto found = values.find(index);
        return found == values.end() ? std::array<double, 4>{} : found->second;
    };
    if (context.view.width == 0) {
        context.view.width = context.view.sequenceWidth = layer.picture.width;
        context.view.height = context.view.sequenceHeight = layer.picture.height;
    }
    if (function) function(context, layer);
    return layer;
}

void EffectTest::ExpectAgreement(const RenderNodeRef& node, const EffectRow& effect, const ParameterValues& values,
                                 const Picture& picture, const Tolerance& tolerance, Vellum::PixelAspectRatio aspect) {
    Host::Software::LayerPicture layer;
    layer.picture = picture;
    layer.aspect = aspect;
    layer = OnHost(effect, values, layer);
    const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), picture, 3);
    input->SetPixelAspectRatio(aspect);
    const VideoFrameRef output = RenderOver(node, input);
    EXPECT_EQ(output->GetOrigin(), layer.origin);
    EXPECT_EQ(output->GetPixelAspectRatio(), aspect);
    EXPECT_EQ(output->GetPixelFormat(), GetFormat());
    EXPECT_TRUE(
        PicturesAgree(DownloadFrame(GetDevice(), output), RoundTo(std::move(layer.picture), GetFormat()), tolerance))
        << Describe(effect, values) << "; " << picture.width << " by " << picture.height;
}

}  // namespace Vantrel::Testing
