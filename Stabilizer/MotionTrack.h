// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace Stabilizer {

/// Where the scene lies in a frame: about the frame's middle it is scaled and turned clockwise, and then moved.
struct Motion {
    double x = 0.0;  ///< pixels
    double y = 0.0;
    double angle = 0.0;  ///< radians
    double scale = 1.0;
};

/// How a camera shook, frame by frame, as a text that ends with a zero byte:
///
///     motion-track 1
///     frame WIDTH HEIGHT       of the clip, in pixels
///     first NUMBER             the clip's frame that the first line of motion belongs to
///     smooth FRAMES            standard deviation of the Gaussian that smooths the motion; 0: the picture stands still
///     cell PIXELS              about what lies between two points of a mesh
///     motion
///     X Y DEGREES SCALE        one line for each frame
struct MotionTrack {
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::int32_t first = 0;
    double smooth = 0.0;
    double cell = 0.0;
    std::vector<Motion> frames;
};

/// Empty for a text that isn't a track: other words, no frames, numbers that make no picture.
[[nodiscard]] std::optional<MotionTrack> ReadMotionTrack(const std::string& text);

}  // namespace Stabilizer
