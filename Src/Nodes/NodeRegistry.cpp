// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/NodeRegistry.h"

#include <array>
#include <map>
#include <string>

#include "Halden/DebugDatabase.h"
#include "Src/Filters/AdjustmentNode.h"
#include "Src/Filters/CompositorNode.h"
#include "Src/Filters/DisabledNode.h"
#include "Src/Filters/Effects/Basic3DNode.h"
#include "Src/Filters/Effects/CropNode.h"
#include "Src/Filters/Effects/DirectionalBlurNode.h"
#include "Src/Filters/Effects/DropShadowNode.h"
#include "Src/Filters/Effects/GarbageMatteNode.h"
#include "Src/Filters/Effects/GaussianBlurNode.h"
#include "Src/Filters/Effects/InvertNode.h"
#include "Src/Filters/Effects/LevelsNode.h"
#include "Src/Filters/Effects/LumaCorrectorNode.h"
#include "Src/Filters/Effects/LumaCurveNode.h"
#include "Src/Filters/Effects/PointwiseFilterHostNode.h"
#include "Src/Filters/Effects/RGBColorCorrectorNode.h"
#include "Src/Filters/Effects/RGBCurvesNode.h"
#include "Src/Filters/Effects/SharpenNode.h"
#include "Src/Filters/Effects/StabilizerWarpNode.h"
#include "Src/Filters/Effects/ThreeWayColorCorrectorNode.h"
#include "Src/Filters/Effects/TimeCodeNode.h"
#include "Src/Filters/Effects/TrackMatteNode.h"
#include "Src/Filters/Effects/UltraKeyNode.h"
#include "Src/Filters/Effects/VideoLimiterNode.h"
#include "Src/Filters/HostRenderSubtreeNode.h"
#include "Src/Filters/IntrinsicNode.h"
#include "Src/Filters/MediaNode.h"
#include "Src/Filters/MulticamNode.h"
#include "Src/Filters/NestedTimelineNode.h"
#include "Src/Filters/SWHostRenderClipPrefetch.h"
#include "Src/Filters/Synthetics/ColorBarsNode.h"
#include "Src/Filters/Synthetics/SolidColorNode.h"
#include "Src/Filters/Transitions/AdditiveDissolveNode.h"
#include "Src/Filters/Transitions/CrossDissolveNode.h"
#include "Src/Filters/Transitions/PushNode.h"
#include "Src/Filters/UploadNode.h"
#include "Src/Nodes/FrameSizeLimit.h"
#include "Src/Nodes/ProxyNode.h"
#include "Src/VideoNodes/VideoMediaNode.h"

