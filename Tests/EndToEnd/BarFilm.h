// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include "Tests/EndToEnd/Film.h"
#include "Tests/Host/TimelineText.h"

/// Films of a bar that moves on with each field, so that a rendered picture tells the moment that it shows.
namespace Vantrel::Host::Test {

constexpr int kBarFrames = 20;

/// Where the bar's middle is at a time in fields of the film.
constexpr double PlaceOf(double field) { return 14.0 + 4.0 * field; }

/// The middle of what is bright in every other line, or in each; -1 where nothing is.
[[nodiscard]] double FindBar(const HostPicture& picture, int firstLine, int step = 2);

/// Fields drawn in the order `drawn`, in a film that claims the order `claimed`.
void WriteBarFilm(const std::string& path, std::uint32_t drawn, std::uint32_t claimed);

[[nodiscard]] std::string NameOfDevice(const testing::TestParamInfo<DeviceChoice>& info);

/// Renders single clips of such films at quality 2.
class BarFilms : public testing::TestWithParam<DeviceChoice> {
protected:
    static void SetUpTestSuite() { sDevices = std::make_unique<KeptDevices>(); }
    static void TearDownTestSuite() { sDevices.reset(); }

    /// @param deviceMemory  bytes; so few that nothing fits make the host render
    [[nodiscard]] Film Render(const Json& clip, std::uint32_t fieldType, std::uint64_t deviceMemory = 0);

    static constexpr std::uint64_t kNoMemory = 100000;
    Folder mFolder{"vantrel-bar"};

private:
    static std::unique_ptr<KeptDevices> sDevices;
};

}  // namespace Vantrel::Host::Test
