// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include <boost/shared_ptr.hpp>

namespace Vantrel {

/// Owns the host's id of a node and gives it back at the end. The views of one node share it.
class VideoNodeIDOwner {
public:
    explicit VideoNodeIDOwner(std::uint32_t nodeID) : mNodeID(nodeID) {}
    ~VideoNodeIDOwner();
    VideoNodeIDOwner(const VideoNodeIDOwner&) = delete;
    VideoNodeIDOwner& operator=(const VideoNodeIDOwner&) = delete;

    [[nodiscard]] std::uint32_t GetNodeID() const { return mNodeID; }

private:
    std::uint32_t mNodeID;
};

using VideoNodeIDOwnerRef = boost::shared_ptr<VideoNodeIDOwner>;

}  // namespace Vantrel
