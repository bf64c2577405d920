// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <vector>

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A moment that an output frame is made of.
struct FieldSample {
    std::int64_t time = 0;
    /// 1 and 2 the two fields, other values a whole frame.
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    double weight = 1.0;
};

/// Samples by the time of the input frame that holds them; times in ticks.
using SampleSet = std::map<std::int64_t, std::vector<FieldSample>>;

/// A node that asks its inputs at several times. Every phase goes through all of them, so that host renders and uploads
/// of all samples start early; RenderFrame is a plain walk, without a cache.
class MultipleTimeInputBaseNode : public FilterNode {
public:
    using FilterNode::FilterNode;

    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;

    /// Reads only `params` and what Configure stored; any thread of any phase. All phases of a request must get the
    /// same times. `forRender` tells the call that renders from those that make ready.
    virtual void GetInputTimes(const RenderParams& params, SampleSet& times, bool forRender) = 0;

protected:
    Status WalkPhase(const RenderParams& params, const InputCall& call) override;
    /// The params that ask for one sample: a lone moment as the field that it lies in, several as the whole frame.
    [[nodiscard]] static RenderParams MakeParamsForTime(const RenderParams& params,
                                                        const SampleSet::value_type& sample);

private:
    template <class Visit>
    Status WalkTimes(const RenderParams& params, const Visit& visit);
};

}  // namespace Vantrel
