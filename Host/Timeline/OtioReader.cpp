// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Timeline/OtioReader.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "Host/Timeline/FieldReaders.h"

namespace Vantrel::Host {
namespace {

/// Deeper files are malformed or hostile: every level costs stack.
constexpr int kDeepestNesting = 64;

void ExpectVersion(const JsonCursor& at, const JsonCursor::Schema& schema, int newest) {
    if (schema.version >= 1 && schema.version <= newest) return;
    at.Fail("version " + std::to_string(schema.version) + " of " + schema.name + " isn't known; the newest known is " +
            std::to_string(newest));
}

class ItemReader {
public:
    explicit ItemReader(std::string directory) : mDirectory(std::move(directory)) {}

    [[nodiscard]] Item Read(const JsonCursor& at, int depth = 0) const {
        if (depth > kDeepestNesting) at.Fail("nested deeper than " + std::to_string(kDeepestNesting) + " levels");
        const JsonCursor::Schema schema = at.GetSchema();
        Item item;
        item.path = at.Path();
        item.kind = KindOf(at, schema);
        if (const auto name = at.Find("name")) item.name = name->Text();
        if (const auto enabled = at.Find("enabled")) item.enabled = enabled->Bool();
        if (item.kind == ItemKind::kTransition) {
            ReadTransition(at, item);
            return item;
        }
        ReadRangeOf(at, item);
        if (item.kind == ItemKind::kGap) return item;
        ReadEffects(at, item);
        ReadItemOptions(at, item);
        if (item.kind == ItemKind::kClip) {
            ReadMedia(at, schema, item);
        } else {
            ReadChildren(at, item, depth);
        }
        return item;
    }

    [[nodiscard]] static bool IsVideo(const JsonCursor& at) {
        const JsonCursor::Schema schema = at.GetSchema();
        if (schema.name != "Track" && schema.name != "Sequence") return true;
        const auto kind = at.Find("kind");
        return !kind || kind->Text() == "Video";
    }

private:
    [[nodiscard]] static ItemKind KindOf(const JsonCursor& at, const JsonCursor::Schema& schema) {
        struct Known {
            const char* name;
            ItemKind kind;
            int newest;
        };
        constexpr Known kKnown[] = {{"Clip", ItemKind::kClip, 2},     {"Gap", ItemKind::kGap, 1},
                                    {"Filler", ItemKind::kGap, 1},    {"Transition", ItemKind::kTransition, 1},
                                    {"Stack", ItemKind::kStack, 1},   {"Track", ItemKind::kTrack, 1},
                                    {"Sequence", ItemKind::kTrack, 1}};
        for (const Known& known : kKnown) {
            if (schema.name != known.name) continue;
            ExpectVersion(at, schema, known.newest);
            return known.kind;
        }
        at.Fail("unknown schema \"" + schema.name + "\"");
    }

    static void ReadRangeOf(const JsonCursor& at, Item& item) {
        const auto range = at.Find("source_range");
        if (!range) {
            if (item.kind == ItemKind::kGap) at.Fail("a gap needs a source_range");
            return;
        }
        const ReadRange read = ReadTimeRange(*range);
        if (read.range.duration == 0 && item.kind != ItemKind::kGap) {
            range->Get("duration").Fail("\"" + item.name + "\" has no length; the duration must be above 0");
        }
        item.sourceRange = read.range;
        item.sourceFrameTicks = read.frameTicks;
    }

    void ReadMedia(const JsonCursor& at, const JsonCursor::Schema& schema, Item& item) const {
        item.media.path = at.Path();
        if (schema.version == 1) {
            if (const auto reference = at.Find("media_reference")) {
                item.media = ReadMediaReference(*reference, mDirectory);
            }
        } else if (const auto references = at.Find("media_references")) {
            references->ExpectObject();
            const auto key = at.Find("active_media_reference_key");
            const std::string active = key ? key->Text() : "DEFAULT_MEDIA";
            if (const auto reference = references->Find(active)) {
                item.media = ReadMediaReference(*reference, mDirectory);
            } else if (references->Size() > 0) {
                references->Fail("no media reference is called \"" + active + "\"");
            }
        }
        if (!item.sourceRange && !item.media.availableRange) {
            at.Fail("\"" + item.name + "\" has neither a source_range nor an available_range");
        }
        if (!item.sourceRange && item.media.availableRange->duration == 0) {
            at.Fail("\"" + item.name + "\" has no length; its available_range is empty");
        }
    }

