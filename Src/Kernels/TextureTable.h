// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

#include "Kiln/Textures.h"
#include "Src/Kernels/KernelTable.h"

namespace Vantrel {

/// One texture's slots, a place for each framework and device, under the rules of KernelTable.
struct TextureTable {
    struct Slot {
        std::uint64_t contextIdentity = 0;
        Kiln::Texture texture;
    };
    std::array<Slot, 2 * KernelTable::kDevicesPerFramework> slots;
};

/// The texture of that name in the module of that key, on that device; loaded once for each context. Bind a picture for
/// a scope (Kiln::ScopedTextureBinding): what an older context held is gone with it.
[[nodiscard]] inline Kiln::Texture& GetTexture(TextureTable& table, const Kiln::DeviceRef& device,
                                               const char* moduleKey, const char* name, Kiln::TextureAddress address,
                                               Kiln::TextureFilter filter, Vellum::PixelFormat format) {
    const std::size_t framework = device->GetFramework() == Kiln::DeviceFramework::kCuda ? 0 : 1;
    TextureTable::Slot& slot = table.slots[framework * KernelTable::kDevicesPerFramework + device->GetIndex()];
    if (slot.contextIdentity != device->GetContextIdentity()) {
        slot.contextIdentity = device->GetContextIdentity();
        slot.texture = Kiln::LoadTexture(device, moduleKey, name, address, filter, format);
    }
    return slot.texture;
}

}  // namespace Vantrel
