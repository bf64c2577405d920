// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What effects without a mask of their own hand their kernels: each parameter has a value of its own, which tells where
// it arrives.
#include <cstring>

#include "Kiln/Backend.h"
#include "Ostrand/Geometry.h"
#include "Src/Effects/SplineTable.h"
#include "Src/Filters/Effects/PointwiseFilterRecords.h"
#include "Src/Kernels/KernelTable.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

using Overrides = std::map<std::int32_t, double>;

struct CurveFamily {
    const EffectRow* effect;
    const char* moduleKey;
    std::vector<const char*> symbols;
    std::int32_t showMask;
};
const CurveFamily kCurveFamilies[] = {
    {&kLumaCurveEffect, R"(..\..\Src\Filters\Effects\LumaCurveNode)", {"inSpline"}, 40},
    {&kRGBCurvesEffect,
     R"(..\..\Src\Filters\Effects\RGBCurvesNode)",
     {"inSpline0", "inSpline1", "inSpline2", "inSpline3"},
     136}};
constexpr std::size_t kCommonCount = 7;

class PackingOnEachDevice : public EffectTest {
protected:
    [[nodiscard]] bool IsCuda() const { return GetParam().framework == Kiln::DeviceFramework::kCuda; }

    Recorded Run(const EffectRow& effect, const Overrides& overrides, int width = 34, int height = 9) {
        return Record(effect.matchName, MakeParams(effect, overrides), Plain(width, height, {0.5, 0.25, 0.125, 1}));
    }

    /// Data and pitch of the frame that was rendered over, three spare pixels included.
    static void ExpectFrame(const Recorded& run, std::size_t first) {
        EXPECT_EQ(run.kernels[0].Get<std::uint64_t>(first), Ostrand::Demand<Marl::IFrameData>(run.input)->GetData());
        EXPECT_EQ(run.kernels[0].Get<std::int32_t>(first + 1), run.input->GetBounds().Width() + 3);
    }
    /// Format flag and worked size.
    void ExpectSize(const Recorded& run, std::size_t first, int width, int height) const {
        EXPECT_EQ(run.kernels[0].Get<std::int32_t>(first), IsHalf() ? 0 : 1);
        EXPECT_EQ(run.kernels[0].Get<std::int32_t>(first + 1), width);
        EXPECT_EQ(run.kernels[0].Get<std::int32_t>(first + 2), height);
    }
    static void ExpectFloats(const Recorded& run, std::size_t first, const std::vector<float>& values) {
        ASSERT_EQ(run.kernels[0].Count(), first + values.size());
        for (std::size_t i = 0; i < values.size(); ++i) {
            EXPECT_EQ(run.kernels[0].Get<float>(first + i), values[i]) << "argument " << first + i + 1;
        }
    }

    [[nodiscard]] std::uint64_t FindSymbol(const char* moduleKey, const std::string& symbol) {
        SymbolTable table;
        return GetSymbol(table, GetDevice(), moduleKey, symbol.c_str());
    }
    template <class T>
    [[nodiscard]] T Read(std::uint64_t address) {
        T record{};
        EXPECT_EQ(GetDevice()->GetBackend().CopyRowsToHost(&record, sizeof record, address, {0, sizeof record},
                                                           sizeof record, 1),
                  Ostrand::kStatus_OK);
        return record;
    }
    /// The record behind an argument: a module's global on CUDA, where the argument is 0, else the buffer.
    template <class T>
    [[nodiscard]] T ReadRecord(const Recorded& run, std::size_t argument, const char* moduleKey,
                               const std::string& symbol) {
        const auto handle = run.kernels[0].Get<std::uint64_t>(argument);
        EXPECT_EQ(handle == 0, IsCuda());
        return Read<T>(IsCuda() ? FindSymbol(moduleKey, symbol) : handle);
    }
};

