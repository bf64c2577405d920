// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Filters/Effects/PointwiseFilterRecord.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

static_assert(sizeof(PointwiseFilterRecord) == 48, "the record is copied byte for byte");

/// Fills the record of a node's effect from its parameters at the node's time. A name that isn't one of the pointwise
/// filters leaves the record as it is.
/// @param needsNewFrame  set when the filter reads elsewhere than it writes
void FillPointwiseFilterRecord(FilterNode& node, const RenderParams& params, PointwiseFilterRecord& record,
                               bool& needsNewFrame);

}  // namespace Vantrel
