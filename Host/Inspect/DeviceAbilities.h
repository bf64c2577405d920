// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <set>
#include <string>

#include "Kiln/Device.h"

namespace Vantrel::Host {

/// What a device can render, by name and by size. The engine must have been started.
class DeviceAbilities {
public:
    explicit DeviceAbilities(const Kiln::Device& device);

    /// Match names of effects and transitions, names of structural nodes, codes of generators.
    [[nodiscard]] bool HasNode(const std::string& key) const { return mKeys.count(key) != 0; }
    /// Bytes that a node may need at once for frames of a size.
    [[nodiscard]] static std::uint64_t BytesForFrames(std::int32_t width, std::int32_t height);
    [[nodiscard]] bool Exceeds(std::int32_t width, std::int32_t height) const;
    /// "8192x4320 needs 2160 MB, 512 MB are allowed".
    [[nodiscard]] std::string TellExcess(std::int32_t width, std::int32_t height) const;

private:
    std::set<std::string> mKeys;
    std::uint64_t mMemoryLimit = 0;
};

}  // namespace Vantrel::Host
