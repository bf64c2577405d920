// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Host/Timeline/Model.h"
#include "Tests/Host/EngineWalk.h"

namespace Vantrel::Host::Test {

/// Says what a document shows at a time by going straight from items to media: no segments, no trees, no offsets. It
/// expands tracks by itself, in floating point, and shares no code with the description.
class DirectEvaluator {
public:
    DirectEvaluator(const Document& document, std::int64_t frameTicks) : mDocument(document), mFrame(frameTicks) {}

    [[nodiscard]] std::vector<Shown> At(std::int64_t time);

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
    };

    [[nodiscard]] static Expanded Expand(const Item& track);
    [[nodiscard]] static std::int64_t LengthOf(const Item& composition);
    void ShowComposition(const Item& composition, std::int64_t time);
    void ShowStack(const Item& stack, std::int64_t time);
    void ShowTrack(const Item& track, std::int64_t time);
    void ShowItem(const Item& item, std::int64_t length, std::int64_t itemTime);

    const Document& mDocument;
    std::int64_t mFrame;
    std::vector<Shown> mShown;
};

}  // namespace Vantrel::Host::Test
