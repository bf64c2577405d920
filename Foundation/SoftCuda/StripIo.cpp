// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/StripIo.h"

#include <emmintrin.h>

namespace SoftCuda {

// Each is defined by StripIoLevel.cpp, compiled for its level.
const StripIo& GetStripIoV2();
const StripIo& GetStripIoV3();
const StripIo& GetStripIoV4();

const StripIo& GetStripIo(int level) {
    if (level == 2) return GetStripIoV4();
    return level == 1 ? GetStripIoV3() : GetStripIoV2();
}

void EndStores() { _mm_sfence(); }

}  // namespace SoftCuda
