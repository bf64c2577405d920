// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/OpenCL/Mark.h"

#include <boost/make_shared.hpp>

namespace Kiln::OpenCL {

OpenCLMark::~OpenCLMark() { GetDriver().clReleaseEvent(mEvent); }

float OpenCLMark::ElapsedMs(const TimingMark& later) const {
    const auto* end = dynamic_cast<const OpenCLMark*>(&later);
    if (!end || GetDriver().clWaitForEvents(1, &end->mEvent) != CL_SUCCESS) return 0.0F;
    const auto read = [this](cl_event event, cl_ulong& nanoseconds) {
        return GetDriver().clGetEventProfilingInfo(event, CL_PROFILING_COMMAND_END, sizeof nanoseconds, &nanoseconds,
                                                   nullptr) == CL_SUCCESS;
    };
    cl_ulong from = 0;
    cl_ulong to = 0;
    if (!read(mEvent, from) || !read(end->mEvent, to) || to < from) return 0.0F;
    return static_cast<float>(static_cast<double>(to - from) * 1e-6);
}

bool OpenCLMark::IsReached() const {
    cl_int state = CL_COMPLETE;
    const cl_int result =
        GetDriver().clGetEventInfo(mEvent, CL_EVENT_COMMAND_EXECUTION_STATUS, sizeof state, &state, nullptr);
    // Negative states are those of work that failed.
    return result != CL_SUCCESS || state <= CL_COMPLETE;
}

void OpenCLMark::Wait() const { GetDriver().clWaitForEvents(1, &mEvent); }

TimingMarkRef OpenCLBackend::RecordMark() {
    cl_event event = nullptr;
    if (GetDriver().clEnqueueMarkerWithWaitList(mSession.queue.Get(), 0, nullptr, &event) != CL_SUCCESS) return {};
    GetDriver().clFlush(mSession.queue.Get());
    return boost::make_shared<OpenCLMark>(std::static_pointer_cast<OpenCLBackend>(shared_from_this()), event);
}

}  // namespace Kiln::OpenCL
