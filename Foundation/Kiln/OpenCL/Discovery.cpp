// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>

#include "Kiln/OpenCL/Backend.h"
#include "Kiln/Pages.h"

namespace Kiln::OpenCL {
namespace {

struct Candidate {
    cl_platform_id platform;
    cl_device_id device;
    bool isCPU;
};

std::vector<Candidate> ListDevices(const Driver& driver, cl_platform_id platform) {
    cl_uint count = 0;
    if (driver.clGetDeviceIDs(platform, CL_DEVICE_TYPE_ALL, 0, nullptr, &count) != CL_SUCCESS) return {};
    std::vector<cl_device_id> devices(count);
    if (driver.clGetDeviceIDs(platform, CL_DEVICE_TYPE_ALL, count, devices.data(), nullptr) != CL_SUCCESS) return {};
    std::vector<Candidate> usable;
    for (cl_device_id device : devices) {
        if (!driver.GetDeviceValue<cl_bool>(device, CL_DEVICE_AVAILABLE)) continue;
        if (!driver.GetDeviceValue<cl_bool>(device, CL_DEVICE_COMPILER_AVAILABLE)) continue;
        const auto type = driver.GetDeviceValue<cl_device_type>(device, CL_DEVICE_TYPE);
        usable.push_back({platform, device, (type & CL_DEVICE_TYPE_CPU) != 0});
    }
    return usable;
}

std::vector<Candidate> ListCandidates(const Driver& driver, const std::string& filter, std::string& message) {
    cl_uint count = 0;
    driver.clGetPlatformIDs(0, nullptr, &count);
    std::vector<cl_platform_id> platforms(count);
    if (count == 0 || driver.clGetPlatformIDs(count, platforms.data(), nullptr) != CL_SUCCESS) {
        message = "no OpenCL platform is installed";
        return {};
    }
    std::vector<Candidate> candidates;
    std::string names;
    for (cl_platform_id platform : platforms) {
        const std::string name = driver.GetPlatformText(platform, CL_PLATFORM_NAME);
        names += (names.empty() ? "" : ", ") + name;
        if (name.find(filter) == std::string::npos) continue;
        const auto devices = ListDevices(driver, platform);
        candidates.insert(candidates.end(), devices.begin(), devices.end());
    }
    if (candidates.empty()) {
        message = "no OpenCL device on the platforms " + names;
        if (!filter.empty()) message += ", of which KILN_OPENCL allows those with \"" + filter + "\" in their name";
    }
    std::stable_sort(candidates.begin(), candidates.end(),
                     [](const Candidate& a, const Candidate& b) { return !a.isCPU && b.isCPU; });
    return candidates;
}

DeviceFacts DescribeDevice(const Driver& driver, const Candidate& candidate) {
    DeviceFacts facts;
    facts.name = driver.GetDeviceText(candidate.device, CL_DEVICE_NAME);
    facts.isCPU = candidate.isCPU;
    const auto bytes = driver.GetDeviceValue<cl_ulong>(candidate.device, CL_DEVICE_GLOBAL_MEM_SIZE);
    // A GPU's memory also holds what the system draws with it; a CPU's belongs to everybody.
    facts.memoryBytes = facts.isCPU ? std::min<std::uint64_t>(bytes, GetMachineMemory() / 2)
                                    : static_cast<std::uint64_t>(bytes) / 8 * 7;
    facts.largestBlock = driver.GetDeviceValue<cl_ulong>(candidate.device, CL_DEVICE_MAX_MEM_ALLOC_SIZE);
    const auto units = driver.GetDeviceValue<cl_uint>(candidate.device, CL_DEVICE_MAX_COMPUTE_UNITS);
    facts.description = driver.GetDeviceText(candidate.device, CL_DEVICE_VERSION) + ", " + facts.name + ", " +
                        std::to_string(units) + " compute units, " + std::to_string(facts.memoryBytes >> 20) +
                        " MB, platform " + driver.GetPlatformText(candidate.platform, CL_PLATFORM_NAME) + ", driver " +
                        driver.GetDeviceText(candidate.device, CL_DRIVER_VERSION) + (facts.isCPU ? ", on the CPU" : "");
    return facts;
}

std::shared_ptr<Backend> OpenDevice(const std::shared_ptr<const Driver>& driver, const Candidate& candidate,
                                    std::string& message) {
    DeviceFacts facts = DescribeDevice(*driver, candidate);
    cl_int result = CL_SUCCESS;
    const cl_context_properties properties[] = {CL_CONTEXT_PLATFORM,
                                                reinterpret_cast<cl_context_properties>(candidate.platform), 0};
    ScopedObject<cl_context> context(
        driver->clCreateContext(properties, 1, &candidate.device, nullptr, nullptr, &result), driver->clReleaseContext);
    const auto makeQueue = [&](cl_command_queue_properties flags) {
        cl_command_queue queue = nullptr;
        if (result == CL_SUCCESS) {
            queue = driver->clCreateCommandQueue(context.Get(), candidate.device, flags, &result);
        }
        return ScopedObject<cl_command_queue>(queue, driver->clReleaseCommandQueue);
    };
    // Taking times costs nothing that could be measured, so the queue always does.
    auto queue = makeQueue(CL_QUEUE_PROFILING_ENABLE);
    auto mapQueue = makeQueue(0);
    if (result != CL_SUCCESS) {
        message = "the OpenCL device \"" + facts.name + "\" can't be opened: code " + std::to_string(result);
        return nullptr;
    }
    return std::make_shared<OpenCLBackend>(
        Session{driver, candidate.device, std::move(context), std::move(queue), std::move(mapQueue)}, std::move(facts));
}

}  // namespace

BackendList FindBackends(const std::string& platformFilter) {
    BackendList list;
    const std::shared_ptr<const Driver> driver = LoadDriver(list.message);
    if (!driver) return list;
    for (const Candidate& candidate : ListCandidates(*driver, platformFilter, list.message)) {
        if (list.backends.size() == kMaxDevices) break;
        if (auto backend = OpenDevice(driver, candidate, list.message)) list.backends.push_back(std::move(backend));
    }
    if (!list.backends.empty()) list.message.clear();
    return list;
}

}  // namespace Kiln::OpenCL
