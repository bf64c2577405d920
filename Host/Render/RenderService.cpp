// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Render/RenderService.h"

#include <algorithm>
#include <cstring>
#include <shared_mutex>

#include "Brae/Conversions.h"
#include "Host/Snapshot/Fingerprint.h"
#include "Ostrand/MixHash.h"

namespace Vantrel::Host {

namespace {

constexpr std::size_t kDecodedBytes = std::size_t{512} << 20;
constexpr std::size_t kFinishedBytes = std::size_t{256} << 20;

/// The suites' functions find the service here; its end waits for calls that are under way.
std::shared_mutex gServiceMutex;
RenderService* gService = nullptr;

void WriteHash(const Guid& hash, char* text) {
    const Brae::PluginID id = Brae::GuidToPluginID(hash);
    std::memcpy(text, id.text, sizeof id.text);
}

std::array<char, 37> TextOf(const Guid& hash) {
    std::array<char, 37> text{};
    WriteHash(hash, text.data());
    return text;
}

/// The engine looks a subtree's picture up under a fingerprint of its own, which it mixes from the host's.
std::array<char, 37> SubtreeText(const Guid& hash) {
    const std::array<char, 37> text = TextOf(hash);
    return TextOf(Ostrand::NodeHasher().Text("SubtreeRenderNode").Bytes(text.data(), text.size()).Finish());
}

/// A copy of a description that outlives the call that brought it.
class KeptDescription {
public:
    explicit KeptDescription(const VantrelRenderDescription& description)
        : mDescription(description),
          mFormats(description.pixelFormats, description.pixelFormats + std::max(0, description.pixelFormatCount)) {
        mDescription.pixelFormats = mFormats.data();
    }
    KeptDescription(const KeptDescription& other) : mDescription(other.mDescription), mFormats(other.mFormats) {
        mDescription.pixelFormats = mFormats.data();
    }
    KeptDescription& operator=(const KeptDescription&) = delete;

    [[nodiscard]] const VantrelRenderDescription& Get() const { return mDescription; }

private:
    VantrelRenderDescription mDescription;
    std::vector<std::uint32_t> mFormats;
};

/// 8-bit BGRA serves every request; deep media come as floats.
Vellum::PixelFormat ClipFormat(const MediaInfo& info) {
    return info.bitDepth > 8 ? Vellum::kPixelFormat_BGRA_4444_32f : Vellum::kPixelFormat_BGRA_4444_8u;
}

constexpr VantrelHostStatus kRefused = -1;

}  // namespace

/// The suites' plain functions.
struct RenderService::Entries {
    template <class Call>
    static VantrelHostStatus With(Call&& call) {
        const std::shared_lock<std::shared_mutex> hold(gServiceMutex);
        return gService ? call(*gService) : kRefused;
    }

    static VantrelHostStatus RenderNode(std::uint32_t, std::uint32_t nodeID, std::int64_t time, std::int64_t nodeTime,
                                        std::int64_t frameTicks, std::int32_t width, std::int32_t height,
                                        std::int32_t aspectNumerator, std::int32_t aspectDenominator,
                                        const VantrelRenderDescription* description, VantrelRenderCallback callback,
                                        void* context, std::uint32_t* requestID) {
        return With([&](RenderService& service) {
            const NodePtr node = service.mServices.FindNode(nodeID);
            if (!node || !description || !callback) return kRefused;
            const SequenceSize sequence{width, height, {aspectNumerator, aspectDenominator}, frameTicks};
            auto render = [&service, node, nodeTime, sequence, kept = KeptDescription(*description)](auto& text) {
                text = SubtreeText(
                    NodeFingerprint(*node, nodeTime, kept.Get(), Vellum::HalfFrameTicks(sequence.frameTicks)));
                return service.mRenderer.RenderNode(*node, nodeTime, sequence, kept.Get());
            };
            *requestID = service.Submit(time, std::move(render), callback, context, service.mRenderedSubtrees);
            return 0;
        });
    }

