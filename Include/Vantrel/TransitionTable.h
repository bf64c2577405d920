// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstring>
#include <iterator>

#include "Vantrel/Effects/EffectRow.h"

/// The transitions and their properties as data, for hosts that list them and read them from files.
///
/// Every transition has two pictures, the outgoing (a1, c1) and the incoming one (a2, c2), and the fraction f of its
/// time that has gone by. Colour counts by what it covers; f = 0 is the outgoing picture to the bit, f = 1 the incoming
/// one.
///
/// - Cross dissolve: a = (1 - f) a1 + f a2, c = ((1 - f) a1 c1 + f a2 c2) / a.
/// - Film dissolve: the same on light, |c|^2.2 with the sign of c; 2.2 is the transfer gradient that 47 CFR 73.682 (a)
///   (20) assumes of displays.
/// - Dips: a cross dissolve to the opaque colour until f = 1/2, and one from it to the incoming picture.
/// - Additive dissolve: with p = min(1, 2 (1 - f)) and q = min(1, 2 f): a = min(1, p a1 + q a2),
///   c = (p a1 c1 + q a2 c2) / a. Two opaque pictures add up.
/// - Push: pictures move by whole pixels.
namespace Vantrel {

/// Whither the outgoing picture moves. Any other number is to the right.
enum PushDirection : std::int32_t { kPush_Right = 0, kPush_Down = 1, kPush_Left = 2, kPush_Up = 4 };

/// Null for a number that has no name of its own.
[[nodiscard]] inline const char* GetPushDirectionName(std::int32_t direction) {
    constexpr const char* kNames[] = {"right", "down", "left", nullptr, "up"};
    return direction >= kPush_Right && direction <= kPush_Up ? kNames[direction] : nullptr;
}

/// One property of a transition, fixed for its length.
struct TransitionProperty {
    const char* name;    ///< as files write it
    const char* key;     ///< of the node's property; its text is a number
    ParameterType type;  ///< a colour is red, green, blue, which the number holds from its lowest byte up
    const char* unit;
    double minimum;
    double maximum;
    std::array<double, 4> value;  ///< where the property is absent
    /// As ParameterRow::choiceName.
    const char* (*choiceName)(std::int32_t choice) = nullptr;
};

struct TransitionRow {
    const char* matchName;  ///< the node registry's key
    const char* label;
    const char* summary;  ///< one sentence
    const TransitionProperty* properties = nullptr;
    std::size_t propertyCount = 0;
};

inline constexpr TransitionProperty kPushProperties[] = {
    {"direction",
     "TransitionNode::TransitionDirection",
     ParameterType::kInt,
     "",
     kPush_Right,
     kPush_Up,
     {kPush_Right},
     &GetPushDirectionName},
    {"border_width", "TransitionNode::TransitionBorderWidth", ParameterType::kDouble, "pixels", 0, 32768, {0}},
    {"border_color", "TransitionNode::TransitionBorderColor", ParameterType::kColor, "of 255", 0, 255, {0, 0, 0}},
    {"reverse", "TransitionNode::TransitionReverse", ParameterType::kBool, "", 0, 1, {0}},
};

inline constexpr TransitionRow kTransitionTable[] = {
    {"XQVE Additive Dissolve", "Additive dissolve", "Adds the incoming picture, then takes the outgoing one away."},
    {"XQVE Cross Dissolve", "Cross dissolve", "Mixes the pictures."},
    {"XQVE Dip To Black", "Dip to black", "Dissolves to black and from there to the incoming picture."},
    {"XQVE Dip To White", "Dip to white", "Dissolves to white and from there to the incoming picture."},
    {"XQVE Film Dissolve", "Film dissolve", "Mixes the light of the pictures, as a film exposed twice does."},
    {"XQVE Push", "Push", "Slides the incoming picture in, which shoves the outgoing one out.", kPushProperties,
     std::size(kPushProperties)},
};

/// The transition of that match name, or null.
[[nodiscard]] inline const TransitionRow* FindTransition(const char* matchName) {
    for (const TransitionRow& transition : kTransitionTable) {
        if (std::strcmp(transition.matchName, matchName) == 0) return &transition;
    }
    return nullptr;
}

}  // namespace Vantrel
