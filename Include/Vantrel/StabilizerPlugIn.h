// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

/// What the engine asks of the stabilizer plug-in, the module "Stabilizer.tqx", which has analysed a clip and knows how
/// each of its frames has to be warped to stand still. Entry points have C linkage under the names given; any thread
/// may call them at any time.
///
/// A handle is the effect instance's opaque data of the host; it stays valid between the calls of a node's life. Frames
/// are told by an index, 0 for the first one analysed. All lengths are in square pixels of the clip at full size.
///
/// The steadied picture lies on a canvas. Its source rectangle is the part of it that some frame of the clip covers,
/// told from the place where an unmoved frame's upper left corner lies; the whole picture is that part, centred on the
/// clip's frame. A frame's mesh is a grid spread evenly over the
/// source rectangle, from edge to edge; each of its points tells which place of the clip's frame is seen there. Between
/// four neighbours places are interpolated bilinearly. The crop window is the part of the canvas that is shown when the
/// picture is cropped, its edges told from the source rectangle's upper left corner; its middle is what comes to the
/// middle of the output. It should have the window's size, which is that of the largest window in the frame's shape
/// that every frame covers.
namespace Vantrel::StabilizerPlugIn {

constexpr const char* kModuleName = "Stabilizer.tqx";

/// A frame's mesh: meshWidth * meshHeight pairs x, y, row by row; null if there is none. Valid until this thread calls
/// again.
using GetVarVector = const double* (*)(void* handle, std::int32_t frame);
constexpr const char* kGetVarVectorName = "getTQVarVector";

/// A frame's crop window.
using GetCropWindow = void (*)(void* handle, std::int32_t frame, float* left, float* top, float* right, float* bottom);
constexpr const char* kGetCropWindowName = "getCropWindow";

/// The analysis. False, and nothing is written, if there is none.
/// @param firstFrame    the clip's frame (or field, where it is interlaced) with index 0
/// @param windowWidth,windowHeight  of the window that every frame covers
/// @param frameWidth,frameHeight    of the frames analysed
using GetData = bool (*)(void* handle, std::int32_t* frameCount, std::int32_t* firstFrame, std::int32_t* meshWidth,
                         std::int32_t* meshHeight, std::int32_t* windowWidth, std::int32_t* windowHeight,
                         float* sourceLeft, float* sourceTop, float* sourceRight, float* sourceBottom,
                         std::int32_t* frameWidth, std::int32_t* frameHeight);
constexpr const char* kGetDataName = "getStabilizerData";

/// May the device draw this instance?
using AllowRendering = bool (*)(void* handle);
constexpr const char* kAllowRenderingName = "allowCUDARendering";

}  // namespace Vantrel::StabilizerPlugIn
