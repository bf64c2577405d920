// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

namespace Kiln {

/// One device module in all the forms that a build made of it. The build generates these tables; see
/// cmake/DeviceModules.cmake. Every pointer is to static storage.
struct ModuleImage {
    const char* key;           ///< as FindModule takes it, with back-slashes and without an extension
    const char* openclSource;  ///< the complete source text, dialect header included
    std::size_t openclSourceBytes;
    const void* cpuImage;  ///< a shared object for the CPU driver
    std::size_t cpuImageBytes;
    const void* cudaImage;  ///< a fat binary for a real driver; null when the build had no compiler for it
    std::size_t cudaImageBytes;
};

/// Makes modules known to all devices. Called from static initialisers of whatever library carries the images; a key
/// that is there already is replaced.
void AddModules(const ModuleImage* images, std::size_t count);

/// Called as a static initialiser by the generated tables.
struct ModuleLibrary {
    ModuleLibrary(const ModuleImage* images, std::size_t count) { AddModules(images, count); }
};

}  // namespace Kiln
