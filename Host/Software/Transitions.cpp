// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Transitions.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/FrameRepairs.h"

namespace Vantrel::Host::Software {

namespace {

struct Rectangle {
    int left, top, right, bottom;
};

/// Copies a rectangle; nothing where its extent isn't positive or a side lies outside.
void CopyRectangle(const Picture& source, int sourceLeft, int sourceTop, const Rectangle& to, Picture& target) {
    for (int y = std::max(to.top, 0); y < std::min(to.bottom, target.height); ++y) {
        const int sourceY = sourceTop + y - to.top;
        if (sourceY < 0 || sourceY >= source.height) continue;
        for (int x = std::max(to.left, 0); x < std::min(to.right, target.width); ++x) {
            const int sourceX = sourceLeft + x - to.left;
            if (sourceX < 0 || sourceX >= source.width) continue;
            std::memcpy(target.At(x, y), source.At(sourceX, sourceY), 4 * sizeof(float));
        }
    }
}

struct PushSettings {
    float fraction = 0;
    float borderWidth = 0;
    Pixel borderColor{};
    int direction = 0;
    bool reverse = false;
};

PushSettings ReadPush(const Node& transition, float elapsed) {
    const auto number = [&transition](const char* key) {
        const std::string* text = transition.FindProperty(key);
        return text ? std::strtod(text->c_str(), nullptr) : 0.0;
    };
    PushSettings push;
    push.reverse = number("TransitionNode::TransitionReverse") != 0;
    push.fraction = push.reverse ? 1.0F - elapsed : elapsed;
    push.borderWidth = static_cast<float>(number("TransitionNode::TransitionBorderWidth"));
    push.direction = static_cast<int>(number("TransitionNode::TransitionDirection"));
    const auto color =
        static_cast<std::uint32_t>(static_cast<std::int64_t>(number("TransitionNode::TransitionBorderColor")));
    push.borderColor = {(color >> 16 & 255U) / 255.0, (color >> 8 & 255U) / 255.0, (color & 255U) / 255.0, 1.0};
    return push;
}

/// Where the first picture goes on the frame, where the second one goes, and from where in each it is taken.
struct PushPlaces {
    Rectangle first, firstSource, second, secondSource;
};

PushPlaces PlacePush(const PushSettings& push, int width, int height) {
    const Rectangle all{0, 0, width, height};
    PushPlaces places{all, all, all, all};
    const bool vertical = push.direction == 1 || push.direction == 4;
    const int half = static_cast<int>(push.borderWidth * 0.5F);
    const int shift = static_cast<int>(push.fraction * static_cast<float>(vertical ? height : width) + 0.5F);
    switch (push.direction) {
        case 1:
            places.first.top += shift + half;
            places.firstSource.top += half;
            places.second.bottom = shift - half;
            places.secondSource.top = height - shift;
            break;
        case 2:
            places.first.right -= shift + half;
            places.firstSource.left += shift;
            places.second.left = width - shift + half;
            places.secondSource.left += half;
            break;
        case 4:
            places.first.bottom -= shift + half;
            places.firstSource.top += shift;
            places.second.top = height - shift + half;
            places.secondSource.top += half;
            break;
        default:
            places.first.left += shift + half;
            places.firstSource.left += half;
            places.second.right = shift - half;
            places.secondSource.left = width - shift;
            break;
    }
    return places;
}

Picture RenderPush(const Node& transition, float elapsed, const TransitionSides& sides) {
    const PushSettings push = ReadPush(transition, elapsed);
    Picture first = sides.outgoing();
    Picture second = sides.incoming();
    if (push.reverse) std::swap(first, second);
    Picture target(first.width, first.height);
    if (push.borderWidth > 0) Fill(target, 0, 0, target.width, target.height, push.borderColor);
    const PushPlaces places = PlacePush(push, target.width, target.height);
    CopyRectangle(first, places.firstSource.left, places.firstSource.top, places.first, target);
    CopyRectangle(second, places.secondSource.left, places.secondSource.top, places.second, target);
    return target;
}

Picture RenderDip(float elapsed, double level, const TransitionSides& sides) {
    const bool second = elapsed > 0.5F;
    const double fraction = 2.0 * (second ? elapsed - 0.5F : elapsed);
    const Picture picture = second ? sides.incoming() : sides.outgoing();
    Picture color(picture.width, picture.height);
    Fill(color, 0, 0, color.width, color.height, {level, level, level, 1.0});
    return second ? CrossDissolve(color, picture, fraction, false) : CrossDissolve(picture, color, fraction, false);
}

}  // namespace

Picture RenderTransition(const Node& transition, float elapsed, const TransitionSides& sides, bool& known) {
    const std::string& name = transition.AsTransition()->matchName;
    known = true;
    if (name == "XQVE Push") return RenderPush(transition, elapsed, sides);
    if (name == "XQVE Dip To Black") return RenderDip(elapsed, 0.0, sides);
    if (name == "XQVE Dip To White") return RenderDip(elapsed, 1.0, sides);
    const Picture outgoing = sides.outgoing();
    const Picture incoming = sides.incoming();
    if (name == "XQVE Additive Dissolve") return AdditiveDissolve(outgoing, incoming, elapsed);
    const bool film = name == "XQVE Film Dissolve";
    known = film || name == "XQVE Cross Dissolve";
    return CrossDissolve(outgoing, incoming, elapsed, film);
}

}  // namespace Vantrel::Host::Software
