// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace Vantrel::Host {

class HostServices;

/// Offers the suites of description, memory and opaque data.
void OfferDescriptionSuites(HostServices& services);

/// What a place holds that the host doesn't serve: a function that takes anything and answers
/// kHostStatus_NotImplemented.
[[nodiscard]] void* UnservedEntry();

/// Texts that were handed out and not freed yet.
[[nodiscard]] std::int64_t CountTexts();

}  // namespace Vantrel::Host