    void ReadChildren(const JsonCursor& at, Item& item, int depth) const {
        const auto children = at.Find("children");
        if (!children) return;
        children->ExpectArray();
        for (std::size_t i = 0; i < children->Size(); ++i) {
            const JsonCursor child = children->Element(i);
            if (!IsVideo(child)) continue;
            item.children.push_back(Read(child, depth + 1));
            if (item.kind == ItemKind::kStack && item.children.back().kind == ItemKind::kTransition) {
                child.Warn("a transition that doesn't stand in a track is left out");
                item.children.pop_back();
            }
        }
    }

    std::string mDirectory;
};

Item WrapInStack(Item item) {
    Item stack;
    stack.kind = ItemKind::kStack;
    stack.name = item.name;
    stack.settings = item.settings;
    stack.children.push_back(std::move(item));
    return stack;
}

void ReadTimelineObject(const JsonCursor& at, const ItemReader& items, Document& document) {
    if (const auto name = at.Find("name")) document.name = name->Text();
    if (const auto start = at.Find("global_start_time")) document.globalStart = ReadTime(*start).ticks;
    if (const auto own = FindOwnMetadata(at)) {
        own->WarnOfOthers({"sequence"});
        if (const auto settings = own->Find("sequence")) document.settings = ReadSequenceSettings(*settings);
    }
    const JsonCursor tracks = at.Get("tracks");
    document.tracks = items.Read(tracks);
    if (document.tracks.kind != ItemKind::kStack) tracks.Fail("the tracks of a timeline must be a Stack");
}

/// The first timeline of a collection, looked for depth first.
std::optional<JsonCursor> FindTimeline(const JsonCursor& at, int depth = 0) {
    const JsonCursor::Schema schema = at.GetSchema();
    if (schema.name == "Timeline") return at;
    if (schema.name != "SerializableCollection" || depth > kDeepestNesting) return std::nullopt;
    const JsonCursor children = at.Get("children");
    children.ExpectArray();
    for (std::size_t i = 0; i < children.Size(); ++i) {
        if (auto found = FindTimeline(children.Element(i), depth + 1)) return found;
    }
    return std::nullopt;
}

void ReadTopLevel(const JsonCursor& top, const ItemReader& items, Document& document) {
    const JsonCursor::Schema schema = top.GetSchema();
    if (schema.name == "Timeline" || schema.name == "SerializableCollection") {
        const auto timeline = FindTimeline(top);
        if (!timeline) top.Fail("the collection holds no Timeline");
        ExpectVersion(*timeline, timeline->GetSchema(), 1);
        ReadTimelineObject(*timeline, items, document);
        return;
    }
    if (!ItemReader::IsVideo(top)) top.Fail("the track isn't of kind \"Video\"");
    Item item = items.Read(top);
    document.name = item.name;
    if (item.kind == ItemKind::kTransition || item.kind == ItemKind::kGap) {
        top.Fail("a timeline, composition or clip is needed, found a " + schema.name);
    }
    document.tracks = item.kind == ItemKind::kStack ? std::move(item) : WrapInStack(std::move(item));
}

}  // namespace

Document ReadTimelineText(const std::string& text, const std::string& file) {
    const nlohmann::json json = ParseTimelineText(text, file);
    ReadContext context{file, {}};
    Document document;
    document.file = file;
    const std::filesystem::path directory = std::filesystem::absolute(file).parent_path();
    ReadTopLevel(JsonCursor(json, "", context), ItemReader(directory.string()), document);
    document.warnings = std::move(context.warnings);
    return document;
}

Document ReadTimelineFile(const std::string& file) {
    std::ifstream stream(file, std::ios::binary);
    std::ostringstream text;
    if (stream) text << stream.rdbuf();
    if (!stream) throw TimelineError(file + ": the file can't be read");
    return ReadTimelineText(text.str(), file);
}

}  // namespace Vantrel::Host
