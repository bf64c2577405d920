// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/Launch.h"

#include <algorithm>
#include <cstring>
#include <string>

#include "SoftCuda/Memory.h"
#include "SoftCuda/Settings.h"
#include "SoftCuda/ThreadPool.h"

namespace SoftCuda {

namespace {

// Tiles keep the source lines of a turned layer in the caches, and give the pool enough parts to share out evenly.
constexpr int kTileRows = 16;
constexpr int kTileColumns = 64;

template <class T>
T Read(const Launch& launch, const ArgumentRecord& argument) {
    T value;
    std::memcpy(&value, launch.parameters.data() + argument.offset, sizeof value);
    return value;
}

CUresult Refuse(const Launch& launch, std::size_t argument, const char* what) {
    SetMessage(std::string("kernel ") + launch.kernel->name + ", argument " + std::to_string(argument + 1) + ": " +
               what);
    return CUDA_ERROR_ILLEGAL_ADDRESS;
}

/// The argument's frame: all of it must be live memory where its size is known, else its first pixel.
CUresult CheckFrame(const Launch& launch, std::size_t index, Role role) {
    const FrameUse& frame = launch.frames[static_cast<int>(role) - static_cast<int>(Role::kTarget)];
    if (launch.width == 0 || launch.height == 0) return CUDA_SUCCESS;
    // Only a pointwise kernel's sources are known to have the size of its target.
    const bool sized =
        (launch.IsPointwise() || role == Role::kTarget || role == Role::kWork) && launch.width > 0 && launch.height > 0;
    if (sized && frame.pitch != 0 && frame.pitch < launch.width) return Refuse(launch, index, "pitch below the width");
    const std::size_t bytes = sized ? launch.GetFrameBytes(frame) : launch.GetBytesPerPixel();
    if (GetMemory().Contains(reinterpret_cast<std::uintptr_t>(frame.base), bytes)) return CUDA_SUCCESS;
    return Refuse(launch, index, "the frame isn't within live device memory");
}

void ReadArgument(Launch& launch, const ArgumentRecord& argument) {
    const Role role = argument.role;
    if (role == Role::kFormat) {
        launch.format = Read<int>(launch, argument) == 0 ? 0 : 1;
    } else if (role == Role::kWidth) {
        launch.width = std::max(0, Read<int>(launch, argument));
    } else if (role == Role::kHeight) {
        launch.height = std::max(0, Read<int>(launch, argument));
    } else if (role >= Role::kTarget && role <= Role::kWork) {
        launch.frames[static_cast<int>(role) - static_cast<int>(Role::kTarget)].base =
            Read<std::uint8_t*>(launch, argument);
    } else if (role >= Role::kTargetPitch) {
        launch.frames[static_cast<int>(role) - static_cast<int>(Role::kTargetPitch)].pitch =
            Read<int>(launch, argument);
    }
}

}  // namespace

std::size_t Launch::GetFrameBytes(const FrameUse& frame) const {
    if (width <= 0 || height <= 0) return 0;
    const auto rows = static_cast<std::size_t>(height - 1);
    return (rows * static_cast<std::size_t>(frame.pitch) + static_cast<std::size_t>(width)) * GetBytesPerPixel();
}

CUresult ReadRoles(Launch& launch) {
    const KernelRecord& kernel = *launch.kernel;
    for (std::size_t i = 0; i < kernel.argumentCount; ++i) ReadArgument(launch, kernel.arguments[i]);
    if (launch.width >= 0) launch.width = std::min(launch.width, launch.threadsX);
    if (launch.height >= 0) launch.height = std::min(launch.height, launch.threadsY);
    for (std::size_t i = 0; i < kernel.argumentCount; ++i) {
        const Role role = kernel.arguments[i].role;
        if (role < Role::kTarget || role > Role::kWork) continue;
        if (const CUresult result = CheckFrame(launch, i, role); result != CUDA_SUCCESS) return result;
    }
    return CUDA_SUCCESS;
}

void RunRange(const Launch& launch) {
    const int columns = launch.width >= 0 ? launch.width : launch.threadsX;
    const int rows = launch.height >= 0 ? launch.height : launch.threadsY;
    if (columns <= 0 || rows <= 0) return;
    const KernelRecord& kernel = *launch.kernel;
    const unsigned char* parameters = launch.parameters.data();
    ThreadPool& pool = GetPool();
    const int lanes = static_cast<int>(kernel.lanes);
    const auto roundToLanes = [lanes](int value) { return std::max(1, (value + lanes - 1) / lanes) * lanes; };

    // Few rows (a pass down the columns, one thread a line): the parts lie side by side instead.
    const int wanted = 4 * pool.GetLimit();
    const bool wide = rows < wanted;
    const int partRows = wide ? 1 : std::min(kTileRows, (rows + wanted - 1) / wanted);
    const int partColumns = wide ? roundToLanes((columns + wanted - 1) / wanted) : roundToLanes(columns);
    const int tileColumns = kernel.kind == KernelKind::kLanes && !wide ? roundToLanes(kTileColumns) : partColumns;
    const int partsX = (columns + partColumns - 1) / partColumns;
    const int partsY = (rows + partRows - 1) / partRows;
    pool.Run(partsX * partsY, [&](int part) {
        const int y0 = part / partsX * partRows, y1 = std::min(y0 + partRows, rows);
        const int first = part % partsX * partColumns, last = std::min(first + partColumns, columns);
        for (int x0 = first; x0 < last; x0 += tileColumns)
            kernel.runRange({x0, std::min(x0 + tileColumns, last), y0, y1}, parameters);
    });
}

}  // namespace SoftCuda
