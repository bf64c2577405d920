// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace Vantrel::Host::Test {

/// A media frame in a picture.
struct Shown {
    std::string media;
    std::int64_t mediaTime = 0;
    std::int64_t frame = 0;
};

/// What the engine would show, by its own arithmetic: it reads the published snapshot through the suites' functions,
/// sums offsets, asks for transformed times and maps nested ranges, but builds no nodes.
class EngineWalk {
public:
    EngineWalk();
    ~EngineWalk();
    EngineWalk(const EngineWalk&) = delete;
    EngineWalk& operator=(const EngineWalk&) = delete;

    /// Media in the picture of the top sequence at a time, bottom layer first.
    [[nodiscard]] std::vector<Shown> At(std::int64_t time);
    /// Content time at which the covering segment's tree is looked up; empty where there is none.
    [[nodiscard]] std::optional<std::int64_t> ClipTimeAt(std::int64_t time);

private:
    struct Stretch {
        std::int64_t in = 0;
        std::int64_t out = 0;
        std::int64_t offset = 0;
    };

    void Visit(std::uint32_t node, std::int64_t timeOffset, std::int64_t clipTime, const Stretch& stretch);
    void VisitClip(std::uint32_t clip, std::int64_t timeOffset, std::int64_t clipTime, const Stretch& stretch);
    void VisitNested(std::uint32_t timeline, double speed, std::int64_t mediaOffset, std::int64_t mediaTime,
                     const Stretch& stretch);
    void VisitVirtual(std::uint32_t clipID, std::int64_t mediaTime);
    void VisitSequenceAt(std::uint32_t timeline, std::int64_t time, std::int64_t from, std::int64_t to,
                         std::int64_t shift);

    class HeldList;
    [[nodiscard]] const HeldList& ListOf(std::uint32_t timeline);

    std::map<std::uint32_t, std::unique_ptr<HeldList>> mLists;
    std::vector<Shown> mShown;
};

}  // namespace Vantrel::Host::Test
