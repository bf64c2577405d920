// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "Host/Software/Picture.h"
#include "Host/Timeline/Model.h"

namespace Vantrel::Host::Software {

/// Draws a title over a picture. Lines are separated by line feeds; the block's middle stands at the title's position.
/// @param aspect  width of a pixel over its height
/// Throws MediaError without a font.
void DrawTitle(const Title& title, double aspect, Picture& picture);

/// Fills a picture with what stands for media that aren't there: dark, with the clip's name and the reason.
void DrawSlate(const std::string& name, const std::string& reason, double aspect, Picture& picture);

}  // namespace Vantrel::Host::Software
