// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Puts luma in place of the colours (BT.709: Y = 0.2126 R + 0.7152 G + 0.0722 B). Alpha stays. No parameters.
inline constexpr EffectRow kBlackAndWhiteEffect = {"KL.XQVE Black & White", "Black & White",
                                                   "Turns colours into their luma.", nullptr, 0};

}  // namespace Vantrel
