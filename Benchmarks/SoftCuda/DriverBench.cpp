// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// What the CPU driver makes of kernels on 1080p frames, next to a plain copy of the same bytes in the same run.
// Arguments: format (0: 16-bit, 1: 32-bit floats), threads.

#include <benchmark/benchmark.h>
#include <dlfcn.h>

#include <cstdlib>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "Kiln/Modules.h"
#include "SoftCuda/Controls.h"
#include "SoftCuda/DriverApi.h"

namespace {

std::map<std::string, const void*>& GetImages() {
    static std::map<std::string, const void*> images;
    return images;
}

}  // namespace

void Kiln::AddModules(const ModuleImage* images, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) GetImages()[images[i].key] = images[i].cpuImage;
}

namespace {

constexpr int kWidth = 1920;
constexpr int kHeight = 1080;

/// The driver, a context, and enough frames that none is in a cache when its turn comes.
class Bench {
public:
    static Bench& Get() {
        static Bench bench;
        return bench;
    }

    template <class Function>
    Function* Bind(const char* name) const {
        void* entry = dlsym(mLibrary, name);
        if (entry == nullptr) std::abort();
        return reinterpret_cast<Function*>(entry);
    }
#define BENCH_CALL(name, ...) Bench::Get().Bind<decltype(name)>(#name)(__VA_ARGS__)

    CUfunction Find(const char* name) {
        CUfunction function = nullptr;
        if (Bind<decltype(cuModuleGetFunction)>("cuModuleGetFunction")(&function, mModule, name) != CUDA_SUCCESS)
            std::abort();
        return function;
    }

    static constexpr int kFrames = 6;
    CUdeviceptr frames[kFrames] = {};

private:
    Bench() : mLibrary(dlopen(SOFTCUDA_LIBRARY, RTLD_NOW | RTLD_LOCAL)) {
        CUcontext context = nullptr;
        Bind<decltype(cuInit)>("cuInit")(0);
        Bind<decltype(cuCtxCreate)>("cuCtxCreate_v2")(&context, 0, 0);
        Bind<decltype(cuModuleLoadData)>("cuModuleLoadData")(&mModule, GetImages().at("TestKernels"));
        const std::vector<float> pattern(kWidth * kHeight * 4, 0.5F);
        for (CUdeviceptr& frame : frames) {
            Bind<decltype(cuMemAlloc)>("cuMemAlloc_v2")(&frame, pattern.size() * 4);
            Bind<decltype(cuMemcpyHtoD)>("cuMemcpyHtoD_v2")(frame, pattern.data(), pattern.size() * 4);
        }
    }

