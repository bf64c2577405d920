// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <type_traits>

#include "Kiln/Device.h"
#include "Kiln/FrameOperations.h"
#include "Vellum/PixelFormat.h"

namespace Vantrel {

using Ostrand::Status;

/// A frame's memory, a buffer or any other device value. Opaque: kernels take it together with offsets, never moved.
using DeviceValue = std::uint64_t;

/// Two floats in one argument of 8 bytes.
struct float2 {
    float x = 0.0F;
    float y = 0.0F;
};

/// One packing pass: hands a kernel its arguments one after the other, on whichever framework. The first failure stops
/// it. Not re-entrant for one kernel, which itself stores the arguments until it is launched.
class KernelArgs {
public:
    KernelArgs(Kiln::DeviceFramework framework, std::uint64_t kernel) : mFramework(framework), mKernel(kernel) {}

    /// `bytes` is 4, 8 or 16. On CUDA the argument lands at the next multiple of its own size.
    void Add(const void* value, std::uint32_t bytes);

    /// The arguments in order, each as PackArgument makes it.
    template <class... Values>
    void AddAll(const Values&... values);

    /// Ends the list. @return 0, kStatus_OutOfMemory or kStatus_Failure.
    [[nodiscard]] Status Finish();

private:
    Kiln::DeviceFramework mFramework;
    std::uint64_t mKernel;
    std::int32_t mCudaStatus = 0;
    std::int32_t mOpenCLStatus = 0;
    std::uint32_t mOpenCLIndex = 0;
    std::uint32_t mCudaOffset = 0;
};

/// What an argument becomes: a bool a 32-bit 0 or 1, a pixel format the flag "pixels are 32-bit floats", the rest
/// itself.
template <class T>
[[nodiscard]] constexpr auto PackArgument(const T& value) {
    if constexpr (std::is_same_v<T, bool>) {
        return static_cast<std::int32_t>(value);
    } else if constexpr (std::is_same_v<T, Vellum::PixelFormat>) {
        const bool isHalf =
            value == Vellum::kPixelFormat_GPU_BGRA_4444_16f || value == Vellum::kPixelFormat_GPU_BGRX_4444_16f;
        return static_cast<std::int32_t>(isHalf ? 0 : 1);
    } else {
        static_assert(std::is_same_v<T, std::int32_t> || std::is_same_v<T, std::uint32_t> || std::is_same_v<T, float> ||
                          std::is_same_v<T, DeviceValue> || std::is_same_v<T, float2> ||
                          std::is_same_v<T, Kiln::float4>,
                      "kernels take 32-bit numbers, float2, float4, device values, bool and PixelFormat");
        return value;
    }
}

template <class... Values>
void KernelArgs::AddAll(const Values&... values) {
    const auto add = [this](const auto& packed) { Add(&packed, sizeof packed); };
    (add(PackArgument(values)), ...);
}

/// Keeps a parameter out of deduction, so that arguments convert to the kernel's own types.
template <class T>
struct KernelParameter {
    using Type = T;
};

/// Hands a kernel its arguments. The kernel's list is stated once, by an empty host function with its signature:
///
///     void InvertKernel(PixelFormat, DeviceValue out, std::int32_t width, ...) {}
///     SetKernelArgs(framework, kernel, InvertKernel, format, out, width, ...);
template <class... Parameters>
[[nodiscard]] Status SetKernelArgs(Kiln::DeviceFramework framework, std::uint64_t kernel,
                                   void (&/*signature*/)(Parameters...),
                                   typename KernelParameter<Parameters>::Type... values) {
    KernelArgs args(framework, kernel);
    args.AddAll(values...);
    return args.Finish();
}

struct GridSize {
    std::int32_t x = 1;
    std::int32_t y = 1;
};
struct BlockSize {
    std::int32_t x = 16;
    std::int32_t y = 16;
};

/// The blocks that cover a picture; the last ones reach beyond it.
[[nodiscard]] constexpr GridSize GridFor(std::int32_t width, std::int32_t height, std::int32_t blockX = 16,
                                         std::int32_t blockY = 16) {
    return {(width + blockX - 1) / blockX, (height + blockY - 1) / blockY};
}

/// Sets a kernel's arguments and queues it. Under the device's exclusive access. @return the first negative status.
template <class... Parameters>
[[nodiscard]] Status Launch2D(const Kiln::DeviceRef& device, std::uint64_t kernel, GridSize grid, BlockSize block,
                              void (&signature)(Parameters...), typename KernelParameter<Parameters>::Type... values) {
    const Status status = SetKernelArgs(device->GetFramework(), kernel, signature, values...);
    if (Ostrand::Failed(status)) return status;
    return device->GetCommands()->Launch(kernel, grid.x, grid.y, block.x, block.y, 0);
}

/// As Launch2D, for lists too long to state: each value goes as it is, an array as its numbers.
template <class... Values>
[[nodiscard]] Status LaunchList(const Kiln::DeviceRef& device, std::uint64_t kernel, GridSize grid,
                                const Values&... values) {
    KernelArgs args(device->GetFramework(), kernel);
    const auto add = [&args](const auto& value) {
        using Value = std::decay_t<decltype(value)>;
        if constexpr (std::is_arithmetic_v<Value> || std::is_same_v<Value, Vellum::PixelFormat>) {
            args.AddAll(value);
        } else {
            for (const auto& number : value) args.AddAll(number);
        }
    };
    (add(values), ...);
    const Status status = args.Finish();
    if (Ostrand::Failed(status)) return status;
    const BlockSize block;
    return device->GetCommands()->Launch(kernel, grid.x, grid.y, block.x, block.y, 0);
}

/// Bytes of a pixel in a device frame; 0 for a format that no device renders in.
[[nodiscard]] std::int32_t BytesPerPixel(Vellum::PixelFormat format);

/// A pitch as kernels take it: pixels from one row to the next. 0 for a format that no device renders in.
[[nodiscard]] std::int32_t PitchInPixels(std::int32_t rowBytes, Vellum::PixelFormat format);

}  // namespace Vantrel
