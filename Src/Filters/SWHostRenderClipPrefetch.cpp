// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/SWHostRenderClipPrefetch.h"

#include "Brae/Conversions.h"
#include "Ostrand/QueryTable.h"
#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoMediaNode.h"

namespace Vantrel {

Status SWHostRenderClipPrefetch::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out)
        .Answer<SWHostRenderClipPrefetch>()
        .Otherwise<SWHostVideoSegmentRenderSuiteNode>();
}

Status SWHostRenderClipPrefetch::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                           bool& host) {
    const auto media = boost::dynamic_pointer_cast<VideoMediaNode>(description);
    if (!media || media->GetMediaIsOffline() || media->GetMediaIsPending()) return Ostrand::kStatus_Failure;

    mClipID = static_cast<std::uint32_t>(media->GetClipID());
    std::uint8_t ready = 0;
    if (Ostrand::Failed(VideoSegmentRenderSuite().IsClipReady(mClipID, &ready)) || ready == 0) {
        return Ostrand::kStatus_Failure;
    }
    return RenderNodeBase::Configure(description, requirements, host);
}

VantrelClipRecord SWHostRenderClipPrefetch::MakeClipRecord(const RenderParams& params) const {
    const VantrelClipRecord wanted{params.pixelFormat,
                                   params.outputRect.Width(),
                                   params.outputRect.Height(),
                                   params.pixelAspectRatio.numerator,
                                   params.pixelAspectRatio.denominator,
                                   params.fieldType,
                                   params.quality};
    VantrelClipRecord delivered = wanted;
    const VantrelHostStatus status =
        VideoSegmentRenderSuite().GetClipFormat(mClipID, params.clipTime, &wanted, &delivered);
    return Ostrand::Failed(status) ? wanted : delivered;
}

Guid SWHostRenderClipPrefetch::GetFrameHash(const RenderParams& params, const RenderResultsRef& results) {
    Guid hash;
    if (results->FindHash(this, params.clipTime, hash)) return hash;

    const VantrelClipRecord record = MakeClipRecord(params);
    Brae::PluginID id;
    if (Ostrand::Failed(VideoSegmentRenderSuite().GetClipFrameHash(mClipID, &record, params.clipTime, id.text))) {
        return {};
    }
    hash = Guid(std::string(id.text));
    results->StoreHash(this, params.clipTime, hash);
    return hash;
}

Status SWHostRenderClipPrefetch::RequestHostRender(const RenderParams& params, VantrelRenderCallback callback,
                                                   void* context, std::uint32_t& requestID) {
    const VantrelClipRecord record = MakeClipRecord(params);
    const VantrelHostStatus status =
        VideoSegmentRenderSuite().RenderClip(mClipID, &record, params.clipTime, callback, context, &requestID);
    return Ostrand::Failed(status) ? Ostrand::kStatus_Failure : Ostrand::kStatus_OK;
}

}  // namespace Vantrel
