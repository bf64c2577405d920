// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/InterfaceRef.h"

/// Identifiers of node classes that layers below the class ask for. A class takes its kInterfaceID from here.
namespace Vantrel {

using Halden::utility::Guid;

// clang-format off
constexpr Guid kRenderNodeBaseID{0x63265DAD, 0xA344, 0x4EB8, {0x85, 0x9F, 0x19, 0xBC, 0x21, 0x74, 0xFF, 0x07}};
constexpr Guid kFilterNodeID{0xEC257B9A, 0x3231, 0x48BB, {0xAF, 0xC7, 0x25, 0x60, 0x8D, 0xE2, 0xC6, 0x71}};
constexpr Guid kTransitionBaseNodeID{0x3078345C, 0xDC0F, 0x49AC, {0xB1, 0x61, 0x4B, 0xBC, 0x85, 0x8D, 0xF9, 0x94}};
constexpr Guid kSourceNodeID{0xB85A2CED, 0x3256, 0x4F28, {0x8A, 0xF7, 0x3D, 0xF4, 0x83, 0x2C, 0x97, 0xFD}};
constexpr Guid kHostRenderClipPrefetchID{0x9F084E44, 0xA2A0, 0x4F6D, {0x97, 0xFA, 0xD9, 0x49, 0x46, 0xD0, 0x6D, 0x7A}};
constexpr Guid kHostRenderSubtreeID{0x54C17723, 0x704E, 0x4AFE, {0x84, 0x69, 0x1B, 0xEC, 0x47, 0x8F, 0xEC, 0x3D}};
constexpr Guid kMulticamNodeID{0x0961DF84, 0x2605, 0x4B02, {0xB7, 0x05, 0x72, 0x04, 0x42, 0x5F, 0x35, 0xC2}};
// clang-format on

/// Does an object have an interface, whose class need not be known? A null object has none.
[[nodiscard]] inline bool HasInterface(Ostrand::OstrandUnknown* object, const Guid& iid) {
    void* answer = nullptr;
    if (!object || Ostrand::Failed(object->QueryInterface(iid, &answer))) return false;
    object->Release();  // the answer was counted on the same object
    return true;
}

}  // namespace Vantrel
