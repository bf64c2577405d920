// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "Host/Media/MediaInfo.h"
#include "Host/Time/TimeMap.h"
#include "Host/Timeline/Parameters.h"

/// What a timeline file says, checked and in ticks, before anything is laid out on tracks. Immutable once read. A
/// `path` is the place in the file ("/tracks/children/0"): it serves messages and keeps identifiers stable over edits.
namespace Vantrel::Host {

struct TimeRange {
    std::int64_t start = 0;
    std::int64_t duration = 0;
};

struct Effect {
    std::string path;
    std::string name;
    /// Key of the engine's registry, "lavfi:<graph>", or any other name.
    std::string matchName;
    /// Graph of libavfilter, parameters as {name}; empty if there is none.
    std::string filterGraph;
    /// Base64, as it goes to the engine.
    std::string opaqueData;
    /// By rising index. An effect with a table has all of its table's.
    std::vector<Parameter> parameters;
    /// The picture changes with time though no parameter does.
    bool timeDependent = false;
};

/// What a sequence may fix of its format; what it leaves open comes from its parent or its media.
struct SequenceSettings {
    std::optional<std::int32_t> width;
    std::optional<std::int32_t> height;
    std::optional<std::int64_t> frameTicks;
    std::optional<std::array<std::int32_t, 2>> aspect;
    std::optional<FieldType> fieldType;
};

struct Title {
    std::string text;
    /// Family name; empty for the default.
    std::string font;
    /// In pixels of the sequence; 0 for a tenth of its height.
    double size = 0;
    /// Red, green, blue, alpha in 0..1.
    std::array<double, 4> color{1, 1, 1, 1};
    /// Of the text's middle, in fractions of the frame.
    std::array<double, 2> position{0.5, 0.5};
    /// -1 left, 0 centred, 1 right: which edge of the text stands at `position`.
    std::int32_t align = 0;
};

enum class ReferenceKind { kMissing, kFile, kImageSequence, kGenerator };

struct MediaReference {
    std::string path;
    ReferenceKind kind = ReferenceKind::kMissing;
    std::optional<TimeRange> availableRange;
    /// Frame length of `availableRange`, as snapped.
    std::int64_t availableFrameTicks = 0;
    /// kFile: absolute path; kImageSequence: of the first image.
    std::string file;
    ImageSequence images;
    std::int64_t ticksPerImage = 0;
    /// kGenerator.
    std::string generator;
    std::array<std::uint8_t, 3> color{};
    Title title;
    /// Source filter with its options, for kinds that aren't built in.
    std::string filterSource;
};

enum class ScalePolicy : std::int32_t { kNone = 0, kFit = 1, kFill = 2, kStretch = 3 };

/// Alpha as the file's maker declares it, against what the media says.
enum class AlphaChoice { kAsMedia, kIgnore, kStraight, kPremultiplied, kInvert };

/// `metadata.vantrel` of an item.
struct ItemOptions {
    bool holdFilters = false;
    /// Time of a freeze frame in the item's own time.
    std::optional<std::int64_t> hold;
    /// `time` and `mediaTime` in the item's own time.
    std::vector<RemapKey> remap;
    bool frameBlend = false;
    bool deinterlace = false;
    bool reverseFieldDominance = false;
    AlphaChoice alpha = AlphaChoice::kAsMedia;
    ScalePolicy scale = ScalePolicy::kFit;
    /// A disabled item stays in the tree as a layer that shows nothing.
    bool keepDisabled = false;
    /// A generator of one colour is described as something that only the host can draw.
    bool forceHost = false;
};

struct Multicam {
    std::int32_t selected = 0;
    bool grid = false;
    bool showProgram = false;
    bool recording = false;
    bool isNonMulticam = false;
};

enum class ItemKind { kClip, kGap, kTransition, kStack, kTrack };

struct Item {
    ItemKind kind = ItemKind::kClip;
    std::string path;
    std::string name;
    bool enabled = true;
    std::optional<TimeRange> sourceRange;
    /// Frame length of `sourceRange`, as snapped.
    std::int64_t sourceFrameTicks = 0;
    /// Enabled ones in file order, time warps left out.
    std::vector<Effect> effects;
    /// Product of the enabled warps.
    double speed = 1.0;
    bool freeze = false;
    ItemOptions options;

    /// kClip.
    MediaReference media;

    /// kTransition: offsets from the cut, and what it does.
    std::int64_t inOffset = 0;
    std::int64_t outOffset = 0;
    std::string matchName;
    std::vector<Parameter> parameters;
    /// "TransitionBorderWidth" and its kin with their texts.
    std::vector<std::pair<std::string, std::string>> properties;

    /// kStack, kTrack: only what makes pictures.
    std::vector<Item> children;
    SequenceSettings settings;
    std::optional<Multicam> multicam;
};

struct Document {
    std::string file;
    std::string name;
    /// Shifts timecodes shown or typed, nothing else.
    std::int64_t globalStart = 0;
    /// The top stack.
    Item tracks;
    SequenceSettings settings;
    /// Each names file, place and thing.
    std::vector<std::string> warnings;
};

}  // namespace Vantrel::Host
