// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>

namespace Kiln::OpenCL {

/// The place on disk of one built program: in KILN_CACHE_DIR, else in "vantrel" under the user's cache folder. Programs
/// are told apart by device, driver version, options and source. A cache that can't be read or written is an empty one;
/// several processes may share it.
class BinaryCache {
public:
    BinaryCache(const std::string& device, const char* source, std::size_t sourceBytes);

    /// The binary; empty when there is none, or when the file isn't whole.
    [[nodiscard]] std::string Read() const;
    void Write(const std::string& binary) const;

private:
    std::filesystem::path mFile;  ///< empty when there is no cache folder
};

}  // namespace Kiln::OpenCL
