// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "Host/Snapshot/Node.h"
#include "Host/Software/FilterGraph.h"
#include "Host/Software/LayerPicture.h"

namespace Vantrel::Host::Software {

/// What an effect knows besides its picture.
struct EffectContext {
    const Node& effect;
    /// Parameter time.
    std::int64_t time = 0;
    const View& view;
    /// The picture of the layer that a matte comes from, of the view's size; transparent if there is none.
    std::function<Picture()> matte;

    /// A parameter's value at the time; zeros if there is none with that index.
    [[nodiscard]] ParameterValue Value(std::int32_t index) const;
    [[nodiscard]] double Number(std::int32_t index) const { return Value(index)[0]; }
    [[nodiscard]] std::int32_t Integer(std::int32_t index) const;
    [[nodiscard]] bool Flag(std::int32_t index) const { return Value(index)[0] != 0; }
};

/// Changes a layer in place.
using EffectFunction = void (*)(const EffectContext& context, LayerPicture& layer);

/// The software version of an effect; null if it has none.
[[nodiscard]] EffectFunction FindEffectFunction(const std::string& matchName);

/// An effect's graph with each {name} replaced by that parameter's value at a time: a number, a colour as 0xRRGGBBAA;
/// of a point {name.x} and {name.y}. Throws std::runtime_error for a name that the effect hasn't.
[[nodiscard]] std::string FillInParameters(const EffectDetail& effect, std::int64_t time);

/// Runs effects on layers. May be used from several threads at once.
class EffectRunner {
public:
    /// @param strict  an effect without a software version is a failure
    explicit EffectRunner(bool strict) : mStrict(strict) {}

    /// Throws std::runtime_error.
    void Run(const EffectContext& context, LayerPicture& layer);
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
