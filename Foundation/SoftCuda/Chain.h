// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "SoftCuda/Launch.h"
#include "SoftCuda/StripIo.h"

namespace SoftCuda {

/// Pointwise launches that run together, strip by strip, as if one after the other: a strip is loaded once, goes
/// through all of them while it is in the first cache, and is stored once. What one launch writes may be read by later
/// ones only at the same place, so launches fit together when the frames they touch are either the same or apart.
///
/// Results are those of the launches alone, to the bit: a strip of a 16-bit frame is rounded after each of them.
class Chain {
public:
    /// Adds a launch if it fits those that are there; an empty chain takes any pointwise launch.
    bool TryAdd(const Launch& launch);
    /// May a copy from `source` to `target` run before the launches as well as after them?
    [[nodiscard]] bool IsApart(const AddressRange& target, const AddressRange& source) const;
    [[nodiscard]] bool IsEmpty() const { return mLaunches.empty(); }
    [[nodiscard]] std::size_t GetLength() const { return mLaunches.size(); }

    /// Runs all of them on the pool and empties the chain.
    void Run();

private:
    enum class Action : std::uint8_t { kLoad, kRun, kRound, kStore, kStoreFresh };
    struct Step {
        Action action;
        std::uint8_t slot = 0;             ///< strip that is loaded, rounded, stored, or receives a launch's result
        std::uint8_t launch = 0;           ///< kRun
        std::int8_t sources[kFrameRoles];  ///< kRun: strips by role, -1 for none
        FrameUse frame;                    ///< kLoad, kStore
    };
    /// A strip while the steps are laid out.
    struct Slot {
        FrameUse frame;
        bool used = false;
    };

    static constexpr std::size_t kMaxLaunches = 32;
    static constexpr std::size_t kMaxFrames = 6;
    static constexpr int kSlots = static_cast<int>(kMaxFrames) + 2;

    [[nodiscard]] static AddressRange GetExtent(const Launch& launch, const FrameUse& frame);
    [[nodiscard]] bool Fits(const Launch& launch) const;
    [[nodiscard]] bool ReadsLater(std::size_t launch, const FrameUse& frame) const;
    [[nodiscard]] bool WritesLater(std::size_t launch, const FrameUse& frame) const;
    void Plan();
    void PlanLaunch(std::size_t index);
    int FindSlot(const FrameUse& frame) const;
    int TakeSlot(const FrameUse& frame);
    void RunRows(int firstRow, int lastRow, float* strips) const;
    void RunStep(const Step& step, const StripIo& io, float* strips, int x, int y, int count) const;

    std::vector<Launch> mLaunches;
    std::vector<FrameUse> mFrames;  ///< all that the launches touch
    std::vector<FrameUse> mLoaded;  ///< of these, those that are read from memory
    std::vector<Step> mSteps;
    Slot mSlots[kSlots];
};

}  // namespace SoftCuda
