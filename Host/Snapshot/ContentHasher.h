// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include "Halden/Guid.h"

namespace Vantrel::Host {

/// Collects a canonical byte string and gives the first 16 bytes of its SHA-256. Texts go in with their length, so that
/// no two lists of items make the same bytes. The answer is never nil.
class ContentHasher {
public:
    ContentHasher& Number(std::int64_t value);
    ContentHasher& Real(double value);
    ContentHasher& Text(const std::string& text);
    ContentHasher& Identifier(const Halden::utility::Guid& guid);
    ContentHasher& Bytes(const void* bytes, std::size_t length);

    [[nodiscard]] Halden::utility::Guid Finish() const;

private:
    std::string mBytes;
};

}  // namespace Vantrel::Host
