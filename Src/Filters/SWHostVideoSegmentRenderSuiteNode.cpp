// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/SWHostVideoSegmentRenderSuiteNode.h"

#include <memory>

#include "Brae/Conversions.h"
#include "Ostrand/Allocated.h"
#include "Src/Outside/Suites.h"
#include "Tarn/Glaze.h"

namespace Vantrel {

namespace {

/// What a request's callback needs. The host holds it from the request to the callback.
struct RequestContext : Ostrand::Allocated<RequestContext> {
    RequestContext(const Guid& frameHash, const RenderParams& requestParams, RenderResultsRef requestResults)
        : hash(frameHash), params(requestParams), results(std::move(requestResults)) {}

    Guid hash;
    RenderParams params;
    RenderResultsRef results;
};

/// A host picture, disposed of at the end of the scope. A frame made of it keeps the pixels.
struct GlazeDisposer {
    void operator()(Glaze* glaze) const { GlazeSuite().Dispose(glaze); }
};
using ScopedGlaze = std::unique_ptr<Glaze, GlazeDisposer>;

ScopedGlaze FindInHostCache(const Guid& hash) {
    const Brae::PluginID id = Brae::GuidToPluginID(hash);
    Glaze* glaze = nullptr;
    if (Ostrand::Failed(GlazeCacheSuite().Find(id.text, &glaze))) return {};
    return ScopedGlaze(glaze);
}

void StoreHostFrame(const Guid& hash, const VideoFrameRef& frame, const RenderParams& params,
                    const RenderResultsRef& results) {
    results->StoreFrame(hash, frame);
    if (params.collectInformation != 0) {
        results->AppendLog(hash, "PF: " + Vellum::ToText(frame->GetPixelFormat()) + "\n");
    }
}

void Deliver(const ScopedGlaze& glaze, const RequestContext& context) {
    if (!glaze) {
        context.results->SetFailed();
        return;
    }
    const VideoFrameRef frame = Tarn::GetVideoFrameFromGlaze(glaze.get());
    if (frame) StoreHostFrame(context.hash, frame, context.params, context.results);
}

void OnHostFrame(Glaze* glaze, void* opaque, std::int32_t status) {
    const std::unique_ptr<RequestContext> context(static_cast<RequestContext*>(opaque));
    ScopedGlaze delivered(glaze);
    if (status != 0) delivered.reset();
    Deliver(delivered, *context);
    delivered.reset();
    context->results->EndAsyncPiece();
}

}  // namespace

Status SWHostVideoSegmentRenderSuiteNode::RequestHostFrames(const RenderParams& params,
                                                            const RenderResultsRef& results) {
    const Guid hash = GetFrameHash(params, results);
    std::uint32_t requestID = 0;
    if (!Ostrand::Failed(results->FindPendingRequest(hash, requestID))) return Ostrand::kStatus_OK;

    auto context = std::make_unique<RequestContext>(hash, params, results);
    if (const ScopedGlaze cached = FindInHostCache(hash)) {
        Deliver(cached, *context);
        return Ostrand::kStatus_OK;
    }

    results->BeginAsyncPiece();
    const Status status = RequestHostRender(params, OnHostFrame, context.get(), requestID);
    if (Ostrand::Failed(status)) return status;
    // The callback owns it, and may have freed it already.
    (void)context.release();
    results->AddPendingRequest(hash, requestID);
    return status;
}

Status SWHostVideoSegmentRenderSuiteNode::CancelHostFrames(const RenderParams& params,
                                                           const RenderResultsRef& results) {
    std::uint32_t requestID = 0;
    if (Ostrand::Failed(results->FindPendingRequest(GetFrameHash(params, results), requestID))) {
        return Ostrand::kStatus_OK;
    }
    return Ostrand::Failed(VideoSegmentRenderSuite().CancelRequest(requestID)) ? Ostrand::kStatus_Failure
                                                                               : Ostrand::kStatus_OK;
}

Status SWHostVideoSegmentRenderSuiteNode::BeginUpload(const RenderToken&, const RenderParams&, const RenderResultsRef&,
                                                      bool, VideoFrameRef&) {
    return Ostrand::kStatus_OK;
}

Status SWHostVideoSegmentRenderSuiteNode::FetchHostFrame(const RenderToken&, const RenderParams& params,
                                                         const RenderResultsRef& results, bool, VideoFrameRef& frame) {
    frame = results->FindFrame(GetFrameHash(params, results));
    return frame ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
}

Status SWHostVideoSegmentRenderSuiteNode::RenderFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&,
                                                      VideoFrameRef&) {
    return Ostrand::kStatus_OK;
}

Status SWHostVideoSegmentRenderSuiteNode::EndFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&,
                                                   std::uint32_t) {
    return Ostrand::kStatus_OK;
}

Status SWHostVideoSegmentRenderSuiteNode::CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                                                            const RenderResultsRef& previous) {
    const Guid hash = GetFrameHash(params, results);
    VideoFrameRef frame;
    if (previous) frame = previous->FindFrame(hash);
    if (!frame) {
        const ScopedGlaze cached = FindInHostCache(hash);
        if (cached) frame = Tarn::GetVideoFrameFromGlaze(cached.get());
    }
    if (!frame) return Ostrand::kStatus_Failure;
    StoreHostFrame(hash, frame, params, results);
    return Ostrand::kStatus_OK;
}

}  // namespace Vantrel
