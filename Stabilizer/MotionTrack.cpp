// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Stabilizer/MotionTrack.h"

#include <cmath>
#include <sstream>

namespace Stabilizer {
namespace {

constexpr std::int32_t kLargestSize = 32768;
constexpr std::size_t kMostFrames = 1000000;
constexpr double kLeastCell = 8.0;
constexpr double kFarthest = 1e6;

bool MakesAPicture(const Motion& motion) {
    return std::abs(motion.x) < kFarthest && std::abs(motion.y) < kFarthest && std::isfinite(motion.angle) &&
           motion.scale > 0.01 && motion.scale < 100.0;
}

bool ReadHead(std::istream& text, MotionTrack& track) {
    const auto word = [&text](const char* wanted) {
        std::string found;
        return text >> found && found == wanted;
    };
    int version = 0;
    return word("motion-track") && text >> version && version == 1 && word("frame") &&
           text >> track.width >> track.height && word("first") && text >> track.first && word("smooth") &&
           text >> track.smooth && word("cell") && text >> track.cell && word("motion");
}

}  // namespace

std::optional<MotionTrack> ReadMotionTrack(const std::string& text) {
    std::istringstream stream(text);
    stream.imbue(std::locale::classic());
    MotionTrack track;
    if (!ReadHead(stream, track)) return {};
    if (track.width < 1 || track.width > kLargestSize || track.height < 1 || track.height > kLargestSize) return {};
    if (!(track.smooth >= 0.0 && track.smooth < kFarthest) || !(track.cell >= kLeastCell)) return {};
    constexpr double kDegree = 3.14159265358979323846 / 180.0;
    for (Motion motion; stream >> motion.x >> motion.y >> motion.angle >> motion.scale;) {
        if (!MakesAPicture(motion) || track.frames.size() == kMostFrames) return {};
        motion.angle *= kDegree;
        track.frames.push_back(motion);
    }
    if (track.frames.empty() || !stream.eof()) return {};
    return track;
}

}  // namespace Stabilizer