    static VantrelHostStatus GetNodeFrameHash(std::uint32_t, std::uint32_t nodeID, std::int64_t, std::int64_t nodeTime,
                                              std::int64_t frameTicks, std::int32_t, std::int32_t, std::int32_t,
                                              std::int32_t, const VantrelRenderDescription* description,
                                              char* hashText) {
        return With([&](RenderService& service) {
            const NodePtr node = service.mServices.FindNode(nodeID);
            if (!node || !description) return kRefused;
            WriteHash(NodeFingerprint(*node, nodeTime, *description, Vellum::HalfFrameTicks(frameTicks)), hashText);
            return 0;
        });
    }

    static VantrelHostStatus RenderOperators(std::uint32_t, std::uint32_t clipNodeID, std::int32_t,
                                             std::int32_t endOperator, std::int64_t time, std::int64_t rawTime,
                                             std::int64_t frameTicks, std::int32_t width, std::int32_t height,
                                             std::int32_t aspectNumerator, std::int32_t aspectDenominator,
                                             std::uint32_t, const VantrelRenderDescription* description,
                                             VantrelRenderCallback callback, void* context, std::uint32_t* requestID) {
        return With([&](RenderService& service) {
            const NodePtr clip = service.mServices.FindNode(clipNodeID);
            if (!clip || !description || !callback) return kRefused;
            const SequenceSize sequence{width, height, {aspectNumerator, aspectDenominator}, frameTicks};
            auto render = [&service, clip, endOperator, rawTime, sequence,
                           kept = KeptDescription(*description)](auto& text) {
                text = SubtreeText(OperatorsFingerprint(*clip, endOperator, rawTime, kept.Get(),
                                                        Vellum::HalfFrameTicks(sequence.frameTicks)));
                return service.mRenderer.RenderOperators(*clip, endOperator, rawTime, sequence, kept.Get());
            };
            *requestID = service.Submit(time, std::move(render), callback, context, service.mRenderedSubtrees);
            return 0;
        });
    }

    static VantrelHostStatus GetOperatorsFrameHash(std::uint32_t, std::uint32_t clipNodeID, std::int32_t,
                                                   std::int32_t endOperator, std::int64_t, std::int64_t rawTime,
                                                   std::int64_t frameTicks, std::int32_t, std::int32_t, std::int32_t,
                                                   std::int32_t, std::uint32_t,
                                                   const VantrelRenderDescription* description, char* hashText) {
        return With([&](RenderService& service) {
            const NodePtr clip = service.mServices.FindNode(clipNodeID);
            if (!clip || !description) return kRefused;
            WriteHash(
                OperatorsFingerprint(*clip, endOperator, rawTime, *description, Vellum::HalfFrameTicks(frameTicks)),
                hashText);
            return 0;
        });
    }

    static VantrelHostStatus GetClipFormat(std::uint32_t clipID, std::int64_t, const VantrelClipRecord*,
                                           VantrelClipRecord* delivered) {
        return With([&](RenderService& service) {
            const MediaClipPtr clip = service.mServices.FindClip(clipID);
            if (!clip || !delivered) return kRefused;
            const MediaInfo& info = clip->info;
            *delivered = {ClipFormat(info).GetCode(),
                          info.width,
                          info.height,
                          info.pixelAspectNumerator,
                          info.pixelAspectDenominator,
                          static_cast<std::uint32_t>(info.fieldType),
                          5};
            return 0;
        });
    }

    static VantrelHostStatus RenderClip(std::uint32_t clipID, const VantrelClipRecord* record, std::int64_t time,
                                        VantrelRenderCallback callback, void* context, std::uint32_t* requestID) {
        return With([&](RenderService& service) {
            const MediaClipPtr clip = service.mServices.FindClip(clipID);
            if (!clip || !record || !callback) return kRefused;
            auto render = [&service, clip, time, kept = *record](auto& text) {
                text = TextOf(ClipFingerprint(*clip, time, kept));
                return service.RenderClipFrame(*clip, MediaFrameAt(clip->info, time), ClipFormat(clip->info));
            };
            *requestID = service.Submit(time, std::move(render), callback, context, service.mRenderedClips);
            return 0;
        });
    }

    static VantrelHostStatus GetClipFrameHash(std::uint32_t clipID, const VantrelClipRecord* record, std::int64_t time,
                                              char* hashText) {
        return With([&](RenderService& service) {
            const MediaClipPtr clip = service.mServices.FindClip(clipID);
            if (!clip || !record) return kRefused;
            WriteHash(ClipFingerprint(*clip, time, *record), hashText);
            return 0;
        });
    }

