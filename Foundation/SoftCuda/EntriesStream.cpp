// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Streams and events.

#include "SoftCuda/Objects.h"

using namespace SoftCuda;

namespace SoftCuda {

CUresult FindStream(CUstream handle, CUstream_st*& stream) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    // 1 and 2 are the API's names for the default stream of the process and of the thread; here they are one.
    constexpr std::uintptr_t kLastName = 2;
    stream = reinterpret_cast<std::uintptr_t>(handle) <= kLastName ? &context->defaultStream : handle;
    return CUDA_SUCCESS;
}

std::vector<StreamPoint> GetDependencies(CUstream_st& stream) {
    std::vector<StreamPoint> points;
    const auto add = [&](const CUstream_st& other) {
        if (!other.stream->IsIdle()) points.push_back({other.stream, other.stream->GetLast()});
    };
    CUcontext context = stream.context;
    if (&stream != &context->defaultStream) {
        if (stream.blocking) add(context->defaultStream);
        return points;
    }
    const std::lock_guard<std::mutex> lock(context->mutex);
    for (const auto& other : context->streams)
        if (other->blocking) add(*other);
    return points;
}

CUresult Enqueue(CUstream handle, bool wait, std::function<void()> work) {
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    const std::uint64_t ticket = stream->stream->Submit(std::move(work), GetDependencies(*stream));
    if (wait) stream->stream->Wait(ticket);
    return CUDA_SUCCESS;
}

}  // namespace SoftCuda

extern "C" {

CUresult cuStreamCreate(CUstream* stream, unsigned flags) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (stream == nullptr || flags > CU_STREAM_NON_BLOCKING) return CUDA_ERROR_INVALID_VALUE;
    auto made = std::make_unique<CUstream_st>();
    made->context = context;
    made->blocking = flags != CU_STREAM_NON_BLOCKING;
    *stream = made.get();
    const std::lock_guard<std::mutex> lock(context->mutex);
    context->streams.insert(std::move(made));
    return CUDA_SUCCESS;
}

CUresult cuStreamDestroy(CUstream stream) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (stream == nullptr || stream->context == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    context = stream->context;
    std::unique_ptr<CUstream_st> owned;
    {
        const std::lock_guard<std::mutex> lock(context->mutex);
        const auto found = FindOwned(context->streams, stream);
        if (found == context->streams.end()) return CUDA_ERROR_INVALID_HANDLE;
        owned = std::move(context->streams.extract(found).value());
    }
    owned->stream->Wait(owned->stream->GetLast());
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuStreamDestroy);

CUresult cuStreamQuery(CUstream handle) {
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    return stream->stream->IsIdle() ? CUDA_SUCCESS : CUDA_ERROR_NOT_READY;
}

CUresult cuStreamSynchronize(CUstream handle) {
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    stream->stream->Wait(stream->stream->GetLast());
    return CUDA_SUCCESS;
}

CUresult cuStreamWaitEvent(CUstream handle, CUevent event, unsigned /*flags*/) {
    if (event == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    const auto record = event->Get();
    if (!record) return CUDA_SUCCESS;
    std::vector<StreamPoint> after = GetDependencies(*stream);
    // Within one stream the order is there already, and a stream can't wait for itself.
    if (record->point.stream != stream->stream) after.push_back(record->point);
    stream->stream->Submit([] {}, std::move(after));
    return CUDA_SUCCESS;
}

CUresult cuEventCreate(CUevent* event, unsigned /*flags*/) {
    CUcontext context = nullptr;
    if (const CUresult result = NeedContext(context); result != CUDA_SUCCESS) return result;
    if (event == nullptr) return CUDA_ERROR_INVALID_VALUE;
    auto made = std::make_unique<CUevent_st>();
    made->context = context;
    *event = made.release();  // owned by the handle until cuEventDestroy
    return CUDA_SUCCESS;
}

CUresult cuEventDestroy(CUevent event) {
    if (event == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    const std::unique_ptr<CUevent_st> owned(event);
    return CUDA_SUCCESS;
}
SOFTCUDA_V2(cuEventDestroy);

CUresult cuEventRecord(CUevent event, CUstream handle) {
    if (event == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    CUstream_st* stream = nullptr;
    if (const CUresult result = FindStream(handle, stream); result != CUDA_SUCCESS) return result;
    const auto record = std::make_shared<CUevent_st::Record>();
    record->point.stream = stream->stream;
    record->point.ticket = stream->stream->Submit(record->time, GetDependencies(*stream));
    const std::lock_guard<std::mutex> lock(event->mutex);
    event->record = record;
    return CUDA_SUCCESS;
}

CUresult cuEventQuery(CUevent event) {
    if (event == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    const auto record = event->Get();
    return !record || record->IsReached() ? CUDA_SUCCESS : CUDA_ERROR_NOT_READY;
}

CUresult cuEventSynchronize(CUevent event) {
    if (event == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    if (const auto record = event->Get()) record->point.stream->Wait(record->point.ticket);
    return CUDA_SUCCESS;
}

CUresult cuEventElapsedTime(float* milliseconds, CUevent start, CUevent end) {
    if (milliseconds == nullptr) return CUDA_ERROR_INVALID_VALUE;
    if (start == nullptr || end == nullptr) return CUDA_ERROR_INVALID_HANDLE;
    const auto first = start->Get();
    const auto last = end->Get();
    if (!first || !last) return CUDA_ERROR_INVALID_HANDLE;
    if (!first->IsReached() || !last->IsReached()) return CUDA_ERROR_NOT_READY;
    *milliseconds = std::chrono::duration<float, std::milli>(*last->time - *first->time).count();
    return CUDA_SUCCESS;
}

}  // extern "C"
