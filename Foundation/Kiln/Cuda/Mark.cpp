// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Cuda/Mark.h"

#include <boost/make_shared.hpp>

namespace Kiln::Cuda {

CudaMark::~CudaMark() {
    const ScopedContext current(*mBackend);
    GetDriver().cuEventDestroy(mEvent);
}

float CudaMark::ElapsedMs(const TimingMark& later) const {
    const auto* end = dynamic_cast<const CudaMark*>(&later);
    if (!end) return 0.0F;
    const ScopedContext current(*mBackend);
    float elapsed = 0.0F;
    if (GetDriver().cuEventSynchronize(end->mEvent) != CUDA_SUCCESS) return 0.0F;
    return GetDriver().cuEventElapsedTime(&elapsed, mEvent, end->mEvent) == CUDA_SUCCESS ? elapsed : 0.0F;
}

bool CudaMark::IsReached() const {
    const ScopedContext current(*mBackend);
    return GetDriver().cuEventQuery(mEvent) != CUDA_ERROR_NOT_READY;
}

void CudaMark::Wait() const {
    const ScopedContext current(*mBackend);
    GetDriver().cuEventSynchronize(mEvent);
}

TimingMarkRef CudaBackend::RecordMark() {
    const ScopedContext current(*this);
    CUevent event = nullptr;
    if (mDriver->cuEventCreate(&event, CU_EVENT_DEFAULT) != CUDA_SUCCESS) return {};
    auto mark = boost::make_shared<CudaMark>(std::static_pointer_cast<CudaBackend>(shared_from_this()), event);
    if (mDriver->cuEventRecord(event, mStream) != CUDA_SUCCESS) return {};
    return mark;
}

}  // namespace Kiln::Cuda
