// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Entries of the CPU driver that no other driver has. Tests and traces find them by name in the loaded library and do
/// without where they are absent. All may be called from any thread.

extern "C" {

/// What the driver has done since it was loaded. Counts only grow.
struct SoftCudaCounters {
    unsigned long long launches;      ///< kernel launches accepted
    unsigned long long pointwise;     ///< of these, launches of pointwise kernels
    unsigned long long passes;        ///< passes over memory that the pointwise launches took
    unsigned long long fused;         ///< pointwise launches that shared an earlier launch's pass
    unsigned long long timerFlushes;  ///< passes begun because nothing came for a while
    unsigned long long refusedAllocations;
};

/// Lets every n-th device allocation fail with CUDA_ERROR_OUT_OF_MEMORY, counted from this call; 0 ends it. The
/// environment variable SOFTCUDA_FAIL_EVERY sets it from the start.
void SoftCudaSetFailEvery(unsigned n);

/// Turns the fusing of pointwise launches on (the default) or off. Flushes first. SOFTCUDA_FUSE=0 turns it off from the
/// start.
void SoftCudaSetFusing(int on);

/// Lets at most so many threads work on a kernel. SOFTCUDA_THREADS sets it from the start.
void SoftCudaSetThreads(unsigned threads);

/// Why the last failing call on this thread failed, where the code alone doesn't tell. Valid until the next call.
const char* SoftCudaGetMessage(void);

void SoftCudaGetCounters(SoftCudaCounters* counters);

/// One line on the driver: threads, instruction-set level, memory, fusing. Valid for the life of the process.
const char* SoftCudaDescribe(void);
}
