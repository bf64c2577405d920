// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Ostrand/Module.h"

#include <dlfcn.h>

#include <cstdlib>
#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

namespace Ostrand {
namespace {

using std::filesystem::path;

std::vector<path> PlaceFiles(const char* name) {
    std::vector<path> files;
    if (const char* folders = std::getenv("VANTREL_PLUGINS")) {
        std::istringstream list(folders);
        for (std::string folder; std::getline(list, folder, ':');) files.push_back(path(folder) / name);
        return files;
    }
    Dl_info info = {};
    static const int anchor = 0;
    if (dladdr(&anchor, &info) != 0 && info.dli_fname) {
        std::error_code error;
        const path folder = std::filesystem::weakly_canonical(info.dli_fname, error).parent_path();
        files = {folder / name, folder / "vantrel" / name};
    }
    files.emplace_back(name);
    return files;
}

}  // namespace

Module Module::Load(const char* name) {
    Module module;
    for (const path& file : PlaceFiles(name)) {
        module.mHandle = dlopen(file.c_str(), RTLD_NOW | RTLD_LOCAL);
        if (module.mHandle) break;
    }
    return module;
}

void* Module::GetProcAddress(const char* name) const { return mHandle ? dlsym(mHandle, name) : nullptr; }

}  // namespace Ostrand
