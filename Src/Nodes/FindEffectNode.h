// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// The node with a match name that affects the picture of `node`, going down through single inputs; empty when there is
/// none. Below a transition only opacity is looked for, on the side that isn't black, and only one with a blend mode of
/// its own counts: a plain one has done its work within its side of the transition.
[[nodiscard]] FilterNodeRef FindEffectNode(const FilterNodeRef& node, const WideString& name);

}  // namespace Vantrel
