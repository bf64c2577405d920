// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "Kiln/Device.h"

// Tells what Kiln finds in the environment that the process was started in: what is decided once per process can only
// be tested in a fresh one.
int main() {
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
    Kiln::Terminate();
    return 0;
}
