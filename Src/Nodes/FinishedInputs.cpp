// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/FinishedInputs.h"

#include <algorithm>
#include <list>
#include <set>

#include <boost/make_shared.hpp>

namespace Vantrel::FinishedInputs {
namespace {

struct Entry {
    RenderNodeRef node;
    std::uint32_t level;
    RenderToken token;
    boost::shared_ptr<RenderParams> params;
    RenderResultsRef results;
};

struct Collections {
    std::multiset<const IRenderNode*> busy;
    std::list<Entry> finished;
};

Collections& Shared() {
    static Collections collections;
    return collections;
}

}  // namespace

BusyScope::BusyScope(const IRenderNode* node) : mNode(node) { Shared().busy.insert(node); }

BusyScope::~BusyScope() {
    auto& busy = Shared().busy;
    busy.erase(busy.find(mNode));
}

void Append(const RenderNodeRef& node, const RenderToken& token, const RenderParams& params,
            const RenderResultsRef& results) {
    Shared().finished.push_back({node, 0, token, boost::make_shared<RenderParams>(params), results});
}

bool Release(std::uint32_t level) {
    Collections& shared = Shared();
    const auto entry = std::find_if(shared.finished.begin(), shared.finished.end(), [&](const Entry& candidate) {
        return candidate.level < level && shared.busy.count(candidate.node.Get()) == 0;
    });
    if (entry == shared.finished.end()) return false;
    entry->node->EndFrame(entry->token, *entry->params, entry->results, level);
    entry->level = level;
    return true;
}

void Clear() { Shared().finished.clear(); }

}  // namespace Vantrel::FinishedInputs
