// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/RecordUpload.h"

namespace Vantrel {

Status RecordUpload::Send(ModuleSymbol& symbol) {
    if (!GetBlock()) return Ostrand::kStatus_OutOfMemory;
    std::uint64_t destination = 0;
    if (mDevice->GetFramework() == Kiln::DeviceFramework::kOpenCL) {
        mBuffer = std::make_unique<Kiln::DeviceScratchBuffer>(mDevice, mBytes);
        destination = mBuffer->GetHandle();
    } else {
        destination = GetSymbol(symbol.table, mDevice, symbol.moduleKey, symbol.symbolName);
    }
    if (destination == 0) return Ostrand::kStatus_OutOfMemory;
    return mDevice->GetCommands()->CopyHostToDevice(GetBlock(), destination, mBytes, nullptr);
}

}  // namespace Vantrel
