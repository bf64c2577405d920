// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace Vellum {

/// How a picture's lines belong to moments of time.
constexpr std::uint32_t kFieldType_Progressive = 0;
constexpr std::uint32_t kFieldType_UpperFirst = 1;
constexpr std::uint32_t kFieldType_LowerFirst = 2;
/// Any: the inputs of a multicam view.
constexpr std::uint32_t kFieldType_Any = 3;
/// A stream of single fields, stored as frames at twice the rate.
constexpr std::uint32_t kFieldType_SeparateFields = 4;
constexpr std::uint32_t kFieldType_Unknown = 0xFFFFFFFFU;

/// What a request asks for.
constexpr std::uint32_t kFieldSelection_First = 0;
constexpr std::uint32_t kFieldSelection_Second = 1;
constexpr std::uint32_t kFieldSelection_Frame = 2;

/// How colour relates to alpha.
constexpr std::uint32_t kAlphaType_Straight = 1;
constexpr std::uint32_t kAlphaType_Premultiplied = 2;
/// Opaque: alpha counts as 1 whatever it holds.
constexpr std::uint32_t kAlphaType_None = 3;

}  // namespace Vellum