    void* mLibrary;
    CUmodule mModule = nullptr;
};

void Launch(CUfunction function, std::vector<void*> parameters) {
    const auto launch = Bench::Get().Bind<decltype(cuLaunchKernel)>("cuLaunchKernel");
    if (launch(function, kWidth / 16, (kHeight + 15) / 16, 1, 16, 16, 1, 0, nullptr, parameters.data(), nullptr) !=
        CUDA_SUCCESS)
        std::abort();
}

/// Runs `launch(frame number)` once an iteration and waits.
template <class Function>
void Measure(benchmark::State& state, const Function& launch) {
    BENCH_CALL(SoftCudaSetThreads, static_cast<unsigned>(state.range(1)));
    const auto synchronize = Bench::Get().Bind<decltype(cuCtxSynchronize)>("cuCtxSynchronize");
    int frame = 0;
    for (auto _ : state) {
        launch(frame++ % Bench::kFrames);
        synchronize();
    }
    const std::int64_t bytes = std::int64_t{kWidth} * kHeight * (state.range(0) == 0 ? 8 : 16);
    state.SetBytesProcessed(state.iterations() * bytes);
}

int gFormat, gWidth = kWidth, gHeight = kHeight;

void CopyPlain(benchmark::State& state) {
    const std::size_t bytes = std::size_t{kWidth} * kHeight * (state.range(0) == 0 ? 8 : 16);
    Bench& bench = Bench::Get();
    int frame = 0;
    for (auto _ : state) {
        std::memcpy(reinterpret_cast<void*>(bench.frames[frame % Bench::kFrames]),
                    reinterpret_cast<const void*>(bench.frames[(frame + 3) % Bench::kFrames]), bytes);
        ++frame;
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(bytes));
}

void CopyByDriver(benchmark::State& state) {
    const std::size_t bytes = std::size_t{kWidth} * kHeight * (state.range(0) == 0 ? 8 : 16);
    Measure(state, [&](int frame) {
        Bench& bench = Bench::Get();
        BENCH_CALL(cuMemcpyDtoDAsync, bench.frames[frame], bench.frames[(frame + 3) % Bench::kFrames], bytes, nullptr);
    });
}

void RunTwoFrames(benchmark::State& state, const char* kernel, bool withBlend, bool inPlace) {
    gFormat = static_cast<int>(state.range(0));
    CUfunction function = Bench::Get().Find(kernel);
    float blend = 0.25F;
    Measure(state, [&](int frame) {
        CUdeviceptr *out = &Bench::Get().frames[frame],
                    *in = &Bench::Get().frames[inPlace ? frame : (frame + 3) % Bench::kFrames];
        std::vector<void*> parameters{&gFormat, out, &gWidth, &gHeight, &gWidth, in, &gWidth};
        if (withBlend) parameters.push_back(&blend);
        Launch(function, parameters);
    });
}

void CopyByKernel(benchmark::State& state) { RunTwoFrames(state, "CopyKernel", false, false); }
void InvertInPlace(benchmark::State& state) { RunTwoFrames(state, "InvertKernel", true, true); }
void InvertToFresh(benchmark::State& state) { RunTwoFrames(state, "InvertKernel", true, false); }

void GainChain(benchmark::State& state) {
    gFormat = static_cast<int>(state.range(0));
    CUfunction function = Bench::Get().Find("GainKernel");
    float gain = 1.0F, lift = 0.0F;
    Measure(state, [&](int frame) {
        for (std::int64_t i = 0; i < state.range(2); ++i)
            Launch(function, {&Bench::Get().frames[frame], &gWidth, &gFormat, &gWidth, &gHeight, &gain, &lift});
    });
}

void Grade(benchmark::State& state) {
    gFormat = static_cast<int>(state.range(0));
    CUfunction function = Bench::Get().Find("GradeKernel");
    float lift = 0.01F, gamma = 0.9F, gain = 1.0F, saturation = 1.1F;
    Measure(state, [&](int frame) {
        Launch(function,
               {&Bench::Get().frames[frame], &gWidth, &gFormat, &gWidth, &gHeight, &lift, &gamma, &gain, &saturation});
    });
}

void Dissolve(benchmark::State& state) {
    gFormat = static_cast<int>(state.range(0));
    CUfunction function = Bench::Get().Find("BlendKernel");
    float t = 0.3F;
    Measure(state, [&](int frame) {
        CUdeviceptr* frames = Bench::Get().frames;
        Launch(function, {&frames[frame], &gWidth, &frames[(frame + 2) % Bench::kFrames], &gWidth,
                          &frames[(frame + 4) % Bench::kFrames], &gWidth, &gFormat, &gWidth, &gHeight, &t});
    });
}

void Shift(benchmark::State& state) {
    gFormat = static_cast<int>(state.range(0));
    CUfunction function = Bench::Get().Find("ShiftKernel");
    float offset = 2.25F;
    Measure(state, [&](int frame) {
        CUdeviceptr* frames = Bench::Get().frames;
        Launch(function, {&gFormat, &frames[(frame + 3) % Bench::kFrames], &gWidth, &frames[frame], &gWidth, &gWidth,
                          &gHeight, &offset});
    });
}

void FormatsAndThreads(benchmark::internal::Benchmark* each) {
    for (int format = 1; format >= 0; --format)
        for (int threads = 1; threads <= 2; ++threads) each->Args({format, threads});
    each->MeasureProcessCPUTime()->UseRealTime()->Unit(benchmark::kMillisecond);
}
void Chains(benchmark::internal::Benchmark* each) {
    for (int format = 1; format >= 0; --format)
        for (int links : {1, 4, 8}) each->Args({format, 1, links});
    each->MeasureProcessCPUTime()->UseRealTime()->Unit(benchmark::kMillisecond);
}

BENCHMARK(CopyPlain)->Args({1, 1})->Args({0, 1})->MeasureProcessCPUTime()->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(CopyByDriver)->Apply(FormatsAndThreads);
BENCHMARK(CopyByKernel)->Apply(FormatsAndThreads);
BENCHMARK(InvertInPlace)->Apply(FormatsAndThreads);
BENCHMARK(InvertToFresh)->Apply(FormatsAndThreads);
BENCHMARK(GainChain)->Apply(Chains);
BENCHMARK(Grade)->Apply(FormatsAndThreads);
BENCHMARK(Dissolve)->Apply(FormatsAndThreads);
BENCHMARK(Shift)->Apply(FormatsAndThreads);

}  // namespace

BENCHMARK_MAIN();
