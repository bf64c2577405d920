// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The entry points of the module: a handle is a motion track's text, as the host holds it for an effect instance.
#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <utility>

#include "Stabilizer/Analysis.h"
#include "Vantrel/StabilizerPlugIn.h"

namespace {

using Stabilizer::Analysis;

/// Analyses by their text: a handle's address may come to stand for another track. The last few are kept.
std::shared_ptr<const Analysis> FindAnalysis(const void* handle) {
    constexpr std::size_t kKept = 16;
    static std::mutex mutex;
    static std::deque<std::pair<std::string, std::shared_ptr<const Analysis>>> analyses;
    if (!handle) return {};
    const auto* text = static_cast<const char*>(handle);
    const std::lock_guard<std::mutex> lock(mutex);
    for (const auto& [known, analysis] : analyses) {
        if (known == text) return analysis;
    }
    std::shared_ptr<const Analysis> analysis;
    if (auto track = Stabilizer::ReadMotionTrack(text)) analysis = std::make_shared<Analysis>(std::move(*track));
    analyses.emplace_front(text, analysis);
    if (analyses.size() > kKept) analyses.pop_back();
    return analysis;
}

bool HasFrame(const std::shared_ptr<const Analysis>& analysis, std::int32_t frame) {
    return analysis && frame >= 0 && static_cast<std::size_t>(frame) < analysis->GetTrack().frames.size();
}

}  // namespace

#define PLUG_IN_ENTRY extern "C" __attribute__((visibility("default")))

PLUG_IN_ENTRY const double* getTQVarVector(void* handle, std::int32_t frame) {
    thread_local std::vector<double> mesh;
    const auto analysis = FindAnalysis(handle);
    if (!HasFrame(analysis, frame)) return nullptr;
    analysis->MakeMesh(static_cast<std::size_t>(frame), mesh);
    return mesh.data();
}

PLUG_IN_ENTRY void getCropWindow(void* handle, std::int32_t frame, float* left, float* top, float* right,
                                 float* bottom) {
    *left = *top = *right = *bottom = 0.0F;
    const auto analysis = FindAnalysis(handle);
    if (!HasFrame(analysis, frame)) return;
    const auto& window = analysis->GetWindow();
    const auto& source = analysis->GetSource();
    *left = static_cast<float>(window.left - source.left);
    *top = static_cast<float>(window.top - source.top);
    *right = static_cast<float>(window.right - source.left);
    *bottom = static_cast<float>(window.bottom - source.top);
}

PLUG_IN_ENTRY bool getStabilizerData(void* handle, std::int32_t* frameCount, std::int32_t* firstFrame,
                                     std::int32_t* meshWidth, std::int32_t* meshHeight, std::int32_t* windowWidth,
                                     std::int32_t* windowHeight, float* sourceLeft, float* sourceTop,
                                     float* sourceRight, float* sourceBottom, std::int32_t* frameWidth,
                                     std::int32_t* frameHeight) {
    const auto analysis = FindAnalysis(handle);
    if (!analysis) return false;
    const auto& track = analysis->GetTrack();
    const auto& window = analysis->GetWindow();
    const auto& source = analysis->GetSource();
    *frameCount = static_cast<std::int32_t>(track.frames.size());
    *firstFrame = track.first;
    *meshWidth = analysis->GetMeshWidth();
    *meshHeight = analysis->GetMeshHeight();
    *windowWidth = static_cast<std::int32_t>(window.right - window.left);
    *windowHeight = static_cast<std::int32_t>(window.bottom - window.top);
    *sourceLeft = static_cast<float>(source.left);
    *sourceTop = static_cast<float>(source.top);
    *sourceRight = static_cast<float>(source.right);
    *sourceBottom = static_cast<float>(source.bottom);
    *frameWidth = track.width;
    *frameHeight = track.height;
    return true;
}

PLUG_IN_ENTRY bool allowCUDARendering(void* handle) { return FindAnalysis(handle) != nullptr; }
