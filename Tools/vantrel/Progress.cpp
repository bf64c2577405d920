// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Progress.h"

#include <unistd.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace Vantrel::Tool {

namespace {

constexpr int kBarWidth = 30;
constexpr std::chrono::milliseconds kInterval(100);

}  // namespace

Progress::Form Progress::ChooseForm(bool json) {
    if (json) return Form::kJson;
    return isatty(STDERR_FILENO) != 0 ? Form::kBar : Form::kNone;
}

Progress::Progress(Form form, std::int64_t frames) : mForm(form), mFrames(std::max<std::int64_t>(1, frames)) {}

void Progress::Advance(std::int64_t done) {
    const Clock::time_point now = Clock::now();
    if (mForm == Form::kNone || (done < mFrames && now - mShown < kInterval)) return;
    mShown = now;
    const double seconds = std::max(1e-6, std::chrono::duration<double>(now - mStart).count());
    const double rate = static_cast<double>(done) / seconds;
    const double left = rate > 0 ? static_cast<double>(mFrames - done) / rate : 0;
    if (mForm == Form::kJson) {
        (void)std::fprintf(stderr, "{\"frame\": %lld, \"frames\": %lld, \"fps\": %.2f, \"secondsLeft\": %.1f}\n",
                           static_cast<long long>(done), static_cast<long long>(mFrames), rate, left);
        return;
    }
    const auto filled = static_cast<int>(kBarWidth * done / mFrames);
    const std::string bar = std::string(static_cast<std::size_t>(filled), '#') +
                            std::string(static_cast<std::size_t>(kBarWidth - filled), '.');
    const auto wholeLeft = static_cast<long>(std::lround(left));
    (void)std::fprintf(stderr, "\r[%s] %lld of %lld frames, %.1f fps, %ld:%02ld left \033[K", bar.c_str(),
                       static_cast<long long>(done), static_cast<long long>(mFrames), rate, wholeLeft / 60,
                       wholeLeft % 60);
    (void)std::fflush(stderr);
}

void Progress::End() {
    if (mForm == Form::kBar) (void)std::fprintf(stderr, "\r\033[K");
}

}  // namespace Vantrel::Tool
