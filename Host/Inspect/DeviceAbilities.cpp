// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/DeviceAbilities.h"

#include <limits>

namespace Vantrel::Host {

namespace {

/// The names that Kiln tells are those of one framework: CUDA's wherever it has a device. OpenCL lacks these of them.
constexpr const char* kCudaOnlyKeys[] = {"TQ.XQVE Basic 3D", "TQ.XQVE Motion Blur", "TQ.XQVE Gaussian Blur 2",
                                         "TQ.XQVE Fast Blur"};

}  // namespace

DeviceAbilities::DeviceAbilities(const Kiln::Device& device) : mMemoryLimit(device.GetMemoryLimit()) {
    for (const Halden::WideString& name : Kiln::GetRegisteredMatchNames()) mKeys.insert(Halden::ToUTF8(name));
    if (device.GetFramework() != Kiln::DeviceFramework::kOpenCL) return;
    for (const char* key : kCudaOnlyKeys) mKeys.erase(key);
}

std::uint64_t DeviceAbilities::BytesForFrames(std::int32_t width, std::int32_t height) {
    constexpr std::uint64_t kLargestPixel = 16;
    constexpr std::uint64_t kFramesOfANode = 4;
    return static_cast<std::uint64_t>(width) * static_cast<std::uint64_t>(height) * kLargestPixel * kFramesOfANode;
}

bool DeviceAbilities::Exceeds(std::int32_t width, std::int32_t height) const {
    const std::uint64_t bytes = BytesForFrames(width, height);
    // The engine counts one frame's bytes in 31 bits and refuses what goes beyond, however large the device.
    return bytes > mMemoryLimit || bytes / 4 > std::numeric_limits<std::int32_t>::max();
}

std::string DeviceAbilities::TellExcess(std::int32_t width, std::int32_t height) const {
    return std::to_string(width) + "x" + std::to_string(height) + " needs " +
           std::to_string(BytesForFrames(width, height) >> 20) + " MB, " + std::to_string(mMemoryLimit >> 20) +
           " MB are allowed";
}

}  // namespace Vantrel::Host
