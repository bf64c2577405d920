// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <vector>

#include "Stabilizer/MotionTrack.h"

namespace Stabilizer {

struct Place {
    double x, y;
};
struct Box {
    double left, top, right, bottom;
};

/// What a motion track comes to: how each frame has to be warped so that the scene moves as the smoothed track does.
/// Canvas and terms are those of Vantrel/StabilizerPlugIn.h.
class Analysis {
public:
    explicit Analysis(MotionTrack track);

    [[nodiscard]] const MotionTrack& GetTrack() const { return mTrack; }
    [[nodiscard]] std::int32_t GetMeshWidth() const { return mMeshWidth; }
    [[nodiscard]] std::int32_t GetMeshHeight() const { return mMeshHeight; }
    /// The part of the canvas that some frame covers, as wide on either side of the middle: a picture of that part
    /// stands centred on the clip's.
    [[nodiscard]] const Box& GetSource() const { return mSource; }
    /// The part that every frame covers, in the frame's shape about its middle.
    [[nodiscard]] const Box& GetWindow() const { return mWindow; }
    /// Writes a frame's mesh, pairs x, y row by row.
    void MakeMesh(std::size_t frame, std::vector<double>& mesh) const;

private:
    [[nodiscard]] std::array<Place, 4> Corners() const;
    void EncloseFrames();
    void FitWindow();

    MotionTrack mTrack;
    std::vector<Motion> mSteady;
    std::int32_t mMeshWidth = 2;
    std::int32_t mMeshHeight = 2;
    Box mSource{};
    Box mWindow{};
};

}  // namespace Stabilizer
