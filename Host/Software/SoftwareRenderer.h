// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>

#include "Host/Media/MediaReader.h"
#include "Host/Render/ISoftwareRenderer.h"

namespace Vantrel::Host {

/// The host's renderer: media, structure, effects. Works on 32-bit float BGRA with straight alpha.
/// @param strict  an effect without a software version is a failure instead of passing its picture through.
[[nodiscard]] std::unique_ptr<ISoftwareRenderer> MakeSoftwareRenderer(std::shared_ptr<PixelBufferPool> pool,
                                                                      std::shared_ptr<MediaReader> reader, bool strict);

}  // namespace Vantrel::Host
