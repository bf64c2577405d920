// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <array>
#include <cstdlib>
#include <mutex>

#include <boost/make_shared.hpp>

#include "Halden/Executor.h"
#include "Kiln/Cuda/Backend.h"
#include "Kiln/DeviceObject.h"
#include "Kiln/Log.h"
#include "Kiln/OpenCL/Backend.h"

namespace Kiln {
namespace {

struct Framework {
    std::vector<boost::shared_ptr<DeviceObject>> devices;
    std::string message = "Kiln isn't initialised";
};

struct State {
    std::mutex mutex;
    std::int32_t initializations = 0;
    std::array<Framework, 2> frameworks;
    std::vector<Halden::WideString> matchNames;

    Framework& Get(DeviceFramework framework) { return frameworks[framework == DeviceFramework::kCuda ? 0 : 1]; }
};

State& GetState() {
    // Never destroyed: what a program that doesn't terminate Kiln leaves open ends with the process. The drivers may be
    // gone by the time of static destructors.
    static State& state = *new State;
    return state;
}

BackendList FindOpenCLBackends() {
    const char* wanted = std::getenv("KILN_OPENCL");
    if (!wanted || std::string(wanted) != "none") return OpenCL::FindBackends(wanted ? wanted : "");
    BackendList list;
    list.message = "KILN_OPENCL says \"none\"";
    return list;
}

Framework OpenFramework(DeviceFramework framework, BackendList list) {
    Framework opened;
    opened.message = std::move(list.message);
    for (auto& backend : list.backends) {
        Log("Kiln.Device", backend->GetFacts().description);
        const auto index = static_cast<std::uint32_t>(opened.devices.size());
        opened.devices.push_back(boost::make_shared<DeviceObject>(framework, index, std::move(backend)));
    }
    if (opened.devices.empty()) Log("Kiln.Device", opened.message);
    return opened;
}

}  // namespace

void Initialize(bool /*reserved*/) {
    State& state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    if (++state.initializations > 1) return;
    state.Get(DeviceFramework::kCuda) = OpenFramework(DeviceFramework::kCuda, Cuda::FindBackends(GetCudaDriverPath()));
    state.Get(DeviceFramework::kOpenCL) = OpenFramework(DeviceFramework::kOpenCL, FindOpenCLBackends());
}

void Terminate() {
    State& state = GetState();
    // The devices go outside the lock: their frames' holders may ask for a device at the same time.
    std::array<Framework, 2> closing;
    {
        const std::lock_guard<std::mutex> lock(state.mutex);
        if (state.initializations == 0 || --state.initializations > 0) return;
        std::swap(closing, state.frameworks);
    }
    // Copies that have told their end may still hold frames, and the nodes that asked for them.
    Halden::threads::DrainCPUBoundExecutors();
    for (const Framework& framework : closing) {
        for (const auto& device : framework.devices) device->CloseCaches();
    }
}

DeviceRef GetPrimaryDevice(DeviceFramework framework) { return GetDevice(framework, 0); }

DeviceRef GetDevice(DeviceFramework framework, std::uint32_t index) {
    State& state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    const auto& devices = state.Get(framework).devices;
    return index < devices.size() ? devices[index] : DeviceRef();
}

std::uint32_t GetDeviceCount(DeviceFramework framework) {
    State& state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    return static_cast<std::uint32_t>(state.Get(framework).devices.size());
}

std::string GetFrameworkMessage(DeviceFramework framework) {
    State& state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    return state.Get(framework).message;
}

void RegisterMatchName(const Halden::WideString& name) {
    State& state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    auto& names = state.matchNames;
    if (std::find(names.begin(), names.end(), name) == names.end()) names.push_back(name);
}

std::vector<Halden::WideString> GetRegisteredMatchNames() {
    State& state = GetState();
    const std::lock_guard<std::mutex> lock(state.mutex);
    return state.matchNames;
}

}  // namespace Kiln
