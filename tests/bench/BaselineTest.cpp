// SPDX-License-Identifier: BSD-2-Clause
#include "bench/Baseline.h"

#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>
#include <stdexcept>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/TemporaryDirectory.h"

namespace {

using testing::AllOf;
using testing::HasSubstr;

class BaselineTest : public testing::Test {
  protected:
    Baseline const m_saved{
        "bench_library",
        "Brand 7, 2 processors",
        "2026-11-22T20:00:00Z",
        {{"copy and drop/ours", {24.125, 24, 25}}, {"walk/ours", {7e5, 6e5, 8e5}}}};

    Baseline load() const { return loadBaseline(m_file, m_saved.program, m_saved.machine); }

    /// The message with which the file is refused; empty if it is not.
    std::string refusal(std::string const& program, std::string const& machine) const {
        try {
            loadBaseline(m_file, program, machine);
        } catch (std::runtime_error const& error) {
            return error.what();
        }
        return {};
    }
    std::string refusal() const { return refusal(m_saved.program, m_saved.machine); }

    std::string content() const {
        std::ifstream file(m_file);
        return {std::istreambuf_iterator<char>(file), {}};
    }
    void write(std::string const& content) const { std::ofstream(m_file) << content; }

    support::TemporaryDirectory m_folder;
    std::string m_file = m_folder.file("baseline");
};

TEST_F(BaselineTest, WhatWasSavedIsLoaded) {
    saveBaseline(m_saved, m_file);
    Baseline const loaded = load();
    EXPECT_EQ(loaded.date, m_saved.date);
    ASSERT_EQ(loaded.times.size(), 2U);
    EXPECT_EQ(loaded.times.at("copy and drop/ours").median, 24.125);
    EXPECT_EQ(loaded.times.at("copy and drop/ours").low, 24);
    EXPECT_EQ(loaded.times.at("walk/ours").high, 8e5);
}

TEST_F(BaselineTest, SavingReplacesTheFormerFile) {
    saveBaseline(m_saved, m_file);
    Baseline later = m_saved;
    later.date = "2026-11-23T20:00:00Z";
    saveBaseline(later, m_file);
    EXPECT_EQ(load().date, later.date);
}

TEST_F(BaselineTest, SavingWhereNothingCanBeWrittenFails) {
    EXPECT_THROW(saveBaseline(m_saved, m_folder.file("absent/baseline")), std::runtime_error);
}

TEST_F(BaselineTest, TimesOfASingleRoundAreNotSaved) {
    saveBaseline(m_saved, m_file);
    Baseline later = m_saved;
    later.times["walk/ours"] = spreadOf({7e5});
    EXPECT_THROW(saveBaseline(later, m_file), std::runtime_error);
    EXPECT_EQ(load().times.at("walk/ours").high, 8e5);
}

TEST_F(BaselineTest, MissingFileIsRefused) {
    EXPECT_EQ(refusal(), m_file + ": cannot be read");
}

TEST_F(BaselineTest, BaselineOfAnotherMachineIsRefusedWithBothNames) {
    saveBaseline(m_saved, m_file);
    EXPECT_THAT(refusal(m_saved.program, "Brand 8, 2 processors"),
                AllOf(HasSubstr(m_file), HasSubstr("another machine"), HasSubstr("Brand 7"),
                      HasSubstr("Brand 8")));
}

TEST_F(BaselineTest, BaselineOfAnotherProgramIsRefused) {
    saveBaseline(m_saved, m_file);
    EXPECT_THAT(refusal("bench_agent", m_saved.machine),
                AllOf(HasSubstr("bench_library"), HasSubstr("bench_agent")));
}

TEST_F(BaselineTest, FileCutAnywhereIsRefused) {
    saveBaseline(m_saved, m_file);
    std::string const whole = content();
    std::size_t const braces = whole.rfind('}');
    for (std::size_t size = 0; size <= braces; ++size) {
        write(whole.substr(0, size));
        EXPECT_THAT(refusal(), HasSubstr("damaged")) << size;
    }
}

TEST_F(BaselineTest, OtherJsonIsRefused) {
    for (char const* const other :
         {"[]", "{}", "7", R"({"program": 1, "machine": 2, "date": 3, "nanoseconds": {}})"}) {
        write(other);
        EXPECT_THAT(refusal(), HasSubstr("damaged")) << other;
    }
}

TEST_F(BaselineTest, TimesThatAreNoneAreRefused) {
    for (Spread const& time : {Spread{0, 0, 0}, {-1, -2, 3}, {2, 3, 4}, {5, 3, 4}}) {
        Baseline damaged = m_saved;
        damaged.times["walk/ours"] = time;
        saveBaseline(damaged, m_file);
        EXPECT_THAT(refusal(), HasSubstr("damaged")) << time.median;
    }
}

TEST(MachineNameTest, ContainsTheModelAndTheNumberOfProcessors) {
    std::istringstream text("processor\t: 0\nmodel name\t: Brand 7 @ 2 GHz\n\n"
                            "processor\t: 1\nmodel name\t: Brand 7 @ 2 GHz\n");
    EXPECT_EQ(machineName(text), "Brand 7 @ 2 GHz, 2 processors");
}

TEST(MachineNameTest, ProcessorWithoutANameIsCounted) {
    std::istringstream text("processor\t: 0\nBogoMIPS\t: 50\n");
    EXPECT_EQ(machineName(text), "unnamed processor, 1 processor");
}

TEST(MachineNameTest, ThisMachineHasProcessors) {
    EXPECT_THAT(machineName(), testing::Not(HasSubstr(", 0 processors")));
}

} // namespace
