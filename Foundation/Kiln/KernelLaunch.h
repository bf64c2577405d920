// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <type_traits>

#include "Kiln/Backend.h"
#include "Kiln/Device.h"
#include "Vellum/PixelFormat.h"

namespace Kiln {

/// How values become arguments: a pixel format becomes the flag "pixels are 32-bit floats", bool and enumerations widen
/// to 32 bits, plain values of 4, 8 or 16 bytes go as they are.
template <class T>
void AddArgument(KernelArguments& arguments, const T& value) {
    if constexpr (std::is_same_v<T, Vellum::PixelFormat>) {
        const bool isHalf =
            value == Vellum::kPixelFormat_GPU_BGRA_4444_16f || value == Vellum::kPixelFormat_GPU_BGRX_4444_16f;
        const std::int32_t flag = isHalf ? 0 : 1;
        arguments.Add(&flag, sizeof flag);
    } else if constexpr (std::is_same_v<T, bool> || std::is_enum_v<T>) {
        const auto widened = static_cast<std::int32_t>(value);
        arguments.Add(&widened, sizeof widened);
    } else {
        static_assert(std::is_trivially_copyable_v<T> && (sizeof(T) == 4 || sizeof(T) == 8 || sizeof(T) == 16));
        arguments.Add(&value, sizeof value);
    }
}

/// Blocks of 16 by 16 that cover a picture.
[[nodiscard]] constexpr LaunchShape ShapeFor(std::int32_t width, std::int32_t height, std::int32_t blockX = 16,
                                             std::int32_t blockY = 16) {
    return {(width + blockX - 1) / blockX, (height + blockY - 1) / blockY, blockX, blockY};
}

/// Starts a kernel of a device under its exclusive access. kStatus_Failure when the module or the kernel isn't there.
[[nodiscard]] Ostrand::Status LaunchKernel(const DeviceRef& device, const char* moduleKey, const char* kernelName,
                                           const LaunchShape& shape, const KernelArguments& arguments);

/// A kernel of Kiln's own, declared once by its argument types:
///
///     constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, float4> kFill{"..\\..\\Kiln\\Modules\\Fill",
///     "FillKernel"}; return kFill.Launch(device, ShapeFor(width, height), format, buffer, pitch, color);
template <class... Parameters>
class Kernel {
public:
    constexpr Kernel(const char* moduleKey, const char* kernelName) : mModuleKey(moduleKey), mKernelName(kernelName) {}

    [[nodiscard]] Ostrand::Status Launch(const DeviceRef& device, const LaunchShape& shape,
                                         const Parameters&... values) const {
        KernelArguments arguments;
        (AddArgument(arguments, values), ...);
        return LaunchKernel(device, mModuleKey, mKernelName, shape, arguments);
    }

private:
    const char* mModuleKey;
    const char* mKernelName;
};

}  // namespace Kiln
