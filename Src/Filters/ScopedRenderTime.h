// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Device.h"

namespace Vantrel {

/// Adds the device time of what a scope queues to a figure in milliseconds, when the device's timing is on.
class ScopedRenderTime {
public:
    ScopedRenderTime(const Kiln::DeviceRef& device, float& milliseconds) : mDevice(device), mTotal(milliseconds) {
        if (device->IsTimingEnabled()) mStart = device->GetCommands()->CreateMark();
    }
    ~ScopedRenderTime() {
        if (!mStart) return;
        if (const Kiln::TimingMarkRef end = mDevice->GetCommands()->CreateMark()) mTotal += mStart->ElapsedMs(*end);
    }
    ScopedRenderTime(const ScopedRenderTime&) = delete;
    ScopedRenderTime& operator=(const ScopedRenderTime&) = delete;

private:
    const Kiln::DeviceRef& mDevice;
    float& mTotal;
    Kiln::TimingMarkRef mStart;
};

}  // namespace Vantrel
