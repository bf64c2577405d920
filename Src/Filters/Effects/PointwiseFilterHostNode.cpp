// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/PointwiseFilterHostNode.h"

#include <cstring>
#include <optional>

#include "Kiln/Frames.h"
#include "Ostrand/QueryTable.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Kernels/RecordUpload.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\PointwiseFilterHostNode)";
/// By the length of the chain, less 1.
EffectKernel gKernels[] = {{kModuleKey, "PointwiseFilterHostKernel1", {}},
                           {kModuleKey, "PointwiseFilterHostKernel2", {}},
                           {kModuleKey, "PointwiseFilterHostKernel3", {}},
                           {kModuleKey, "PointwiseFilterHostKernel4", {}}};
ModuleSymbol gRecords[] = {{kModuleKey, "inFilter0", {}},
                           {kModuleKey, "inFilter1", {}},
                           {kModuleKey, "inFilter2", {}},
                           {kModuleKey, "inFilter3", {}}};

}  // namespace

Status PointwiseFilterHostNode::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out).Answer<PointwiseFilterHostNode>().Otherwise<FilterNode>();
}

void PointwiseFilterHostNode::CollectPointwiseFilters(const RenderParams& params, PointwiseFilterHostNode* node,
                                                      FilterList& list, bool& needsNewFrame) {
    const std::size_t size = list.size;
    if (!node || size >= FilterList::kCapacity) return;
    FillPointwiseFilterRecord(*node, params, list.records.at(list.size++), needsNewFrame);
    const auto below = Ostrand::Query<PointwiseFilterHostNode>(node->GetInput(0));
    CollectPointwiseFilters(params, below.Get(), list, needsNewFrame);
    if (size != 0) node->SuppressCaching();
}

Status PointwiseFilterHostNode::Render(const RenderToken& token, const RenderParams& params,
                                       const RenderResultsRef& results) {
    FilterList list;
    bool needsNewFrame = false;
    CollectPointwiseFilters(params, this, list, needsNewFrame);
    // The nearer base's would come back here.
    Status status = RenderNodeBase::RenderFrame(token, params, results, mFrameSlot);
    if (Ostrand::Failed(status)) return status;
    const VideoFrameRef input = mFrameSlot;
    if (needsNewFrame && Ostrand::Failed(MakeFrameLike(mDevice, input, mFrameSlot))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const Kiln::TimingMarkRef start = MarkWhenTiming();
    status = RunFilters(list, input);
    if (start) mRenderTime += start->ElapsedMs(*mDevice->GetCommands()->CreateMark());
    return status;
}

Status PointwiseFilterHostNode::RunFilters(const FilterList& list, const VideoFrameRef& input) {
    const KernelFrame in(input);
    const KernelFrame out(mFrameSlot);
    std::array<std::optional<RecordUpload>, FilterList::kCapacity> uploads;
    for (std::size_t i = 0; i < list.size; ++i) {
        RecordUpload& upload = uploads.at(i).emplace(mDevice, static_cast<std::uint32_t>(sizeof list.records[i]));
        if (!upload.GetBlock()) return Ostrand::kStatus_OutOfMemory;
        std::memcpy(upload.GetBlock(), &list.records.at(i), sizeof list.records[i]);
        const Status status = upload.Send(gRecords[i]);
        if (Ostrand::Failed(status)) return status;
    }
    const DeviceValue inData = in.Data(), outData = out.Data();
    const std::uint64_t kernel = gKernels[list.size - 1].Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;

    KernelArgs args(mDevice->GetFramework(), kernel);
    args.AddAll(inData, in.Pitch(), outData, out.Pitch(), in.Format(), in.Width(), in.Height());
    for (std::size_t i = 0; i < list.size; ++i) args.AddAll(uploads.at(i)->GetArgument());
    Status status = args.Finish();
    if (Ostrand::Failed(status)) return status;
    const GridSize grid = in.Grid();
    const BlockSize block;
    status = mDevice->GetCommands()->Launch(kernel, grid.x, grid.y, block.x, block.y, 0);
    if (Ostrand::Failed(status)) return status;
    const Kiln::TimingMarkRef mark = mDevice->GetCommands()->CreateMark();
    for (std::size_t i = 0; i < list.size; ++i) uploads.at(i)->SetMark(mark);
    return status;
}

}  // namespace Vantrel
