// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/OpenCL/Backend.h"

namespace Kiln::OpenCL {

/// A marker event on a backend's queue.
class OpenCLMark final : public TimingMark {
public:
    /// Takes over a queued event.
    OpenCLMark(std::shared_ptr<OpenCLBackend> backend, cl_event event) : mBackend(std::move(backend)), mEvent(event) {}
    ~OpenCLMark() override;
    OpenCLMark(const OpenCLMark&) = delete;
    OpenCLMark& operator=(const OpenCLMark&) = delete;

    float ElapsedMs(const TimingMark& later) const override;
    bool IsReached() const override;
    void Wait() const override;

private:
    [[nodiscard]] const Driver& GetDriver() const { return mBackend->GetDriver(); }

    std::shared_ptr<OpenCLBackend> mBackend;
    cl_event mEvent;
};

}  // namespace Kiln::OpenCL
