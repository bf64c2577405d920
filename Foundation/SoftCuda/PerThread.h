// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace SoftCuda {

/// The calling thread's object of a type. There to the very end of the process: clients' static objects may call the
/// driver after the main thread's own objects are gone, which then get a successor.
template <class T>
[[nodiscard]] T& GetPerThread() {
    thread_local T* object = nullptr;
    struct End {
        ~End() {
            delete object;
            object = nullptr;
        }
    };
    if (object == nullptr) {
        object = new T;
        thread_local const End end;
    }
    return *object;  // NOLINT(clang-analyzer-core.uninitialized.UndefReturn): `end` lasts as long as the thread
}

}  // namespace SoftCuda