    static VantrelHostStatus CancelRequest(std::uint32_t requestID) {
        return With([&](RenderService& service) {
            service.mPool.Cancel(requestID);
            return 0;
        });
    }

    static VantrelHostStatus IsClipReady(std::uint32_t clipID, std::uint8_t* ready) {
        return With([&](RenderService& service) {
            const MediaClipPtr clip = service.mServices.FindClip(clipID);
            *ready = clip && clip->id != 0 ? 1 : 0;
            return 0;
        });
    }

    static VantrelHostStatus FindFinished(const char* hashText, Glaze** frame) {
        return With([&](RenderService& service) {
            std::array<char, 37> text{};
            std::strncpy(text.data(), hashText, text.size() - 1);
            const HostPictureRef picture = service.mFinished.Find(text);
            *frame = picture ? MakeGlaze(picture) : nullptr;
            return picture ? 0 : kRefused;
        });
    }

    static VantrelHostStatus Dispose(Glaze* frame) {
        DisposeGlaze(frame);
        return 0;
    }
};

RenderService::RenderService(HostServices& services, ISoftwareRenderer& renderer, unsigned threads)
    : mServices(services), mRenderer(renderer), mDecoded(kDecodedBytes), mFinished(kFinishedBytes), mPool(threads) {
    static const CorvaneVideoSegmentRenderSuite kRenderSuite = {Entries::RenderNode,
                                                                Entries::GetNodeFrameHash,
                                                                Entries::RenderOperators,
                                                                Entries::GetOperatorsFrameHash,
                                                                nullptr,
                                                                nullptr,
                                                                Entries::GetClipFormat,
                                                                Entries::RenderClip,
                                                                Entries::GetClipFrameHash,
                                                                Entries::CancelRequest,
                                                                Entries::IsClipReady};
    static const LarkspurGlazeSuite kGlazeSuite = {Entries::Dispose};
    static const LarkspurGlazeCacheSuite kGlazeCacheSuite = {{}, Entries::FindFinished};
    services.OfferSuite(kVideoSegmentRenderSuiteName, kVideoSegmentRenderSuiteVersion, &kRenderSuite);
    services.OfferSuite(kGlazeSuiteName, kGlazeSuiteVersion, &kGlazeSuite);
    services.OfferSuite(kGlazeCacheSuiteName, kGlazeCacheSuiteVersion, &kGlazeCacheSuite);
    const std::unique_lock<std::shared_mutex> hold(gServiceMutex);
    gService = this;
}

RenderService::~RenderService() {
    const std::unique_lock<std::shared_mutex> hold(gServiceMutex);
    if (gService == this) gService = nullptr;
}

std::uint32_t RenderService::Submit(std::int64_t time, Render render, VantrelRenderCallback callback, void* context,
                                    std::atomic<std::int64_t>& counter) {
    return mPool.Submit(time, [this, render = std::move(render), callback, context, &counter](bool cancelled) {
        HostPictureRef picture;
        if (!cancelled) {
            try {
                std::array<char, 37> text{};
                picture = render(text);
                if (picture) mFinished.Store(text, picture);
                ++counter;
            } catch (const std::exception& error) {
                NoteFailure(error.what());
            }
        }
        callback(picture ? MakeGlaze(picture) : nullptr, context, picture ? 0 : 1);
    });
}

HostPictureRef RenderService::RenderClipFrame(const MediaClip& clip, std::int64_t frame, Vellum::PixelFormat format) {
    const ClipFrameKey key(clip.id, frame, format.GetValue());
    if (HostPictureRef known = mDecoded.Find(key)) return known;
    HostPictureRef picture = mRenderer.RenderClip(clip, frame, format);
    if (picture) mDecoded.Store(key, picture);
    return picture;
}

void RenderService::NoteFailure(const std::string& text) {
    const std::lock_guard<std::mutex> hold(mFailureMutex);
    if (mKnownFailures.insert(text).second) mFailures.push_back(text);
}

std::vector<std::string> RenderService::GetFailures() const {
    const std::lock_guard<std::mutex> hold(mFailureMutex);
    return mFailures;
}

}  // namespace Vantrel::Host
