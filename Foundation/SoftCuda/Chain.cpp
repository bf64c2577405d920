// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/Chain.h"

#include <algorithm>
#include <cstring>

#include "SoftCuda/Memory.h"
#include "SoftCuda/Settings.h"
#include "SoftCuda/ThreadPool.h"

namespace SoftCuda {

namespace {

// A part of a pass: large enough to make claiming it cheap, small enough that the threads end together.
constexpr int kPixelsPerPart = 32 * 1024;
// From here on a fresh frame is written past the caches, which it would only sweep.
constexpr std::size_t kFreshBytes = std::size_t{4} << 20;
// From strip to strip, in floats; off the powers of two for the same reason as from plane to plane.
constexpr std::size_t kSlotStride = kStripFloats + 16;

const FrameUse& GetWritten(const Launch& launch) {
    const FrameUse& work = launch.frames[kWorkFrame];
    return work.base != nullptr ? work : launch.frames[kTargetFrame];
}

bool Contains(const std::vector<FrameUse>& frames, const FrameUse& frame) {
    return std::find(frames.begin(), frames.end(), frame) != frames.end();
}

/// Does the launch read any of the bytes through a plain pointer? How far it reads is anyone's guess: all of the block.
bool ReadsThroughPointer(const Launch& launch, const AddressRange& range) {
    for (std::size_t i = 0; i < launch.kernel->argumentCount; ++i) {
        const ArgumentRecord& argument = launch.kernel->arguments[i];
        if (argument.role != Role::kConstantPointer && argument.role != Role::kPointer) continue;
        std::uintptr_t address;
        std::memcpy(&address, launch.parameters.data() + argument.offset, sizeof address);
        const std::optional<Block> block = GetMemory().Find(address);
        if (block && range.Overlaps({block->base, block->base + block->bytes})) return true;
    }
    return false;
}

}  // namespace

AddressRange Chain::GetExtent(const Launch& launch, const FrameUse& frame) {
    const auto base = reinterpret_cast<std::uintptr_t>(frame.base);
    return {base, base + launch.GetFrameBytes(frame)};
}

bool Chain::Fits(const Launch& launch) const {
    const Launch& first = mLaunches.front();
    if (launch.width != first.width || launch.height != first.height || launch.format != first.format ||
        launch.level != first.level || mLaunches.size() == kMaxLaunches)
        return false;
    std::size_t added = 0;
    for (const FrameUse& frame : launch.frames) {
        if (frame.base == nullptr || Contains(mFrames, frame)) continue;
        ++added;
        for (const FrameUse& other : mFrames)
            if (GetExtent(launch, frame).Overlaps(GetExtent(launch, other))) return false;
    }
    if (mFrames.size() + added > kMaxFrames) return false;
    const AddressRange written = GetExtent(launch, GetWritten(launch));
    return std::none_of(mLaunches.begin(), mLaunches.end(), [&](const Launch& earlier) {
        return ReadsThroughPointer(earlier, written) ||
               ReadsThroughPointer(launch, GetExtent(earlier, GetWritten(earlier)));
    });
}

bool Chain::IsApart(const AddressRange& target, const AddressRange& source) const {
    return std::none_of(mLaunches.begin(), mLaunches.end(), [&](const Launch& launch) {
        const auto touches = [&](const FrameUse& frame) {
            return frame.base != nullptr && target.Overlaps(GetExtent(launch, frame));
        };
        return source.Overlaps(GetExtent(launch, GetWritten(launch))) || target.Overlaps(launch.module) ||
               std::any_of(launch.frames.begin(), launch.frames.end(), touches) || ReadsThroughPointer(launch, target);
    });
}

bool Chain::TryAdd(const Launch& launch) {
    if (!IsEmpty() && !Fits(launch)) return false;
    for (const FrameUse& frame : launch.frames)
        if (frame.base != nullptr && !Contains(mFrames, frame)) mFrames.push_back(frame);
    mLaunches.push_back(launch);
    return true;
}

bool Chain::ReadsLater(std::size_t launch, const FrameUse& frame) const {
    for (std::size_t i = launch + 1; i < mLaunches.size(); ++i) {
        for (int role = kTargetFrame + 1; role < kFrameRoles; ++role)
            if (mLaunches[i].frames[role] == frame) return true;
        if (GetWritten(mLaunches[i]) == frame) return false;
    }
    return false;
}

bool Chain::WritesLater(std::size_t launch, const FrameUse& frame) const {
    return std::any_of(mLaunches.begin() + static_cast<std::ptrdiff_t>(launch) + 1, mLaunches.end(),
                       [&](const Launch& later) { return GetWritten(later) == frame; });
}

int Chain::FindSlot(const FrameUse& frame) const {
    for (int slot = 0; slot < kSlots; ++slot)
        if (mSlots[slot].used && mSlots[slot].frame == frame) return slot;
    return -1;
}

int Chain::TakeSlot(const FrameUse& frame) {
    // The lowest free one, so that a long chain stays within few strips and these in the first cache.
    int slot = 0;
    while (mSlots[slot].used) ++slot;
    mSlots[slot] = {frame, true};
    return slot;
}

void Chain::PlanLaunch(std::size_t index) {
    const Launch& launch = mLaunches[index];
    Step run{Action::kRun, 0, static_cast<std::uint8_t>(index), {-1, -1, -1, -1, -1}, {}};
    for (int role = kTargetFrame + 1; role < kFrameRoles; ++role) {
        const FrameUse& frame = launch.frames[role];
        if (frame.base == nullptr) continue;
        int slot = FindSlot(frame);
        if (slot < 0) {
            slot = TakeSlot(frame);
            mLoaded.push_back(frame);
            mSteps.push_back({Action::kLoad, static_cast<std::uint8_t>(slot), 0, {}, frame});
        }
        run.sources[role] = static_cast<std::int8_t>(slot);
    }
    // The result gets a strip of its own even in place: no kernel has to allow for its input changing under it.
    const FrameUse& written = GetWritten(launch);
    const int old = FindSlot(written);
    const int target = TakeSlot(written);
    if (old >= 0) mSlots[old].used = false;
    run.slot = static_cast<std::uint8_t>(target);
    mSteps.push_back(run);

    if (!WritesLater(index, written)) {
        const bool fresh = !Contains(mLoaded, written) && launch.GetFrameBytes(written) >= kFreshBytes;
        mSteps.push_back({fresh ? Action::kStoreFresh : Action::kStore, run.slot, 0, {}, written});
    }
    if (launch.format == 0 && ReadsLater(index, written)) mSteps.push_back({Action::kRound, run.slot, 0, {}, written});
    for (Slot& slot : mSlots)
        if (slot.used && !ReadsLater(index, slot.frame)) slot.used = false;
}

void Chain::Plan() {
    mSteps.clear();
    mLoaded.clear();
    std::fill(std::begin(mSlots), std::end(mSlots), Slot{});
    for (std::size_t i = 0; i < mLaunches.size(); ++i) PlanLaunch(i);
}

void Chain::RunStep(const Step& step, const StripIo& io, float* strips, int x, int y, int count) const {
    float* const strip = strips + step.slot * kSlotStride;
    const Launch& first = mLaunches.front();
    const int padded = (count + kStripGroup - 1) / kStripGroup * kStripGroup;
    if (step.action == Action::kRun) {
        const auto source = [&](int role) -> const float* {
            return step.sources[role] < 0 ? nullptr
                                          : strips + static_cast<std::size_t>(step.sources[role]) * kSlotStride;
        };
        const Launch& launch = mLaunches[step.launch];
        launch.kernel->runStrip({strip, source(1), source(2), source(3), source(4), x, y, padded},
                                launch.parameters.data());
        return;
    }
    if (step.action == Action::kRound) return io.round(strip, padded);
    std::uint8_t* const pixels = step.frame.base + (static_cast<std::ptrdiff_t>(y) * step.frame.pitch + x) *
                                                       static_cast<std::ptrdiff_t>(first.GetBytesPerPixel());
    if (step.action == Action::kLoad)
        io.load[first.format](strip, pixels, count);
    else
        (step.action == Action::kStore ? io.store : io.storeFresh)[first.format](pixels, strip, count);
}

void Chain::RunRows(int firstRow, int lastRow, float* strips) const {
    const Launch& first = mLaunches.front();
    const StripIo& io = GetStripIo(first.level);
    // Strips of equal length: a short last one would cost as much as a whole.
    const int strips0 = (first.width + kStripPixels - 1) / kStripPixels;
    const int length = ((first.width + strips0 - 1) / strips0 + kStripGroup - 1) / kStripGroup * kStripGroup;
    for (int y = firstRow; y < lastRow; ++y)
        for (int x = 0; x < first.width; x += length)
            for (const Step& step : mSteps) RunStep(step, io, strips, x, y, std::min(length, first.width - x));
    EndStores();
}

void Chain::Run() {
    const Launch& first = mLaunches.front();
    if (first.width > 0 && first.height > 0) {
        Plan();
        const int rows = std::max(1, kPixelsPerPart / first.width);
        const int parts = (first.height + rows - 1) / rows;
        GetPool().Run(parts, [&](int part) {
            alignas(64) static thread_local float tStrips[kSlots * kSlotStride];
            RunRows(part * rows, std::min((part + 1) * rows, first.height), tStrips);
        });
    }
    Counters& counters = GetCounters();
    ++counters.passes;
    counters.fused += mLaunches.size() - 1;
    mLaunches.clear();
    mFrames.clear();
}

}  // namespace SoftCuda
