// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/OpenCLLibrary.h"

#include <dlfcn.h>

namespace Vantrel {
namespace {

template <class Entry>
void Bind(void* library, const char* name, Entry& entry) {
    entry = reinterpret_cast<Entry>(dlsym(library, name));
}

OpenCLTable BindOpenCL() {
    OpenCLTable table;
    // Never closed: kernels made through it live until the process ends.
    void* const library = dlopen("libOpenCL.so.1", RTLD_NOW | RTLD_LOCAL);
    if (!library) return table;
    Bind(library, "clCreateKernel", table.clCreateKernel);
    Bind(library, "clSetKernelArg", table.clSetKernelArg);
    Bind(library, "clFinish", table.clFinish);
    return table;
}

}  // namespace

OpenCLTable& GetOpenCL() {
    static OpenCLTable table = BindOpenCL();
    return table;
}

}  // namespace Vantrel
