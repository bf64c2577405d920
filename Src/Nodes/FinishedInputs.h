// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/IRenderNode.h"

/// What a purge may and may not touch, process-wide: the inputs that are rendering under a node that renders its inputs
/// itself, and those that have finished. No lock: only the render thread, which holds the device, comes here.
namespace Vantrel::FinishedInputs {

/// Marks an input as rendering for a scope.
class BusyScope {
public:
    explicit BusyScope(const IRenderNode* node);
    ~BusyScope();
    BusyScope(const BusyScope&) = delete;
    BusyScope& operator=(const BusyScope&) = delete;

private:
    const IRenderNode* mNode;
};

/// Remembers an input that has given its frame. Params are copied; node, token and results are held.
void Append(const RenderNodeRef& node, const RenderToken& token, const RenderParams& params,
            const RenderResultsRef& results);

/// Ends the first finished input that hasn't been ended at this level yet and isn't rendering. False when there is
/// none.
bool Release(std::uint32_t level);

void Clear();

}  // namespace Vantrel::FinishedInputs
