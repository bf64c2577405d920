// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Stabilizer/Analysis.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace Stabilizer {
namespace {

/// Of a pixel; rounding that isn't to count as motion.
constexpr double kNothing = 1e-6;

/// Where a place of the scene, told from the middle, is seen.
Place Apply(const Motion& motion, const Place& p) {
    const double c = motion.scale * std::cos(motion.angle), s = motion.scale * std::sin(motion.angle);
    return {c * p.x - s * p.y + motion.x, s * p.x + c * p.y + motion.y};
}

/// And back.
Place Undo(const Motion& motion, const Place& p) {
    const double c = std::cos(motion.angle) / motion.scale, s = std::sin(motion.angle) / motion.scale;
    const double x = p.x - motion.x, y = p.y - motion.y;
    return {c * x + s * y, c * y - s * x};
}

/// Each motion as the mean of its neighbours under a Gaussian, the first and the last going on beyond the ends. A
/// picture that is to stand still stands as the middle of all.
std::vector<Motion> Smooth(const std::vector<Motion>& motions, double sigma) {
    const auto count = static_cast<std::ptrdiff_t>(motions.size());
    std::vector<Motion> smooth(motions.size());
    const auto reach = static_cast<std::ptrdiff_t>(std::ceil(3.0 * std::min(sigma, static_cast<double>(count))));
    for (std::ptrdiff_t i = 0; i < count; ++i) {
        Motion sum{0.0, 0.0, 0.0, 0.0};
        double total = 0.0, logScale = 0.0;
        const std::ptrdiff_t from = sigma > 0.0 ? i - reach : 0, to = sigma > 0.0 ? i + reach : count - 1;
        for (std::ptrdiff_t k = from; k <= to; ++k) {
            const Motion& motion = motions[static_cast<std::size_t>(std::clamp<std::ptrdiff_t>(k, 0, count - 1))];
            const double distance = sigma > 0.0 ? static_cast<double>(k - i) / sigma : 0.0;
            const double weight = std::exp(-0.5 * distance * distance);
            sum.x += weight * motion.x;
            sum.y += weight * motion.y;
            sum.angle += weight * motion.angle;
            logScale += weight * std::log(motion.scale);
            total += weight;
        }
        smooth[static_cast<std::size_t>(i)] = {sum.x / total, sum.y / total, sum.angle / total,
                                               std::exp(logScale / total)};
        if (sigma <= 0.0) {
            std::fill(smooth.begin(), smooth.end(), smooth.front());
            break;
        }
    }
    return smooth;
}

}  // namespace

Analysis::Analysis(MotionTrack track) : mTrack(std::move(track)), mSteady(Smooth(mTrack.frames, mTrack.smooth)) {
    EncloseFrames();
    FitWindow();
    const auto points = [this](double size) { return 1 + static_cast<std::int32_t>(std::ceil(size / mTrack.cell)); };
    mMeshWidth = points(mSource.right - mSource.left);
    mMeshHeight = points(mSource.bottom - mSource.top);
}

std::array<Place, 4> Analysis::Corners() const {
    const double x = mTrack.width / 2.0, y = mTrack.height / 2.0;
    return {{{-x, -y}, {x, -y}, {x, y}, {-x, y}}};
}

void Analysis::EncloseFrames() {
    const double middleX = mTrack.width / 2.0, middleY = mTrack.height / 2.0;
    double reachX = 0.0, reachY = 0.0;
    for (std::size_t i = 0; i < mSteady.size(); ++i) {
        for (const Place& corner : Corners()) {
            const Place seen = Apply(mSteady[i], Undo(mTrack.frames[i], corner));
            reachX = std::max(reachX, std::ceil(std::abs(seen.x) - middleX - kNothing));
            reachY = std::max(reachY, std::ceil(std::abs(seen.y) - middleY - kNothing));
        }
    }
    mSource = {-reachX, -reachY, mTrack.width + reachX, mTrack.height + reachY};
}

void Analysis::FitWindow() {
    const double middleX = mTrack.width / 2.0, middleY = mTrack.height / 2.0;
    const auto isCovered = [&](double share) {
        for (std::size_t i = 0; i < mSteady.size(); ++i) {
            for (const Place& corner : Corners()) {
                const Place p = Apply(mTrack.frames[i], Undo(mSteady[i], {corner.x * share, corner.y * share}));
                if (std::abs(p.x) > middleX + kNothing || std::abs(p.y) > middleY + kNothing) return false;
            }
        }
        return true;
    };
    constexpr int kHalvings = 30;
    double low = 0.0, high = 1.0;
    if (isCovered(high)) low = high;
    for (int i = 0; i < kHalvings && low < high; ++i) {
        const double middle = 0.5 * (low + high);
        (isCovered(middle) ? low : high) = middle;
    }
    const double width = std::max(1.0, std::floor(mTrack.width * low)),
                 height = std::max(1.0, std::floor(mTrack.height * low));
    mWindow = {middleX - width / 2.0, middleY - height / 2.0, middleX + width / 2.0, middleY + height / 2.0};
}

void Analysis::MakeMesh(std::size_t frame, std::vector<double>& mesh) const {
    const double middleX = mTrack.width / 2.0, middleY = mTrack.height / 2.0;
    mesh.clear();
    for (std::int32_t row = 0; row < mMeshHeight; ++row) {
        const double y = mSource.top + (mSource.bottom - mSource.top) * row / (mMeshHeight - 1) - middleY;
        for (std::int32_t column = 0; column < mMeshWidth; ++column) {
            const double x = mSource.left + (mSource.right - mSource.left) * column / (mMeshWidth - 1) - middleX;
            const Place p = Apply(mTrack.frames[frame], Undo(mSteady[frame], {x, y}));
            mesh.push_back(p.x + middleX);
            mesh.push_back(p.y + middleY);
        }
    }
}

}  // namespace Stabilizer
