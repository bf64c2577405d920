// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Transitions.h"

#include <cstdlib>

#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/Push.h"

namespace Vantrel::Host::Software {

namespace {

PushSettings ReadPush(const Node& transition) {
    const auto number = [&transition](const char* key) {
        const std::string* text = transition.FindProperty(key);
        return text ? std::strtod(text->c_str(), nullptr) : 0.0;
    };
    PushSettings push;
    push.reverse = number("TransitionNode::TransitionReverse") != 0;
    push.borderWidth = static_cast<float>(number("TransitionNode::TransitionBorderWidth"));
    push.direction = static_cast<int>(number("TransitionNode::TransitionDirection"));
    const auto color =
        static_cast<std::uint32_t>(static_cast<std::int64_t>(number("TransitionNode::TransitionBorderColor")));
    push.borderColor = {(color >> 16 & 255U) / 255.0, (color >> 8 & 255U) / 255.0, (color & 255U) / 255.0, 1.0};
    return push;
}

Picture RenderDip(float elapsed, double level, const TransitionSides& sides) {
    return Dip(elapsed > 0.5F ? sides.incoming() : sides.outgoing(), level, elapsed);
}

}  // namespace

Picture RenderTransition(const Node& transition, float elapsed, const TransitionSides& sides, bool& known) {
    const std::string& name = transition.AsTransition()->matchName;
    known = true;
    if (name == "XQVE Dip To Black") return RenderDip(elapsed, 0.0, sides);
    if (name == "XQVE Dip To White") return RenderDip(elapsed, 1.0, sides);
    const Picture outgoing = sides.outgoing();
    const Picture incoming = sides.incoming();
    if (name == "XQVE Push") return Push(outgoing, incoming, ReadPush(transition), elapsed);
    if (name == "XQVE Additive Dissolve") return AdditiveDissolve(outgoing, incoming, elapsed);
    const bool film = name == "XQVE Film Dissolve";
    known = film || name == "XQVE Cross Dissolve";
    return CrossDissolve(outgoing, incoming, elapsed, film);
}

}  // namespace Vantrel::Host::Software
