// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Ostrand/CriticalSection.h"

namespace Ostrand {

void CriticalSection::Enter(const char* section) {
    mMutex.lock();
    if (mDepth++ == 0) mHolder.store(section, std::memory_order_relaxed);
}

void CriticalSection::Leave() {
    if (--mDepth == 0) mHolder.store(nullptr, std::memory_order_relaxed);
    mMutex.unlock();
}

}  // namespace Ostrand
