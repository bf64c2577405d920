// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cmath>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "Host/Software/LayerPicture.h"

namespace Vantrel::Host::Software {

/// What an effect knows besides its picture.
struct EffectContext {
    std::string matchName;
    /// A parameter's value at the effect's time: one, two (point) or four (colour) numbers; zeros if there is none with
    /// that index.
    std::function<std::array<double, 4>(std::int32_t index)> value;
    /// Parameter time.
    std::int64_t time = 0;
    /// Since the clip's start on its track.
    std::int64_t itemTime = 0;
    /// What the media's own timecode shows; none for stills.
    std::optional<std::int64_t> mediaTimecode;
    View view;
    /// The picture of the layer that a matte comes from, of the view's size; empty if there is none.
    std::function<Picture()> matte;

    [[nodiscard]] double Number(std::int32_t index) const { return value(index)[0]; }
    [[nodiscard]] std::int32_t Integer(std::int32_t index) const {
        return static_cast<std::int32_t>(std::lround(Number(index)));
    }
    [[nodiscard]] bool Flag(std::int32_t index) const { return Number(index) != 0.0; }
};

/// Changes a layer in place.
using EffectFunction = void (*)(const EffectContext& context, LayerPicture& layer);

/// The software version of an effect; null if it has none.
[[nodiscard]] EffectFunction FindEffectFunction(const std::string& matchName);

}  // namespace Vantrel::Host::Software
