// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// From a kernel's signature to what the CPU driver calls: argument types that carry roles, the layout table, and the
/// loops around a kernel's body.

#include <type_traits>
#include <utility>

#include "SoftCuda/Half.h"
#include "SoftCuda/KernelAbi.h"

struct TextureDescriptor;

// The level is part of the names' type, so that the three copies of a module in one object share no weak symbol.
inline namespace DIALECT_LEVEL {

using SoftCuda::Role;

/// Plain, because a union with a vector type keeps the compiler from vectorising across pixels.
struct Float4 {
    float x, y, z, w;
};

template <Role kRole>
struct FrameArgument {
    static constexpr Role kArgumentRole = kRole;
    unsigned char* address;
};
template <Role kRole>
struct IntArgument {
    static constexpr Role kArgumentRole = kRole;
    int value;
    constexpr operator int() const { return value; }
};
using TargetFrame = FrameArgument<Role::kTarget>;
using SourceFrame = FrameArgument<Role::kSource>;
using SecondFrame = FrameArgument<Role::kSecond>;
using ThirdFrame = FrameArgument<Role::kThird>;
using WorkFrame = FrameArgument<Role::kWork>;
using TargetPitch = IntArgument<Role::kTargetPitch>;
using SourcePitch = IntArgument<Role::kSourcePitch>;
using SecondPitch = IntArgument<Role::kSecondPitch>;
using ThirdPitch = IntArgument<Role::kThirdPitch>;
using WorkPitch = IntArgument<Role::kWorkPitch>;
using FormatFlag = IntArgument<Role::kFormat>;
using Width = IntArgument<Role::kWidth>;
using Height = IntArgument<Role::kHeight>;

/// Any of the frames, for functions that read pixels.
struct AnyFrame {
    const unsigned char* address;
    AnyFrame(const unsigned char* pixels) : address(pixels) {}
    template <Role kRole>
    AnyFrame(FrameArgument<kRole> frame) : address(frame.address) {}
};
/// A frame that may be written.
struct WritableFrame {
    unsigned char* address;
    WritableFrame(TargetFrame frame) : address(frame.address) {}
    WritableFrame(WorkFrame frame) : address(frame.address) {}
};

template <class T, class = void>
struct RoleOf {  // what has no role of its own
    static constexpr Role kValue = !std::is_pointer_v<T>                       ? Role::kPlain
                                   : std::is_const_v<std::remove_pointer_t<T>> ? Role::kConstantPointer
                                                                               : Role::kPointer;
};
template <class T>
struct RoleOf<T, std::void_t<decltype(T::kArgumentRole)>> {
    static constexpr Role kValue = T::kArgumentRole;
};

/// Where each argument lies among the packed parameters: at the next multiple of its own size.
template <class... Arguments>
struct Layout {
    static constexpr std::size_t kCount = sizeof...(Arguments);
    static_assert(((sizeof(Arguments) == 4 || sizeof(Arguments) == 8 || sizeof(Arguments) == 16) && ...),
                  "arguments are 4, 8 or 16 bytes wide");

    SoftCuda::ArgumentRecord records[kCount];
    std::uint32_t bytes;

    static constexpr Layout Make() {
        Layout layout{};
        constexpr std::uint32_t kSizes[] = {sizeof(Arguments)...};
        constexpr Role kRoles[] = {RoleOf<Arguments>::kValue...};
        for (std::size_t i = 0; i < kCount; ++i) {
            const std::uint32_t offset = (layout.bytes + kSizes[i] - 1) & ~(kSizes[i] - 1);
            layout.records[i] = {static_cast<std::uint16_t>(offset), static_cast<std::uint8_t>(kSizes[i]), kRoles[i]};
            layout.bytes = offset + kSizes[i];
        }
        return layout;
    }
};
template <class... Arguments>
inline constexpr Layout<Arguments...> kLayout = Layout<Arguments...>::Make();

template <class T>
inline __attribute__((always_inline)) T ReadArgument(const unsigned char* parameters, std::uint32_t offset) {
    T value;
    __builtin_memcpy(&value, parameters + offset, sizeof value);
    return value;
}

struct StripCell {
    float* target;
    const float *source, *second, *third, *work;
    int x, y, lane;
};

inline __attribute__((always_inline)) Float4 LoadStrip(const float* planes, int lane) {
    using SoftCuda::kPlaneStride;
    return {planes[lane], planes[lane + kPlaneStride], planes[lane + 2 * kPlaneStride],
            planes[lane + 3 * kPlaneStride]};
}
inline __attribute__((always_inline)) void StoreStrip(float* planes, int lane, Float4 value) {
    using SoftCuda::kPlaneStride;
    planes[lane] = value.x;
    planes[lane + kPlaneStride] = value.y;
    planes[lane + 2 * kPlaneStride] = value.z;
    planes[lane + 3 * kPlaneStride] = value.w;
}

template <auto kBody, int kLanes>
struct PointwiseThunk;

template <class... Arguments, void (*kBody)(StripCell, Arguments...), int kLanes>
struct PointwiseThunk<kBody, kLanes> {
    /// The strips as parameters of their own, because only there does the compiler take `__restrict` at its word.
    template <std::size_t... kIndex>
    static void Loop(float* __restrict target, const float* __restrict source, const float* __restrict second,
                     const float* __restrict third, const float* __restrict work, int x, int y, int count,
                     const unsigned char* __restrict parameters, std::index_sequence<kIndex...>) {
        const auto run = [=](auto... values) __attribute__((always_inline)) {
            for (int i = 0; i < count; ++i) kBody(StripCell{target, source, second, third, work, x, y, i}, values...);
        };
        run(ReadArgument<Arguments>(parameters, kLayout<Arguments...>.records[kIndex].offset)...);
    }

    static void RunStrip(const SoftCuda::StripCall& call, const unsigned char* parameters) {
        const auto aligned = [](auto* strip) {
            return static_cast<decltype(strip)>(__builtin_assume_aligned(strip, 64));
        };
        Loop(aligned(call.target), aligned(call.source), aligned(call.second), aligned(call.third), aligned(call.work),
             call.x, call.y, call.count & ~(SoftCuda::kStripGroup - 1), parameters,
             std::index_sequence_for<Arguments...>());
    }

    static constexpr SoftCuda::KernelRecord MakeRecord(const char* name) {
        return {SoftCuda::kKernelAbi,
                SoftCuda::KernelKind::kPointwise,
                name,
                kLayout<Arguments...>.records,
                sizeof...(Arguments),
                kLayout<Arguments...>.bytes,
                1,
                &RunStrip,
                nullptr};
    }
};

struct ThreadCell {
    int x, y;
};

template <auto kBody, int kLanes>
struct RangeThunk;

template <class... Arguments, void (*kBody)(ThreadCell, Arguments...), int kLanes>
struct RangeThunk<kBody, kLanes> {
    static constexpr bool kHasFormat = ((RoleOf<Arguments>::kValue == Role::kFormat) || ...);

    template <int kFormat, class T>
    static __attribute__((always_inline)) T Read(const unsigned char* parameters, std::uint32_t offset) {
        // A known format lets the compiler drop the other format's half of every load and store.
        if constexpr (RoleOf<T>::kValue == Role::kFormat && kFormat >= 0) return T{kFormat};
        return ReadArgument<T>(parameters, offset);
    }

    template <int kFormat, std::size_t... kIndex>
    static __attribute__((noinline)) void Loop(const SoftCuda::RangeCall& call, const unsigned char* parameters,
                                               std::index_sequence<kIndex...>) {
        const auto run = [&call](auto... values) __attribute__((always_inline)) {
            for (int y = call.y0; y < call.y1; ++y)
                for (int x = call.x0; x < call.x1; x += kLanes) kBody(ThreadCell{x, y}, values...);
        };
        run(Read<kFormat, Arguments>(parameters, kLayout<Arguments...>.records[kIndex].offset)...);
    }

    static void RunRange(const SoftCuda::RangeCall& call, const unsigned char* parameters) {
        constexpr auto kSequence = std::index_sequence_for<Arguments...>();
        if constexpr (!kHasFormat) {
            Loop<-1>(call, parameters, kSequence);
        } else {
            int format = 0;
            const auto find = [&](const SoftCuda::ArgumentRecord& record) {
                if (record.role == Role::kFormat) format = ReadArgument<int>(parameters, record.offset);
            };
            for (const SoftCuda::ArgumentRecord& record : kLayout<Arguments...>.records) find(record);
            if (format == 0)
                Loop<0>(call, parameters, kSequence);
            else
                Loop<1>(call, parameters, kSequence);
        }
    }

    static constexpr SoftCuda::KernelRecord MakeRecord(const char* name) {
        return {SoftCuda::kKernelAbi,
                kLanes == 1 ? SoftCuda::KernelKind::kThreads : SoftCuda::KernelKind::kLanes,
                name,
                kLayout<Arguments...>.records,
                sizeof...(Arguments),
                kLayout<Arguments...>.bytes,
                kLanes,
                nullptr,
                &RunRange};
    }
};

typedef float Vector4 __attribute__((vector_size(16)));
typedef int Index4 __attribute__((vector_size(16)));

inline __attribute__((always_inline)) Vector4 LoadVector(AnyFrame frame, int format, int index) {
    if (format == 0) return SoftCuda::LoadHalf4(frame.address + static_cast<std::ptrdiff_t>(index) * 8);
    Vector4 pixel;
    __builtin_memcpy(&pixel, frame.address + static_cast<std::ptrdiff_t>(index) * 16, sizeof pixel);
    return pixel;
}

inline __attribute__((always_inline)) void StoreVector(WritableFrame frame, int format, int index, Vector4 pixel) {
    if (format == 0)
        SoftCuda::StoreHalf4(frame.address + static_cast<std::ptrdiff_t>(index) * 8, pixel);
    else
        __builtin_memcpy(frame.address + static_cast<std::ptrdiff_t>(index) * 16, &pixel, sizeof pixel);
}

inline __attribute__((always_inline)) Float4 LoadPixel(AnyFrame frame, int format, int index) {
    const Vector4 pixel = LoadVector(frame, format, index);
    return {pixel[0], pixel[1], pixel[2], pixel[3]};
}

inline __attribute__((always_inline)) void StorePixel(WritableFrame frame, int format, int index, Float4 value) {
    StoreVector(frame, format, index, Vector4{value.x, value.y, value.z, value.w});
}

/// Rows of four pixels to columns, and back.
inline __attribute__((always_inline)) void Transpose4(Vector4& a, Vector4& b, Vector4& c, Vector4& d) {
    const Vector4 ab0 = __builtin_shuffle(a, b, Index4{0, 4, 1, 5});
    const Vector4 ab1 = __builtin_shuffle(a, b, Index4{2, 6, 3, 7});
    const Vector4 cd0 = __builtin_shuffle(c, d, Index4{0, 4, 1, 5});
    const Vector4 cd1 = __builtin_shuffle(c, d, Index4{2, 6, 3, 7});
    a = __builtin_shuffle(ab0, cd0, Index4{0, 1, 4, 5});
    b = __builtin_shuffle(ab0, cd0, Index4{2, 3, 6, 7});
    c = __builtin_shuffle(ab1, cd1, Index4{0, 1, 4, 5});
    d = __builtin_shuffle(ab1, cd1, Index4{2, 3, 6, 7});
}

}  // namespace DIALECT_LEVEL
