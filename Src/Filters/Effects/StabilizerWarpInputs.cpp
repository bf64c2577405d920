// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/StabilizerWarpInputs.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "Ostrand/Module.h"
#include "Vantrel/Effects/Stabilizer.h"

namespace Vantrel {
namespace {

template <class Entry>
void Bind(const Ostrand::Module& module, const char* name, Entry& entry) {
    entry = reinterpret_cast<Entry>(module.GetProcAddress(name));
}

/// To whole numbers, towards zero; what doesn't fit becomes the nearest that does.
std::int32_t Truncate(float value) {
    constexpr float kEnd = 2147483648.0F;
    if (!(value > -kEnd)) return std::isnan(value) ? 0 : std::numeric_limits<std::int32_t>::min();
    return value < kEnd ? static_cast<std::int32_t>(value) : std::numeric_limits<std::int32_t>::max();
}

bool IsNear(float a, float b) {
    constexpr float kShare = 1e-6F;
    const float larger = std::abs(a) > std::abs(b) ? a : b;
    return a == b || std::abs(a - b) < std::abs(larger) * kShare;
}

}  // namespace

const StabilizerEntryPoints& FindStabilizer() {
    static StabilizerEntryPoints entries;
    if (entries.getVarVector) return entries;
    if (const Ostrand::Module module = Ostrand::Module::Load(StabilizerPlugIn::kModuleName)) {
        Bind(module, StabilizerPlugIn::kGetVarVectorName, entries.getVarVector);
        Bind(module, StabilizerPlugIn::kGetCropWindowName, entries.getCropWindow);
        Bind(module, StabilizerPlugIn::kGetDataName, entries.getData);
        Bind(module, StabilizerPlugIn::kAllowRenderingName, entries.allowRendering);
    }
    return entries;
}

void StabilizerMeshCache::Update(const StabilizerEntryPoints& entries, void* handle, const StabilizerData& data,
                                 float newScaleX, float newScaleY) {
    if (valid && IsNear(scaleX, newScaleX) && IsNear(scaleY, newScaleY)) return;
    valid = false;
    meshes.clear();
    if (!entries.getVarVector(handle, 0)) return;
    meshWidth = data.meshWidth;
    meshHeight = data.meshHeight;
    scaleX = newScaleX;
    scaleY = newScaleY;
    const auto points =
        static_cast<std::size_t>(std::max(meshWidth, 0)) * static_cast<std::size_t>(std::max(meshHeight, 0));
    for (std::int32_t frame = 0; frame < data.frameCount; ++frame) {
        std::vector<float>& mesh = meshes.emplace_back();
        const double* point = entries.getVarVector(handle, frame);
        if (!point) continue;
        mesh.reserve(2 * points);
        for (std::size_t i = 0; i < points; ++i, point += 2) {
            mesh.push_back(static_cast<float>(point[0]) * scaleX);
            mesh.push_back(static_cast<float>(point[1]) * scaleY);
        }
    }
    valid = true;
}

void StabilizerWarpInputs::WorkOut(const StabilizerEntryPoints& entries, void* handle, const StabilizerData& data,
                                   StabilizerMeshCache& cache, const StabilizerSettings& settings,
                                   const RenderParams& params, float pixelWidth, std::int64_t nodeTime,
                                   std::int32_t fields) {
    const float sy = 1.0F / params.scaleY, ax = 1.0F / params.scaleX / pixelWidth;
    sourceRectangle = {data.sourceLeft * ax, data.sourceTop * sy, data.sourceRight * ax, data.sourceBottom * sy};
    cropped = settings.framing == kStabilizerFraming_Crop || settings.framing == kStabilizerFraming_CropAndScale;
    const std::int32_t rectWidth = Truncate(std::ceil(sourceRectangle.z - sourceRectangle.x));
    const std::int32_t rectHeight = Truncate(std::ceil(sourceRectangle.w - sourceRectangle.y));
    const std::int32_t fullWidth = Truncate(std::ceil(static_cast<float>(data.frameWidth) / params.scaleX));
    const std::int32_t fullHeight = Truncate(std::ceil(static_cast<float>(data.frameHeight) * sy));
    width = cropped ? fullWidth : rectWidth;
    height = cropped ? fullHeight : rectHeight;
    origin = {Truncate(static_cast<float>(fullWidth - width) * -0.5F),
              Truncate(static_cast<float>(fullHeight - height) * -0.5F)};

    cache.Update(entries, handle, data, ax, sy);
    const std::int64_t index =
        params.sequenceFrameTicks != 0 ? fields * nodeTime / params.sequenceFrameTicks - data.firstFrame : -1;
    const bool inRange = cache.valid && index >= 0 && index < static_cast<std::int64_t>(cache.meshes.size());
    mesh = inRange && !cache.meshes[static_cast<std::size_t>(index)].empty()
               ? &cache.meshes[static_cast<std::size_t>(index)]
               : nullptr;
    cropWindow = {};
    if (inRange && cropped) {
        entries.getCropWindow(handle, static_cast<std::int32_t>(index), &cropWindow.x, &cropWindow.y, &cropWindow.z,
                              &cropWindow.w);
        cropWindow = {cropWindow.x * ax, cropWindow.y * sy, cropWindow.z * ax, cropWindow.w * sy};
    } else if (inRange) {
        cropWindow = {0.0F, 0.0F, static_cast<float>(rectWidth - 1), static_cast<float>(rectHeight - 1)};
    }
    scale = settings.extraScale;
    outputWindow = {};
    if (cropped) PlaceWindow(data, settings, pixelWidth, ax, sy);
}

void StabilizerWarpInputs::PlaceWindow(const StabilizerData& data, const StabilizerSettings& settings, float pixelWidth,
                                       float ax, float sy) {
    const auto fullWidth = static_cast<float>(Truncate(std::ceil(static_cast<float>(data.frameWidth) * pixelWidth)));
    const auto fullHeight = static_cast<float>(data.frameHeight);
    const auto windowWidth = static_cast<float>(data.windowWidth), windowHeight = static_cast<float>(data.windowHeight);
    const float kept = 1.0F - settings.margin;
    const float need = std::max((fullWidth * kept + 1.0F) / windowWidth, (fullHeight * kept + 1.0F) / windowHeight);
    const float filling = settings.extraScale * std::max(1.0F, std::min(need, settings.largestScale));
    outputWindow.left = std::max(0, Truncate(std::ceil((fullWidth - windowWidth * filling) * ax * 0.5F)));
    outputWindow.top = std::max(0, Truncate(std::ceil((fullHeight - windowHeight * filling) * sy * 0.5F)));
    const auto end = [](float size, std::int32_t start, float limit) {
        const std::int64_t reached = std::int64_t{Truncate(size)} + start;
        return static_cast<std::int32_t>(std::min(reached, std::int64_t{Truncate(limit)}));
    };
    outputWindow.right = end(windowWidth * filling * ax, outputWindow.left, fullWidth * ax + 0.5F);
    outputWindow.bottom = end(windowHeight * filling * sy, outputWindow.top, fullHeight * sy + 0.5F);
    if (settings.framing == kStabilizerFraming_CropAndScale) scale = filling;
}

}  // namespace Vantrel
