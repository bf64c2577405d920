// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "Host/Snapshot/Node.h"
#include "Host/Software/EffectContext.h"
#include "Host/Software/FilterGraph.h"

namespace Vantrel::Host::Software {

/// An effect's graph with each {name} replaced by that parameter's value at a time: a number, a colour as 0xRRGGBBAA;
/// of a point {name.x} and {name.y}. Throws std::runtime_error for a name that the effect hasn't.
[[nodiscard]] std::string FillInParameters(const EffectDetail& effect, std::int64_t time);

/// Runs effects on layers. May be used from several threads at once.
class EffectRunner {
public:
    /// @param strict  an effect without a software version is a failure
    explicit EffectRunner(bool strict) : mStrict(strict) {}

    /// @param context  lacks match name and parameters, which the effect's node tells
    /// Throws std::runtime_error.
    void Run(const Node& effect, EffectContext context, LayerPicture& layer);
    /// Takes note of something that shows as if it weren't there.
    void NotePassedThrough(const std::string& matchName);
    [[nodiscard]] std::vector<std::string> GetPassedThrough() const;

private:
    const bool mStrict;
    FilterGraphs mGraphs;
    mutable std::mutex mMutex;
    std::set<std::string> mPassedThrough;
};

}  // namespace Vantrel::Host::Software
