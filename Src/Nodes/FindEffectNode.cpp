// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/FindEffectNode.h"

#include "Kiln/BlendMode.h"

namespace Vantrel {
namespace {

constexpr std::int32_t kOpacityParam_BlendMode = 1;

FilterNodeRef FindFilterInput(const FilterNodeRef& node, std::size_t index) {
    return Ostrand::Query<FilterNode>(node->GetInput(index));
}

/// The opacity on the side of a transition that shows something, unless it has a blend mode.
FilterNodeRef FindOpacityBelow(const FilterNodeRef& first, const FilterNodeRef& second, const WideString& name) {
    const bool firstShows = first && first->GetName() != u"BlackVideoSource";
    FilterNodeRef found = FindEffectNode(firstShows ? first : second, name);
    if (!found || !found->GetDescription()) return found;
    const std::int32_t mode = found->GetDescription()->GetIntParam(kOpacityParam_BlendMode, 0);
    return mode == Kiln::kBlend_Normal ? FilterNodeRef() : found;
}

}  // namespace

FilterNodeRef FindEffectNode(const FilterNodeRef& node, const WideString& name) {
    if (node->GetName() == name) return node;
    if (name == u"TQ.XQVE Opacity" && HasInterface(node.Get(), kTransitionBaseNodeID)) {
        const FilterNodeRef second = FindFilterInput(node, 1);
        if (second) return FindOpacityBelow(FindFilterInput(node, 0), second, name);
    }
    const FilterNodeRef input = node->GetInputCount() == 1 ? FindFilterInput(node, 0) : FilterNodeRef();
    return input ? FindEffectNode(input, name) : FilterNodeRef();
}

}  // namespace Vantrel
