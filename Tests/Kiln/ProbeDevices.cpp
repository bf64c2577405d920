// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <iostream>
#include <vector>

#include "Kiln/Device.h"
#include "Kiln/Frames.h"

namespace {
// Outlives whatever the first use of Kiln leaves for the end.
std::vector<Kiln::VideoFrameRef> gLeftFrames;
}  // namespace

// Tells what Kiln finds in the environment that the process was started in: what is decided once per process can only
// be tested in a fresh one. With an argument it ends with a frame on each device, all of them open.
int main(int count, char**) {
    Kiln::Initialize(true);
    std::cout << "driver=" << Kiln::GetCudaDriverPath() << "\n";
    for (const auto framework : {Kiln::DeviceFramework::kCuda, Kiln::DeviceFramework::kOpenCL}) {
        const char* name = framework == Kiln::DeviceFramework::kCuda ? "cuda" : "opencl";
        std::cout << name << "=" << Kiln::GetDeviceCount(framework) << "\n";
        std::cout << name << " message=" << Kiln::GetFrameworkMessage(framework) << "\n";
        for (std::uint32_t i = 0; i < Kiln::GetDeviceCount(framework); ++i) {
            std::cout << name << " device=" << Kiln::GetDevice(framework, i)->GetDescription() << "\n";
        }
    }
    if (count == 1) {
        Kiln::Terminate();
        return 0;
    }
    for (const auto framework : {Kiln::DeviceFramework::kCuda, Kiln::DeviceFramework::kOpenCL}) {
        const auto created = Kiln::CreateGPUVideoFrame(gLeftFrames.emplace_back(), Kiln::GetPrimaryDevice(framework),
                                                       Kiln::kPixelFormat_GPU_BGRA_4444_32f, 64, 64,
                                                       Vellum::kPixelAspectRatio_Square, 0, {});
        if (Ostrand::Failed(created)) return 1;
    }
    return 0;
}
