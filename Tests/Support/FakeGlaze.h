// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Tarn/Glaze.h"
#include "Vellum/Field.h"
#include "Vellum/PixelFormat.h"

namespace Vantrel::Testing {

/// A picture in host memory, in a host's layout.
struct FakePicture {
    std::uint32_t pixelFormat = Vellum::FourCC("bgra");
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::vector<std::uint8_t> bytes;  ///< tightly packed; empty: mid-grey, opaque
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    std::uint32_t alphaType = Vellum::kAlphaType_Straight;
    std::int32_t aspectNumerator = 1;
    std::int32_t aspectDenominator = 1;
};

/// A host's picture record of it, with counted storage. Ended by DisposeFakeGlaze.
[[nodiscard]] Glaze* NewFakeGlaze(const FakePicture& picture);
/// False for a record that isn't alive.
bool DisposeFakeGlaze(Glaze* glaze);

/// Records not disposed of, and storages still held by a record or a frame.
[[nodiscard]] int CountLiveGlazes();
[[nodiscard]] int CountLiveGlazeStorages();

}  // namespace Vantrel::Testing
