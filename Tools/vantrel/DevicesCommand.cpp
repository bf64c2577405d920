// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <iostream>
#include <memory>

#include <nlohmann/json.hpp>

#include "Commands.h"
#include "Kiln/Device.h"

namespace Vantrel::Tool {

namespace {

constexpr Kiln::DeviceFramework kFrameworks[] = {Kiln::DeviceFramework::kCuda, Kiln::DeviceFramework::kOpenCL};

const char* NameOf(Kiln::DeviceFramework framework) {
    return framework == Kiln::DeviceFramework::kCuda ? "CUDA" : "OpenCL";
}

nlohmann::json Describe(const Kiln::Device& device) {
    return {{"index", device.GetIndex()},
            {"name", device.GetName()},
            {"description", device.GetDescription()},
            {"memoryBytes", device.GetMemoryLimit()}};
}

void PrintJson() {
    nlohmann::json list = nlohmann::json::array();
    for (const Kiln::DeviceFramework framework : kFrameworks) {
        nlohmann::json entry = {{"framework", NameOf(framework)}, {"devices", nlohmann::json::array()}};
        for (std::uint32_t i = 0; i < Kiln::GetDeviceCount(framework); ++i) {
            entry["devices"].push_back(Describe(*Kiln::GetDevice(framework, i)));
        }
        const std::string message = Kiln::GetFrameworkMessage(framework);
        if (!message.empty()) entry["message"] = message;
        list.push_back(entry);
    }
    std::cout << list.dump(2) << "\n";
}

void PrintText() {
    for (const Kiln::DeviceFramework framework : kFrameworks) {
        for (std::uint32_t i = 0; i < Kiln::GetDeviceCount(framework); ++i) {
            const Kiln::DeviceRef device = Kiln::GetDevice(framework, i);
            std::cout << NameOf(framework) << " " << i << ": " << device->GetName() << ", "
                      << (device->GetMemoryLimit() >> 20) << " MB\n    " << device->GetDescription() << "\n";
        }
        if (Kiln::GetDeviceCount(framework) == 0) {
            std::cout << NameOf(framework) << ": none, " << Kiln::GetFrameworkMessage(framework) << "\n";
        }
    }
}

}  // namespace

void AddDevicesCommand(CLI::App& app, int& status) {
    CLI::App* command = app.add_subcommand("devices", "List the devices that can render");
    const auto json = std::make_shared<bool>(false);
    command->add_flag("--json", *json, "As JSON");
    command->callback([json, &status] {
        Kiln::Initialize(true);
        if (*json) {
            PrintJson();
        } else {
            PrintText();
        }
        Kiln::Terminate();
        status = kExit_Done;
    });
}

}  // namespace Vantrel::Tool
