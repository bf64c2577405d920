// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace Ostrand {

/// A module that is found at run time. Once loaded it stays for as long as the process lives, so what was taken from it
/// stays valid.
class Module {
public:
    /// Looks for the file in the folders of the environment variable VANTREL_PLUGINS (separated by colons) and nowhere
    /// else; without the variable beside this library, in the folder "vantrel" there, and where the system looks. Empty
    /// if it isn't found or can't be loaded. Any thread.
    [[nodiscard]] static Module Load(const char* name);

    [[nodiscard]] explicit operator bool() const { return mHandle != nullptr; }
    /// The address of an entry point; null if there is none, or no module.
    [[nodiscard]] void* GetProcAddress(const char* name) const;

private:
    void* mHandle = nullptr;
};

}  // namespace Ostrand
