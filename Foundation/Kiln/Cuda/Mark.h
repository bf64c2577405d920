// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Cuda/Backend.h"

namespace Kiln::Cuda {

/// An event on a backend's stream.
class CudaMark final : public TimingMark {
public:
    /// Takes over a recorded event.
    CudaMark(std::shared_ptr<CudaBackend> backend, CUevent event) : mBackend(std::move(backend)), mEvent(event) {}
    ~CudaMark() override;
    CudaMark(const CudaMark&) = delete;
    CudaMark& operator=(const CudaMark&) = delete;

    float ElapsedMs(const TimingMark& later) const override;
    bool IsReached() const override;
    void Wait() const override;

private:
    [[nodiscard]] const Driver& GetDriver() const { return *mBackend->mDriver; }

    std::shared_ptr<CudaBackend> mBackend;
    CUevent mEvent;
};

}  // namespace Kiln::Cuda
