// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "Src/Kernels/CudaDriver.h"
#include "Src/Kernels/OpenCLLibrary.h"

namespace Vantrel::Testing {

/// Listens to what kernels are handed while it lives, on either framework; the kernels run all the same. One at a time.
class KernelArguments {
public:
    using Bytes = std::vector<unsigned char>;
    /// What one kernel was handed.
    struct List {
        std::vector<Bytes> arguments;

        [[nodiscard]] std::size_t Count() const { return arguments.size(); }
        template <class T>
        [[nodiscard]] T Get(std::size_t index) const {
            T value{};
            EXPECT_LT(index, arguments.size());
            if (index >= arguments.size()) return value;
            EXPECT_EQ(arguments[index].size(), sizeof value) << "argument " << index;
            std::memcpy(&value, arguments[index].data(), std::min(sizeof value, arguments[index].size()));
            return value;
        }
    };

    KernelArguments() : mCuda(GetCudaDriver().cuParamSetv), mOpenCL(GetOpenCL().clSetKernelArg) {
        Current() = this;
        GetCudaDriver().cuParamSetv = [](CUfunction kernel, int offset, void* value, unsigned bytes) {
            Current()->Note(offset == 0, value, bytes);
            return Current()->mCuda(kernel, offset, value, bytes);
        };
        GetOpenCL().clSetKernelArg = [](cl_kernel kernel, cl_uint index, std::size_t bytes, const void* value) {
            Current()->Note(index == 0, value, bytes);
            return Current()->mOpenCL(kernel, index, bytes, value);
        };
    }
    ~KernelArguments() {
        GetCudaDriver().cuParamSetv = mCuda;
        GetOpenCL().clSetKernelArg = mOpenCL;
        Current() = nullptr;
    }
    KernelArguments(const KernelArguments&) = delete;
    KernelArguments& operator=(const KernelArguments&) = delete;

    /// In the order of their launches.
    std::vector<List> kernels;

private:
    static KernelArguments*& Current() {
        static KernelArguments* current = nullptr;
        return current;
    }
    void Note(bool isFirst, const void* value, std::size_t bytes) {
        if (isFirst) kernels.emplace_back();
        const auto* first = static_cast<const unsigned char*>(value);
        kernels.back().arguments.emplace_back(first, first + bytes);
    }

    decltype(CudaDriverTable::cuParamSetv) mCuda;
    decltype(OpenCLTable::clSetKernelArg) mOpenCL;
};

}  // namespace Vantrel::Testing
