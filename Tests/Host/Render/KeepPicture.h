// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "Tests/Support/Pictures.h"

namespace Vantrel::Testing {

/// Writes a picture for looking at, into the folder that VANTREL_TEST_PICTURES names.
inline void KeepPicture(const Picture& picture, const char* name) {
    if (const char* folder = std::getenv("VANTREL_TEST_PICTURES")) {
        EXPECT_TRUE(WritePng(picture, std::string(folder) + "/" + name + ".png"));
    }
}

}  // namespace Vantrel::Testing
