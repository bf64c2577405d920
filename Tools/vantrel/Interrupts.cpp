// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Interrupts.h"

#include <csignal>

namespace Vantrel::Tool {

namespace {

std::atomic<bool> gStop{false};

void OnInterrupt(int) { gStop = true; }

}  // namespace

InterruptScope::InterruptScope()
    : mOldInterrupt(std::signal(SIGINT, OnInterrupt)), mOldTerminate(std::signal(SIGTERM, OnInterrupt)) {}

InterruptScope::~InterruptScope() {
    (void)std::signal(SIGINT, mOldInterrupt);
    (void)std::signal(SIGTERM, mOldTerminate);
}

const std::atomic<bool>& InterruptScope::GetStop() const { return gStop; }

}  // namespace Vantrel::Tool
