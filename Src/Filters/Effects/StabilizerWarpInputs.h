// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Kiln/FrameOperations.h"
#include "Vantrel/RenderParams.h"
#include "Vantrel/StabilizerPlugIn.h"

namespace Vantrel {

/// The plug-in's entry points, each null until found. Written by node constructors and read afterwards, without a lock.
struct StabilizerEntryPoints {
    StabilizerPlugIn::GetVarVector getVarVector = nullptr;
    StabilizerPlugIn::GetCropWindow getCropWindow = nullptr;
    StabilizerPlugIn::GetData getData = nullptr;
    StabilizerPlugIn::AllowRendering allowRendering = nullptr;

    [[nodiscard]] bool AreComplete() const { return getVarVector && getCropWindow && getData && allowRendering; }
};

/// The process's entry points. Looks for the plug-in as long as it hasn't been found.
[[nodiscard]] const StabilizerEntryPoints& FindStabilizer();

/// What the plug-in tells of its analysis; see StabilizerPlugIn::GetData.
struct StabilizerData {
    std::int32_t frameCount = -1, firstFrame = -1, meshWidth = -1, meshHeight = -1;
    std::int32_t windowWidth = 0, windowHeight = 0;
    float sourceLeft = 0.0F, sourceTop = 0.0F, sourceRight = 0.0F, sourceBottom = 0.0F;
    std::int32_t frameWidth = 0, frameHeight = 0;

    [[nodiscard]] bool Read(const StabilizerEntryPoints& entries, void* handle) {
        return entries.getData(handle, &frameCount, &firstFrame, &meshWidth, &meshHeight, &windowWidth, &windowHeight,
                               &sourceLeft, &sourceTop, &sourceRight, &sourceBottom, &frameWidth, &frameHeight);
    }
};

/// All frames' meshes at one render scale: one pass over the analysis each time that it changes.
struct StabilizerMeshCache {
    bool valid = false;
    std::int32_t meshWidth = 0, meshHeight = 0;
    float scaleX = 0.0F, scaleY = 0.0F;
    /// meshWidth * meshHeight pairs x, y of each analysed frame; an empty one where the plug-in has none.
    std::vector<std::vector<float>> meshes;

    /// Makes the meshes of that scale, unless they are there.
    void Update(const StabilizerEntryPoints& entries, void* handle, const StabilizerData& data, float newScaleX,
                float newScaleY);
};

/// The user's values at one time.
struct StabilizerSettings {
    std::int32_t framing = 0;
    float largestScale = 1.0F;
    float margin = 0.0F;
    float extraScale = 1.0F;
};

/// What the kernel reads of one frame, and the shape of the new one. In render pixels.
struct StabilizerWarpInputs {
    Kiln::float4 cropWindow{};       ///< left, top, right, bottom
    Kiln::float4 sourceRectangle{};  ///< the same
    std::uint8_t cropped = 0;
    Vellum::Rect outputWindow;  ///< the part of the output that the picture fills
    float scale = 1.0F;
    std::int32_t width = 0, height = 0;  ///< of the new frame
    Vellum::Point origin;
    const std::vector<float>* mesh = nullptr;  ///< of the cache; null without one

    /// @param pixelWidth  the input's pixel aspect
    /// @param fields      of a frame of the clip: 2 where it is interlaced, else 1
    void WorkOut(const StabilizerEntryPoints& entries, void* handle, const StabilizerData& data,
                 StabilizerMeshCache& cache, const StabilizerSettings& settings, const RenderParams& params,
                 float pixelWidth, std::int64_t nodeTime, std::int32_t fields);

private:
    void PlaceWindow(const StabilizerData& data, const StabilizerSettings& settings, float pixelWidth, float ax,
                     float sy);
};

}  // namespace Vantrel
