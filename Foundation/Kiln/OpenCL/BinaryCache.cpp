// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/OpenCL/BinaryCache.h"

#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <fstream>
#include <iterator>

#include "Ostrand/MixHash.h"

namespace Kiln::OpenCL {
namespace {

std::filesystem::path GetCacheFolder() {
    const auto read = [](const char* name) {
        const char* value = std::getenv(name);
        return std::filesystem::path(value ? value : "");
    };
    if (auto folder = read("KILN_CACHE_DIR"); !folder.empty()) return folder;
    if (const auto folder = read("XDG_CACHE_HOME"); !folder.empty()) return folder / "vantrel";
    if (const auto folder = read("HOME"); !folder.empty()) return folder / ".cache" / "vantrel";
    return {};
}

// Stands before the binary: platforms needn't survive a file that was cut short.
std::string Seal(const std::string& binary) {
    return Ostrand::NodeHasher().Text("OpenCL binary").Bytes(binary.data(), binary.size()).Finish().ToString();
}

}  // namespace

BinaryCache::BinaryCache(const std::string& device, const char* source, std::size_t sourceBytes) {
    const auto folder = GetCacheFolder();
    if (folder.empty()) return;
    const auto key = Ostrand::NodeHasher().Bytes(device.data(), device.size()).Bytes(source, sourceBytes).Finish();
    mFile = folder / (key.ToString() + ".clbin");
}

std::string BinaryCache::Read() const {
    std::ifstream stream(mFile, std::ios::binary);
    std::string content{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    const std::size_t sealLength = Seal({}).size();
    if (content.size() <= sealLength) return {};
    std::string binary = content.substr(sealLength);
    return content.compare(0, sealLength, Seal(binary)) == 0 ? binary : std::string();
}

void BinaryCache::Write(const std::string& binary) const {
    if (mFile.empty() || binary.empty()) return;
    std::error_code error;
    std::filesystem::create_directories(mFile.parent_path(), error);
    static std::atomic<unsigned> counter{0};
    std::filesystem::path draft = mFile;
    draft += "." + std::to_string(getpid()) + "-" + std::to_string(counter++);
    bool isWritten = false;
    {
        std::ofstream stream(draft, std::ios::binary);
        stream << Seal(binary) << binary;
        isWritten = stream.flush().good();
    }
    if (isWritten) std::filesystem::rename(draft, mFile, error);
    if (!isWritten || error) std::filesystem::remove(draft, error);
}

}  // namespace Kiln::OpenCL
