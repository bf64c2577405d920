// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// For device files with much that is the same for all pixels and yet decides something; included behind Dialect.h.

/// `a` where the condition isn't 0, else `b`, without a branch: for conditions that are the same for all pixels. With
/// `?:` the compiler makes a loop for each way that several of them can turn out, or gives up.
DEVICE_FUNCTION float Choose(int condition, float a, float b) {
    const int mask = -(int)(condition != 0);
    return AsFloat((AsInt(a) & mask) | (AsInt(b) & ~mask));
}

/// A pointwise kernel that is made several times, for instance with and without a costly part. `expression` is of the
/// arguments alone and gives a number below `count`; the body begins with CHOICE(expression) and finds it in `choice`.
#if defined(__OPENCL_VERSION__) || defined(__CUDA__) || defined(__CUDACC__)
#define POINTWISE_CHOICES(Name, count, expression, ...) POINTWISE_KERNEL(Name, __VA_ARGS__)
#define CHOICE(expression) const int choice = (expression)
#else
#define POINTWISE_CHOICES(Name, count, expression, ...)                                                  \
    static inline int Name##Choice(__VA_ARGS__) { return (expression); }                                 \
    static inline void Name##Body(const StripCell cell_, const int choice, __VA_ARGS__);                 \
    DIALECT_EXPORT const SoftCuda::KernelRecord DIALECT_SYMBOL(kernel, DIALECT_LEVEL, Name);             \
    constexpr SoftCuda::KernelRecord DIALECT_SYMBOL(kernel, DIALECT_LEVEL, Name) =                       \
        ChoiceThunk<&Name##Body, &Name##Choice, count>::MakeRecord(#Name);                               \
    __attribute__((always_inline)) static inline void Name##Body([[maybe_unused]] const StripCell cell_, \
                                                                 const int choice, __VA_ARGS__)
#define CHOICE(expression) (void)choice

inline namespace DIALECT_LEVEL {

template <auto kBody, auto kChoose, int kCount>
struct ChoiceThunk;

template <class... Arguments, void (*kBody)(StripCell, int, Arguments...), int (*kChoose)(Arguments...), int kCount>
struct ChoiceThunk<kBody, kChoose, kCount> {
    template <int kChoice>
    static __attribute__((always_inline)) void BodyOf(StripCell cell, Arguments... values) {
        kBody(cell, kChoice, values...);
    }

    template <std::size_t... kIndex>
    static int ReadChoice(const unsigned char* parameters, std::index_sequence<kIndex...>) {
        return kChoose(ReadArgument<Arguments>(parameters, kLayout<Arguments...>.records[kIndex].offset)...);
    }

    template <int... kChoice>
    static void RunChoice(const SoftCuda::StripCall& call, const unsigned char* parameters,
                          std::integer_sequence<int, kChoice...>) {
        const int choice = ReadChoice(parameters, std::index_sequence_for<Arguments...>());
        ((choice == kChoice ? PointwiseThunk<&BodyOf<kChoice>, 1>::RunStrip(call, parameters) : void()), ...);
    }

    static void RunStrip(const SoftCuda::StripCall& call, const unsigned char* parameters) {
        RunChoice(call, parameters, std::make_integer_sequence<int, kCount>());
    }

    static constexpr SoftCuda::KernelRecord MakeRecord(const char* name) {
        SoftCuda::KernelRecord record = PointwiseThunk<&BodyOf<0>, 1>::MakeRecord(name);
        record.runStrip = &RunStrip;
        return record;
    }
};

}  // namespace DIALECT_LEVEL
#endif
