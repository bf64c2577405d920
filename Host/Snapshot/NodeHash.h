// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Snapshot/ContentHasher.h"
#include "Host/Snapshot/Node.h"

/// Content hashes: equal hash means equal tree, because trees are looked up by it. Positions and numbers that only name
/// something stay out, so that a tree is found again where its content has moved to.
namespace Vantrel::Host {

/// Of a node whose inputs and operators have theirs.
[[nodiscard]] Guid HashNode(const Node& node, const SequenceFormat& format);

/// Of an effect with all its keyframes, apart from the node's properties.
[[nodiscard]] Guid HashEffect(const EffectDetail& effect);

[[nodiscard]] Guid HashSegments(const std::vector<Segment>& segments, const SequenceFormat& format);

}  // namespace Vantrel::Host
