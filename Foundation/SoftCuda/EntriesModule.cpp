// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Modules, functions, launches.

#include <dlfcn.h>
#include <elf.h>
#include <link.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>

#include "SoftCuda/Objects.h"

using namespace SoftCuda;

CUmod_st::~CUmod_st() {
    if (object != nullptr) dlclose(object);
    if (file >= 0) close(file);
}

namespace SoftCuda {

namespace {

/// The size of a shared object in memory, which the API doesn't tell: the linker writes the table of sections last. 0
/// when it is none of this machine's.
std::size_t GetImageBytes(const void* image) {
    Elf64_Ehdr header;
    std::memcpy(&header, image, sizeof header);
    if (std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0 || header.e_ident[EI_CLASS] != ELFCLASS64 ||
        header.e_machine != EM_X86_64 || header.e_type != ET_DYN)
        return 0;
    return header.e_shoff + std::size_t{header.e_shnum} * header.e_shentsize;
}

/// Tells images for real devices from what is no image at all.
CUresult NameImageFault(const void* image) {
    constexpr unsigned kFatBinaryMagic = 0xBA55ED50;
    unsigned magic = 0;
    std::memcpy(&magic, image, sizeof magic);
    const bool ptx = std::memcmp(image, "//", 2) == 0 || std::memcmp(image, ".ver", 4) == 0;
    if (magic != kFatBinaryMagic && !ptx && std::memcmp(image, ELFMAG, SELFMAG) != 0) return CUDA_ERROR_INVALID_IMAGE;
    SetMessage("the image is for other devices; the CPU driver takes the shared objects of cmake/DeviceModules.cmake");
    return CUDA_ERROR_NO_BINARY_FOR_GPU;
}

bool WriteAll(int file, const char* bytes, std::size_t count) {
    while (count != 0) {
        const ssize_t written = write(file, bytes, count);
        if (written <= 0) return false;
        bytes += written;
        count -= static_cast<std::size_t>(written);
    }
    return true;
}

std::string GetSymbol(const char* kind, int level, const char* name) {
    return std::string("softcuda_") + kind + "_" + kLevelNames[level] + "_" + name;
}

/// Where the loader has put an image.
AddressRange FindRange(void* object, const void* image) {
    const link_map* map = nullptr;
    if (dlinfo(object, RTLD_DI_LINKMAP, &map) != 0) return {};
    Elf64_Ehdr header;
    std::memcpy(&header, image, sizeof header);
    std::size_t bytes = 0;
    for (int i = 0; i < header.e_phnum; ++i) {
        Elf64_Phdr segment;
        std::memcpy(&segment, static_cast<const char*>(image) + header.e_phoff + i * sizeof segment, sizeof segment);
        if (segment.p_type == PT_LOAD) bytes = std::max(bytes, segment.p_vaddr + segment.p_memsz);
    }
    return {map->l_addr, map->l_addr + bytes};
}

CUresult LoadImage(CUmodule* result, const void* image) {
    CUcontext context = nullptr;
    if (const CUresult fault = NeedContext(context); fault != CUDA_SUCCESS) return fault;
    if (result == nullptr || image == nullptr) return CUDA_ERROR_INVALID_VALUE;
    const std::size_t bytes = GetImageBytes(image);
    if (bytes == 0) return NameImageFault(image);

    auto module = std::make_unique<CUmod_st>();
    module->context = context;
    module->level = ChooseLevel();
    module->file = memfd_create("softcuda-module", MFD_CLOEXEC);
    if (module->file < 0 || !WriteAll(module->file, static_cast<const char*>(image), bytes))
        return CUDA_ERROR_OUT_OF_MEMORY;
    module->object = dlopen(("/proc/self/fd/" + std::to_string(module->file)).c_str(), RTLD_NOW | RTLD_LOCAL);
    if (module->object == nullptr) {
        SetMessage(dlerror());
        return CUDA_ERROR_INVALID_IMAGE;
    }
    module->range = FindRange(module->object, image);
    *result = module.get();
    const std::lock_guard<std::mutex> lock(context->mutex);
    context->modules.insert(std::move(module));
    return CUDA_SUCCESS;
}

CUresult SetParameter(CUfunction function, int offset, const void* value, unsigned bytes) {
    if (function == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (value == nullptr || offset < 0 || static_cast<std::size_t>(offset) + bytes > kMaxParameterBytes)
        return CUDA_ERROR_INVALID_VALUE;
    std::memcpy(function->parameters.data() + offset, value, bytes);
    return CUDA_SUCCESS;
}

CUresult Start(Launch& launch, CUfunction function, unsigned parameterBytes, CUstream handle) {
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    launch.kernel = function->kernel;
    launch.level = function->level;
    launch.module = function->module;
    if (parameterBytes != function->kernel->parameterBytes) {
        SetMessage(std::string("kernel ") + function->kernel->name + " takes " +
                   std::to_string(function->kernel->parameterBytes) + " bytes of arguments, not " +
                   std::to_string(parameterBytes));
        return CUDA_ERROR_INVALID_VALUE;
    }
    if (const CUresult result = ReadRoles(launch); result != CUDA_SUCCESS) return result;
    Counters& counters = GetCounters();
    ++counters.launches;
    if (launch.IsPointwise()) ++counters.pointwise;
    stream->stream->Submit(launch, GetDependencies(*stream));
    return CUDA_SUCCESS;
}

CUresult StartGrid(CUfunction function, int gridX, int gridY, CUstream stream) {
    if (function == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (gridX <= 0 || gridY <= 0) return CUDA_ERROR_INVALID_VALUE;
    Launch launch;
    launch.threadsX = gridX * function->block[0];
    launch.threadsY = gridY * function->block[1];
    launch.parameters = function->parameters;
    return Start(launch, function, function->parameterBytes, stream);
}

/// The packed form of `extra`: names and values in pairs, up to a null.
CUresult ReadPacked(void** extra, Launch& launch, unsigned& bytes) {
    const auto name = [](std::uintptr_t number) { return reinterpret_cast<void*>(number); };
    const void* buffer = nullptr;
    std::size_t size = 0;
    for (; *extra != nullptr; extra += 2) {
        if (extra[0] == name(1))
            buffer = extra[1];
        else if (extra[0] == name(2))
            size = *static_cast<const std::size_t*>(extra[1]);
        else
            return CUDA_ERROR_INVALID_VALUE;
    }
    if (buffer == nullptr || size > kMaxParameterBytes) return CUDA_ERROR_INVALID_VALUE;
    std::memcpy(launch.parameters.data(), buffer, size);
    bytes = static_cast<unsigned>(size);
    return CUDA_SUCCESS;
}

}  // namespace

}  // namespace SoftCuda

extern "C" {

CUresult cuModuleLoadData(CUmodule* module, const void* image) { return LoadImage(module, image); }

CUresult cuModuleLoadDataEx(CUmodule* module, const void* image, unsigned /*count*/, CUjit_option* /*options*/,
                            void** /*values*/) {
    return LoadImage(module, image);
}

CUresult cuModuleLoadFatBinary(CUmodule* module, const void* image) { return LoadImage(module, image); }

CUresult cuModuleLoad(CUmodule* module, const char* path) {
    if (path == nullptr) return CUDA_ERROR_INVALID_VALUE;
    std::ifstream file(path, std::ios::binary);
    if (!file) return CUDA_ERROR_FILE_NOT_FOUND;
    std::vector<char> image{std::istreambuf_iterator<char>(file), {}};
    image.resize(std::max(image.size(), sizeof(Elf64_Ehdr)));
    return LoadImage(module, image.data());
}

CUresult cuModuleUnload(CUmodule module) {
    if (module == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    CUcontext context = module->context;
    context->Synchronize();
    const std::lock_guard<std::mutex> lock(context->mutex);
    const auto found = FindOwned(context->modules, module);
    if (found == context->modules.end()) return CUDA_ERROR_INVALID_HANDLE;
    context->modules.erase(found);
    return CUDA_SUCCESS;
}

CUresult cuModuleGetFunction(CUfunction* function, CUmodule module, const char* name) {
    if (module == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (function == nullptr || name == nullptr) return CUDA_ERROR_INVALID_VALUE;
    const std::lock_guard<std::mutex> lock(module->mutex);
    std::unique_ptr<CUfunc_st>& made = module->functions[name];
    if (!made) {
        const auto* kernel =
            static_cast<const KernelRecord*>(dlsym(module->object, GetSymbol("kernel", module->level, name).c_str()));
        if (kernel == nullptr || kernel->abi != kKernelAbi || kernel->parameterBytes > kMaxParameterBytes) {
            module->functions.erase(name);
            return CUDA_ERROR_NOT_FOUND;
        }
        made = std::make_unique<CUfunc_st>();
        made->kernel = kernel;
        made->level = module->level;
        made->module = module->range;
    }
    *function = made.get();
    return CUDA_SUCCESS;
}

CUresult cuModuleGetGlobal(CUdeviceptr* address, size_t* bytes, CUmodule module, const char* name) {
    if (module == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (name == nullptr) return CUDA_ERROR_INVALID_VALUE;
    const auto* global =
        static_cast<const GlobalRecord*>(dlsym(module->object, GetSymbol("global", module->level, name).c_str()));
    if (global == nullptr) return CUDA_ERROR_NOT_FOUND;
    if (address != nullptr) *address = reinterpret_cast<CUdeviceptr>(global->address);
    if (bytes != nullptr) *bytes = global->bytes;
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuModuleGetGlobal);

CUresult cuFuncSetBlockShape(CUfunction function, int x, int y, int z) {
    if (function == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (x <= 0 || y <= 0 || z != 1 || x * y > 1024) return CUDA_ERROR_INVALID_VALUE;
    function->block[0] = x;
    function->block[1] = y;
    function->block[2] = z;
    return CUDA_SUCCESS;
}

CUresult cuFuncSetSharedSize(CUfunction function, unsigned /*bytes*/) {
    return function == nullptr ? CUDA_ERROR_INVALID_HANDLE : CUDA_SUCCESS;
}

CUresult cuFuncSetCacheConfig(CUfunction function, CUfunc_cache /*config*/) {
    return function == nullptr ? CUDA_ERROR_INVALID_HANDLE : CUDA_SUCCESS;
}

CUresult cuFuncGetAttribute(int* value, CUfunction_attribute attribute, CUfunction function) {
    if (function == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (value == nullptr) return CUDA_ERROR_INVALID_VALUE;
    *value = attribute == CU_FUNC_ATTRIBUTE_MAX_THREADS_PER_BLOCK ? 1024 : 0;
    return CUDA_SUCCESS;
}

CUresult cuParamSetSize(CUfunction function, unsigned bytes) {
    if (function == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (bytes > kMaxParameterBytes) return CUDA_ERROR_INVALID_VALUE;
    function->parameterBytes = bytes;
    return CUDA_SUCCESS;
}

CUresult cuParamSeti(CUfunction function, int offset, unsigned value) {
    return SetParameter(function, offset, &value, sizeof value);
}
CUresult cuParamSetf(CUfunction function, int offset, float value) {
    return SetParameter(function, offset, &value, sizeof value);
}
CUresult cuParamSetv(CUfunction function, int offset, void* value, unsigned bytes) {
    return SetParameter(function, offset, value, bytes);
}

CUresult cuLaunch(CUfunction function) { return StartGrid(function, 1, 1, nullptr); }
CUresult cuLaunchGrid(CUfunction function, int gridX, int gridY) { return StartGrid(function, gridX, gridY, nullptr); }
CUresult cuLaunchGridAsync(CUfunction function, int gridX, int gridY, CUstream stream) {
    return StartGrid(function, gridX, gridY, stream);
}

CUresult cuLaunchKernel(CUfunction function, unsigned gridX, unsigned gridY, unsigned gridZ, unsigned blockX,
                        unsigned blockY, unsigned blockZ, unsigned /*sharedBytes*/, CUstream stream, void** parameters,
                        void** extra) {
    if (function == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (gridX * gridY * blockX * blockY == 0 || gridZ != 1 || blockZ != 1 || blockX * blockY > 1024)
        return CUDA_ERROR_INVALID_VALUE;
    Launch launch;
    launch.threadsX = static_cast<int>(gridX * blockX);
    launch.threadsY = static_cast<int>(gridY * blockY);
    const KernelRecord& kernel = *function->kernel;
    unsigned bytes = kernel.parameterBytes;
    if (extra != nullptr) {
        if (const CUresult result = ReadPacked(extra, launch, bytes); result != CUDA_SUCCESS) return result;
    } else if (parameters == nullptr && kernel.argumentCount != 0) {
        return CUDA_ERROR_INVALID_VALUE;
    } else {
        for (std::size_t i = 0; i < kernel.argumentCount; ++i)
            std::memcpy(launch.parameters.data() + kernel.arguments[i].offset, parameters[i], kernel.arguments[i].size);
    }
    return Start(launch, function, bytes, stream);
}

}  // extern "C"
