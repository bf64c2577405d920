// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>

#include "Vantrel/HostSuites.h"
#include "Vantrel/RenderParams.h"

namespace Vantrel {

/// What the host's render and hash calls are told about the picture that is wanted, with the list of formats that it
/// points to. Not copied, as it points into itself.
class RenderDescription {
public:
    explicit RenderDescription(const RenderParams& params);
    RenderDescription(const RenderDescription&) = delete;
    RenderDescription& operator=(const RenderDescription&) = delete;

    [[nodiscard]] const VantrelRenderDescription* Get() const { return &mDescription; }

private:
    std::array<std::uint32_t, 9> mFormats{};
    VantrelRenderDescription mDescription{};
};

}  // namespace Vantrel