TEST_P(PackingOnEachDevice, LevelsAndLimitsArriveByIndex) {
    Overrides levels;
    std::vector<float> expected;
    for (std::int32_t i = 0; i < 20; ++i) {
        const std::int32_t value = i == 14 ? 0 : 31 + 7 * i;  // a gamma of 0 has an infinite power
        levels[i] = value;
        expected.push_back(i % 5 == 4 ? 100.0F / static_cast<float>(value) : static_cast<float>(value) / 255.0F);
    }
    const Recorded run = Run(kLevelsEffect, levels);
    ASSERT_EQ(run.kernels.size(), 1U);
    ExpectFrame(run, 0);
    ExpectSize(run, 2, 34, 9);
    ExpectFloats(run, 5, expected);

    Overrides limits = {{3, 2}, {10, 3}};
    expected.clear();
    for (const std::int32_t i : {4, 5, 6, 7, 8, 9, 13, 14, 15, 16}) {
        limits[i] = 1.3 + 7 * i;
        expected.push_back(static_cast<float>(i < 13 ? limits[i] : limits[i] / 255.0));
    }
    const struct {
        Overrides split;
        int width, height;                    ///< that are worked on
    } kRows[] = {{{{1, 1}, {2, 25}}, 34, 9},  // the split is off
                 {{{0, 1}, {1, 1}, {2, 50}}, 17, 9},  {{{0, 1}, {1, 7}, {2, 50}}, 34, 4},
                 {{{0, 1}, {1, 1}, {2, 100}}, 34, 9}, {{{0, 1}, {1, 1}, {2, 0}}, 0, 0},
                 {{{0, 1}, {1, 0}, {2, 5}}, 0, 0}};
    for (const auto& row : kRows) {
        Overrides all = limits;
        all.insert(row.split.begin(), row.split.end());
        const Recorded limited = Run(kVideoLimiterEffect, all);
        EXPECT_EQ(limited.status, Ostrand::kStatus_OK);
        ASSERT_EQ(limited.kernels.size(), row.width > 0 ? 1U : 0U);
        if (row.width == 0) continue;
        ExpectFrame(limited, 0);
        ExpectSize(limited, 2, row.width, row.height);
        EXPECT_EQ(limited.kernels[0].Get<std::int32_t>(5), 2);
        EXPECT_EQ(limited.kernels[0].Get<std::int32_t>(6), 3);
        ExpectFloats(limited, 7, expected);
    }
}

TEST_P(PackingOnEachDevice, CurvesArriveAsTablesOfTheirPoints) {
    using Points = std::map<std::int32_t, double>;  // by place in the curve's run of parameters
    Points distinct, none;
    for (std::int32_t i = 0; i < 32; ++i) distinct[i] = none[i] = 0.0;
    Points gaps = none, wrapped = none;
    gaps[0] = 12.0, gaps[11] = 200.0;  // points 0 and 5
    wrapped[0] = 127.9, wrapped[1] = 255.0, wrapped[2] = 256.0, wrapped[3] = 257.5;
    for (const CurveFamily& family : kCurveFamilies) {
        for (const Points* points : {&distinct, &none, &gaps, &wrapped}) {
            Overrides overrides;
            for (std::int32_t i = 0; i < 32 * static_cast<std::int32_t>(family.symbols.size()); ++i) {
                overrides[5 + i] = points == &distinct ? 5 + i + 0.75 : points->at(i % 32);
            }
            const Recorded run = Run(*family.effect, overrides);
            ASSERT_EQ(run.kernels.size(), 1U);
            ExpectFrame(run, 0);
            EXPECT_EQ(run.kernels[0].Get<std::uint64_t>(2), 0U) << "no selection, no mask";
            EXPECT_EQ(run.kernels[0].Get<std::int32_t>(3), 0);
            ExpectSize(run, 4, 34, 9);
            ASSERT_EQ(run.kernels[0].Count(), kCommonCount + family.symbols.size());
            for (std::size_t curve = 0; curve < family.symbols.size(); ++curve) {
                const auto table =
                    ReadRecord<SplineTable>(run, kCommonCount + curve, family.moduleKey, family.symbols[curve]);
                SplineTable expected{};
                for (std::int32_t i = 0; i < 16; ++i) {
                    const auto level = [&](std::int32_t place) {
                        const double value = overrides[5 + 32 * static_cast<std::int32_t>(curve) + place];
                        return static_cast<float>(static_cast<int>(value) % 256) / 255.0F;
                    };
                    expected.x[i] = level(2 * i);
                    expected.y[i] = level(2 * i + 1);
                }
                expected.count = points == &distinct ? 16 : points == &none ? 0 : points == &gaps ? 6 : 2;
                Ostrand::Geometry::SolveNaturalCubicSpline2D(expected.x, expected.y, expected.count, expected.solution);
                EXPECT_EQ(table.count, expected.count);
                EXPECT_EQ(std::memcmp(table.x, expected.x, 2 * sizeof table.x), 0) << family.symbols[curve];
                EXPECT_EQ(std::memcmp(table.solution, expected.solution, expected.count * sizeof(float)), 0);
            }
        }
    }
}

