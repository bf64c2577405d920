// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <vector>

#include "Kiln/OpenCL/Backend.h"
#include "Kiln/OpenCL/BinaryCache.h"

namespace Kiln::OpenCL {

std::uint64_t OpenCLBackend::LoadModule(const ModuleImage& image, std::string& message) {
    if (!image.openclSource) {
        message = "the build carries no OpenCL source of the module";
        return 0;
    }
    const BinaryCache cache(mFacts.description + mBuildOptions, image.openclSource, image.openclSourceBytes);
    cl_program program = nullptr;
    if (const std::string binary = cache.Read(); !binary.empty()) program = BuildBinary(binary);
    if (!program) {
        program = BuildSource(image, message);
        if (program) cache.Write(GetBinary(program));
    }
    return reinterpret_cast<std::uint64_t>(program);
}

void OpenCLBackend::UnloadModule(std::uint64_t module) {
    GetDriver().clReleaseProgram(reinterpret_cast<cl_program>(module));
}

cl_program OpenCLBackend::BuildSource(const ModuleImage& image, std::string& message) {
    cl_int result = CL_SUCCESS;
    const char* source = image.openclSource;
    const std::size_t length = image.openclSourceBytes;
    ScopedObject<cl_program> program(
        GetDriver().clCreateProgramWithSource(mSession.context.Get(), 1, &source, &length, &result),
        GetDriver().clReleaseProgram);
    if (result != CL_SUCCESS) {
        message = "the platform doesn't take the source: OpenCL code " + std::to_string(result);
        return nullptr;
    }
    result = GetDriver().clBuildProgram(program.Get(), 1, &mSession.device, mBuildOptions.c_str(), nullptr, nullptr);
    if (result == CL_SUCCESS) return program.Detach();
    message = "the module doesn't build: OpenCL code " + std::to_string(result) + "\n" + GetBuildLog(program.Get());
    return nullptr;
}

cl_program OpenCLBackend::BuildBinary(const std::string& binary) {
    cl_int result = CL_SUCCESS;
    const std::size_t length = binary.size();
    const auto* bytes = reinterpret_cast<const unsigned char*>(binary.data());
    ScopedObject<cl_program> program(GetDriver().clCreateProgramWithBinary(mSession.context.Get(), 1, &mSession.device,
                                                                           &length, &bytes, nullptr, &result),
                                     GetDriver().clReleaseProgram);
    if (result != CL_SUCCESS) return nullptr;
    result = GetDriver().clBuildProgram(program.Get(), 1, &mSession.device, mBuildOptions.c_str(), nullptr, nullptr);
    return result == CL_SUCCESS ? program.Detach() : nullptr;
}

std::string OpenCLBackend::GetBuildLog(cl_program program) const {
    std::size_t size = 0;
    GetDriver().clGetProgramBuildInfo(program, mSession.device, CL_PROGRAM_BUILD_LOG, 0, nullptr, &size);
    std::string log(size, '\0');
    GetDriver().clGetProgramBuildInfo(program, mSession.device, CL_PROGRAM_BUILD_LOG, size, log.data(), nullptr);
    while (!log.empty() && (log.back() == '\0' || log.back() == '\n')) log.pop_back();
    return log;
}

std::string OpenCLBackend::GetBinary(cl_program program) const {
    std::size_t size = 0;
    if (GetDriver().clGetProgramInfo(program, CL_PROGRAM_BINARY_SIZES, sizeof size, &size, nullptr) != CL_SUCCESS) {
        return {};
    }
    std::string binary(size, '\0');
    auto* bytes = reinterpret_cast<unsigned char*>(binary.data());
    const cl_int result = GetDriver().clGetProgramInfo(program, CL_PROGRAM_BINARIES, sizeof bytes, &bytes, nullptr);
    return result == CL_SUCCESS ? binary : std::string();
}

}  // namespace Kiln::OpenCL
