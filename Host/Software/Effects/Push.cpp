// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Push.h"

#include "Host/Software/Effects/FrameRepairs.h"
#include "Vantrel/TransitionTable.h"

namespace Vantrel::Host::Software {

namespace {

/// The move along one axis: which picture lies at a place, and which of its own places that is.
class Shift {
public:
    Shift(const PushSettings& settings, float fraction, int length)
        : mBackwards(settings.direction == kPush_Left || settings.direction == kPush_Up),
          mLength(length),
          mShift(static_cast<int>(fraction * static_cast<float>(length) + 0.5F)),
          mHalf(static_cast<int>(settings.borderWidth * 0.5F)) {}

    /// -1 where the border lies.
    [[nodiscard]] int PlaceInSecond(int place) const {
        const int fromEdge = mBackwards ? mLength - 1 - place : place;
        const int own = mBackwards ? place + mShift - mLength : place - mShift + mLength;
        return fromEdge < mShift - mHalf && own < mLength ? own : -1;
    }
    [[nodiscard]] int PlaceInFirst(int place) const {
        const int fromEdge = mBackwards ? mLength - 1 - place : place;
        const int own = mBackwards ? place + mShift : place - mShift;
        return fromEdge >= mShift + mHalf && own < mLength ? own : -1;
    }

private:
    bool mBackwards;
    int mLength;
    int mShift;
    int mHalf;
};

}  // namespace

Picture Push(const Picture& outgoing, const Picture& incoming, const PushSettings& settings, float fraction) {
    const Picture& first = settings.reverse ? incoming : outgoing;
    const Picture& second = settings.reverse ? outgoing : incoming;
    Picture target(outgoing.width, outgoing.height);
    if (settings.borderWidth > 0) Fill(target, 0, 0, target.width, target.height, settings.borderColor);
    const bool vertical = settings.direction == kPush_Down || settings.direction == kPush_Up;
    const Shift shift(settings, settings.reverse ? 1.0F - fraction : fraction, vertical ? target.height : target.width);
    for (int y = 0; y < target.height; ++y) {
        for (int x = 0; x < target.width; ++x) {
            const int inFirst = shift.PlaceInFirst(vertical ? y : x);
            const int inSecond = shift.PlaceInSecond(vertical ? y : x);
            const int own = inSecond >= 0 ? inSecond : inFirst;
            const Picture& picture = inSecond >= 0 ? second : first;
            if (own >= 0) target.Set(x, y, vertical ? picture.Get(x, own) : picture.Get(own, y));
        }
    }
    return target;
}

}  // namespace Vantrel::Host::Software
