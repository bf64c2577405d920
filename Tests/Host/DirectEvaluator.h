// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "Host/Timeline/Model.h"

namespace Vantrel::Host::Test {

/// A media frame in a picture.
struct Shown {
    std::string media;
    std::int64_t mediaTime = 0;
    std::int64_t frame = 0;
};

/// What is seen at a moment, as the items say it.
struct Sight {
    enum class Kind {
        kFrame,       ///< of media
        kPlain,       ///< one opaque level
        kLayers,      ///< parts from the bottom up
        kTransition,  ///< parts are the outgoing side and the incoming one; a blank side has no layers
        kSum,         ///< parts by their weights
        kInverted,    ///< its one part
        kAdjustment,  ///< whatever lies below it, and nothing of its own
    };

    Kind kind = Kind::kLayers;
    Shown frame;
    double level = 0;  ///< kPlain
    std::vector<Sight> parts;
    std::vector<double> weights;  ///< kSum
    const Item* item = nullptr;   ///< kTransition, kAdjustment
    double fraction = 0;          ///< kTransition: how much of it has passed
};

/// Says what a document shows at a time by going straight from items to media: no segments, no trees, no offsets. It
/// expands tracks by itself, in floating point, and shares no code with the description.
class DirectEvaluator {
public:
    DirectEvaluator(const Document& document, std::int64_t frameTicks) : mDocument(document), mFrame(frameTicks) {}

    /// Where frames don't map one to one, the frame nearer to a time between two stands at it, as pictures are
    /// rendered.
    [[nodiscard]] Sight SightAt(std::int64_t time);
    /// Something in the last sight lay so near between two frames that rounding decides.
    [[nodiscard]] bool IsDoubtful() const { return mDoubtful; }

private:
    struct Part {
        const Item* item = nullptr;
        std::int64_t start = 0;
        std::int64_t length = 0;
    };
    struct Join {
        std::int64_t cut = 0;
        const Item* transition = nullptr;
        std::vector<Part>::size_type before = 0;
        std::vector<Part>::size_type after = 0;
    };

    struct Expanded {
        std::vector<Part> parts;
        /// Those that fit.
        std::vector<Join> joins;
        std::int64_t end = 0;

        [[nodiscard]] bool Shows(std::size_t part) const;
        [[nodiscard]] bool Joins(std::size_t part) const;
    };

    [[nodiscard]] static Expanded Expand(const Item& track);
    [[nodiscard]] static std::int64_t LengthOf(const Item& composition);
    [[nodiscard]] static std::int64_t LayerLength(const Item& layer);
    [[nodiscard]] Sight ShowComposition(const Item& composition, std::int64_t time);
    [[nodiscard]] Sight ShowLayers(const std::vector<const Item*>& layers, std::int64_t time);
    [[nodiscard]] Sight ShowTrack(const Item& track, std::int64_t time);
    [[nodiscard]] Sight ShowItem(const Item& item, std::int64_t length, std::int64_t itemTime);
    [[nodiscard]] Sight ShowContent(const Item& item, std::int64_t length, std::int64_t itemTime);
    [[nodiscard]] Sight ShowMedia(const Item& item, std::int64_t mediaTime, double speed);
    [[nodiscard]] std::int64_t NearestFrame(std::int64_t mediaTime, std::int64_t step);

    const Document& mDocument;
    std::int64_t mFrame;
    bool mDoubtful = false;
};

}  // namespace Vantrel::Host::Test