TEST_P(PackingOnEachDevice, CurvesOfEachViewSendWhatItNeeds) {
    const struct {
        Overrides settings;
        bool showsMask;
        Status status;
        bool runs, takesTables;
    } kRows[] = {{{{0, 0}}, false, Ostrand::kStatus_OK, true, true},
                 {{{0, 1}}, false, Ostrand::kStatus_OK, true, true},
                 {{{0, 3}}, false, Ostrand::kStatus_OK, true, false},
                 {{{0, 1}}, true, Ostrand::kStatus_OK, true, false},
                 {{{0, 2}}, false, Ostrand::kStatus_Failure, false, false},
                 {{{0, -1}}, false, Ostrand::kStatus_Failure, false, false},
                 {{{1, 1}, {2, 1}, {3, 0}}, false, Ostrand::kStatus_OK, false, false}};
    for (const CurveFamily& family : kCurveFamilies) {
        for (const auto& row : kRows) {
            Overrides settings = row.settings;
            if (row.showsMask) settings[family.showMask] = 1;
            const Recorded run = Run(*family.effect, settings);
            EXPECT_EQ(run.status, row.status) << testing::PrintToString(row.settings) << family.effect->matchName;
            ASSERT_EQ(run.kernels.size(), row.runs ? 1U : 0U);
            if (!row.runs) continue;
            EXPECT_EQ(run.kernels[0].Count(), kCommonCount + (row.takesTables ? family.symbols.size() : 0));
        }
    }
}

TEST_P(PackingOnEachDevice, AFiltersRecordAndFramesArrive) {
    const struct {
        const EffectRow* effect;
        bool inPlace;
    } kRows[] = {{&kColorBalanceEffect, true}, {&kVerticalFlipEffect, false}};
    for (const auto& row : kRows) {
        const Recorded run = Run(*row.effect, row.inPlace ? Overrides{{0, 30}, {1, 60}, {2, 90}} : Overrides{});
        ASSERT_EQ(run.kernels.size(), 1U);
        ASSERT_EQ(run.kernels[0].Count(), 8U);
        ExpectFrame(run, 0);
        if (row.inPlace) ExpectFrame(run, 2);
        if (!row.inPlace) {
            EXPECT_NE(run.kernels[0].Get<std::uint64_t>(2), run.kernels[0].Get<std::uint64_t>(0));
        }
        ExpectSize(run, 4, 34, 9);
        PointwiseFilterRecord expected{};
        expected.type = row.inPlace ? 3 : 16;
        if (row.inPlace) expected.r1 = 90 / 255.0F, expected.r2 = 60 / 255.0F, expected.r3 = 30 / 255.0F;
        const auto record = ReadRecord<PointwiseFilterRecord>(
            run, 7, R"(..\..\Src\Filters\Effects\PointwiseFilterHostNode)", "inFilter0");
        EXPECT_EQ(std::memcmp(&record, &expected, sizeof expected), 0) << row.effect->matchName;
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, PackingOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
