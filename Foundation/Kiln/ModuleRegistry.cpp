// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/ModuleRegistry.h"

#include <map>
#include <mutex>
#include <string>

namespace Kiln {
namespace {

struct Registry {
    std::mutex mutex;
    std::map<std::string, const ModuleImage*, std::less<>> images;
    std::uint64_t generation = 1;
};

// Other libraries' static initialisers come here before this file's own have run.
Registry& GetRegistry() {
    static Registry registry;
    return registry;
}

}  // namespace

void AddModules(const ModuleImage* images, std::size_t count) {
    Registry& registry = GetRegistry();
    const std::lock_guard<std::mutex> lock(registry.mutex);
    for (std::size_t i = 0; i < count; ++i) registry.images[images[i].key] = &images[i];
    ++registry.generation;
}

const ModuleImage* FindModuleImage(std::string_view key) {
    Registry& registry = GetRegistry();
    const std::lock_guard<std::mutex> lock(registry.mutex);
    const auto found = registry.images.find(key);
    return found == registry.images.end() ? nullptr : found->second;
}

std::uint64_t GetModuleGeneration() {
    Registry& registry = GetRegistry();
    const std::lock_guard<std::mutex> lock(registry.mutex);
    return registry.generation;
}

}  // namespace Kiln