namespace Vantrel {
namespace {

using Kiln::DeviceFramework;
using Creator = RenderNodeRef (*)();

template <class Node>
RenderNodeRef Make() {
    return RenderNodeRef(new Node);
}

struct RegistryEntry {
    const char16_t* key;
    Creator creator;
    bool cudaOnly = false;
};

/// Every node that a name can stand for. Structure first, then effects, transitions and synthetic media.
constexpr RegistryEntry kEntries[] = {
    {u"BlackVideoSource", Make<SolidColorNode>},
    {u"LayerBlendNode", Make<CompositorNode>},
    {u"HostRenderSource", Make<HostRenderSourceNode>},
    {u"HostRenderClip", Make<ProxyNode<MediaNode, ProxyNode<UploadNode, SWHostRenderClipPrefetch>>>},
    {u"HostRenderSubtree", Make<ProxyNode<UploadNode, HostRenderSubtreeNode>>},
    {u"TQ.XQVE Opacity", Make<IntrinsicNode>},
    {u"TQ.XQVE Motion", Make<IntrinsicNode>},
    {u"NestedTimelineNode", Make<NestedTimelineNode>},
    {u"MulticamRenderNode", Make<MulticamNode>},
    {u"AdjustmentNode", Make<AdjustmentNode>},
    {u"DisabledNode", Make<DisabledNode>},
    {u"TQ.XQVE Fast Blur", Make<GaussianBlurNode>, true},
    {u"TQ.XQVE Gaussian Blur 2", Make<GaussianBlurNode>, true},
    {u"TQ.XQVE Invert", Make<InvertNode>},
    {u"TQ.XQVE Luma Corrector", Make<LumaCorrectorNode>},
    {u"TQ.XQVE Luma Curve", Make<LumaCurveNode>},
    {u"TQ.XQVE RGB Curves", Make<RGBCurvesNode>},
    {u"KL.XQVE Levels", Make<LevelsNode>},
    {u"TQ.XQVE Video Limiter", Make<VideoLimiterNode>},
    {u"TQ.XQVE Alpha Adjust", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Black & White", Make<PointwiseFilterHostNode>},
    {u"TQ.XQVE Brightness & Contrast 2", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Color Balance", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Color Pass", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Color Replace", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Edge Feather", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Extract", Make<PointwiseFilterHostNode>},
    {u"TQ.XQVE Fast Color Corrector", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Gamma Correction", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Horizontal Flip", Make<PointwiseFilterHostNode>},
    {u"TQ.XQVE Noise", Make<PointwiseFilterHostNode>},
    {u"TQ.XQVE ProcAmp", Make<PointwiseFilterHostNode>},
    {u"TQ.XQVE Tint", Make<PointwiseFilterHostNode>},
    {u"KL.XQVE Vertical Flip", Make<PointwiseFilterHostNode>},
    {u"TQ.XQVE Ultra Key", Make<UltraKeyNode>},
    {u"TQ.XQVE Sharpen", Make<SharpenNode>},
    {u"TQ.XQVE Motion Blur", Make<DirectionalBlurNode>, true},
    {u"TQ.XQVE Drop Shadow", Make<DropShadowNode>},
    {u"XQVE Additive Dissolve", Make<AdditiveDissolveNode>},
    {u"XQVE Cross Dissolve", Make<CrossDissolveNode>},
    {u"XQVE Dip To Black", Make<CrossDissolveNode>},
    {u"XQVE Dip To White", Make<CrossDissolveNode>},
    {u"XQVE Film Dissolve", Make<CrossDissolveNode>},
    {u"XQVE Push", Make<PushNode>},
    {u"TQ.XQVE RGB Color Corrector", Make<RGBColorCorrectorNode>},
    {u"TQ.XQVE Three-Way Color Corrector", Make<ThreeWayColorCorrectorNode>},
    {u"TQ.XQVE Basic 3D", Make<Basic3DNode>, true},
    {u"TQ.XQVE TQCrop", Make<CropNode>},
    {u"TQ.XQVE SubspaceStabilizer", Make<StabilizerWarpNode>},
    {u"TQ.XQVE Legacy Key Track Matte", Make<TrackMatteNode>},
    {u"TQ.XQVE Garbage Matte", Make<GarbageMatteNode>},
    {u"TQ.XQVE Garbage Matte 8", Make<GarbageMatteNode>},
    {u"TQ.XQVE Garbage Matte 16", Make<GarbageMatteNode>},
    {u"TQ.XQVE Lspr Timecode", Make<TimeCodeNode>},
    {u"1111577171", Make<ProxyNode<MediaNode, ColorBarsNode>>},
    {u"1112293707", Make<ProxyNode<MediaNode, SolidColorNode>>},
    {u"1129270354", Make<ProxyNode<MediaNode, SolidColorNode>>},
    {u"1414680150", Make<ProxyNode<MediaNode, SolidColorNode>>},
};

constexpr const char16_t* kHostRenderClipKey = u"HostRenderClip";
constexpr const char16_t* kHostRenderSubtreeKey = u"HostRenderSubtree";
constexpr const char16_t* kHostRenderSourceKey = u"HostRenderSource";
constexpr const char16_t* kBlackVideoSourceKey = u"BlackVideoSource";
constexpr const char16_t* kMotionKey = u"TQ.XQVE Motion";

using Registry = std::map<WideString, Creator>;

Registry& RegistryOf(DeviceFramework framework) {
    static std::array<Registry, 2> registries;
    return registries[static_cast<std::size_t>(framework)];
}

/// Exactly one framework's names reach Kiln: those of the framework that will render.
bool NamesItsKeys(DeviceFramework framework) {
    const bool openclOnly = Kiln::GetPrimaryDevice(DeviceFramework::kOpenCL) != nullptr &&
                            Kiln::GetPrimaryDevice(DeviceFramework::kCuda) == nullptr;
    return openclOnly == (framework == DeviceFramework::kOpenCL);
}

/// A setting for tests and support: media then comes from the host like everything else that has no node.
bool IsMediaNodeDisabled() {
    return Halden::debug::DebugDatabase::Instance().GetEntry(u"DisableGPUMediaNode", u"false") == u"true";
}

void FillRegistry(DeviceFramework framework) {
    Registry& registry = RegistryOf(framework);
    const bool naming = NamesItsKeys(framework);
    for (const RegistryEntry& entry : kEntries) {
        if (entry.cudaOnly && framework != DeviceFramework::kCuda) continue;
        const WideString key = entry.key;
        if (key == kHostRenderClipKey && IsMediaNodeDisabled()) continue;
        if (naming) Kiln::RegisterMatchName(key);
        registry.emplace(key, entry.creator);
    }
}

RenderNodeRef MakeByKey(const WideString& key, const Kiln::DeviceRef& device, const VideoNodeRef& description,
                        const RenderRequirements& requirements, bool& host) {
    const Registry& registry = RegistryOf(device->GetFramework());
    const auto found = registry.find(key);
    if (found == registry.end()) return {};
    RenderNodeRef node = found->second();
    if (Ostrand::Failed(node->Configure(description, requirements, host))) {
        host = true;
        node.Reset();
    }
    return node;
}

}  // namespace

void FillCudaRegistry() { FillRegistry(DeviceFramework::kCuda); }

void FillOpenCLRegistry() { FillRegistry(DeviceFramework::kOpenCL); }

bool isRegistered(const WideString& key, const Kiln::DeviceRef& device) {
    return RegistryOf(device->GetFramework()).count(key) != 0;
}

RenderNodeRef createNode(const WideString& key, const Kiln::DeviceRef& device, const VideoNodeRef& description,
                         const RenderRequirements& requirements, bool& host) {
    if (key != kHostRenderSourceKey && key != kBlackVideoSourceKey &&
        ExceedsDeviceMemory(requirements.frameRect, *device)) {
        host = true;
        return {};
    }
    const bool hostBefore = host;
    RenderNodeRef node = MakeByKey(key, device, description, requirements, host);
    if (!node) {
        if (const auto* media = dynamic_cast<const VideoMediaNode*>(description.get())) {
            host = hostBefore;
            node = MakeByKey(media->GetMediaInstanceString(), device, description, requirements, host);
        }
    }
    if (!node) {
        host = hostBefore;
        node = MakeByKey(kHostRenderSubtreeKey, device, description, requirements, host);
    }
    return node;
}

RenderNodeRef MakeIntrinsicNode() {
    for (const RegistryEntry& entry : kEntries) {
        if (WideString(entry.key) == kMotionKey) return entry.creator();
    }
    return {};
}

}  // namespace Vantrel
