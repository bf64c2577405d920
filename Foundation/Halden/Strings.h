// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace Halden {

/// Wide text is UTF-16, as match names and registry keys are written and hashed. Literals are written u"...".
using WideString = std::u16string;

/// Converts between UTF-8 and UTF-16. Malformed input yields U+FFFD for each ill-formed sequence; nothing throws.
[[nodiscard]] WideString ToWide(const std::string& utf8);
[[nodiscard]] std::string ToUTF8(const WideString& wide);

}  // namespace Halden
