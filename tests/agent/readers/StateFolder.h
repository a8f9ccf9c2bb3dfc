// SPDX-License-Identifier: BSD-2-Clause
// A folder with an index file, for tests.
#pragma once

#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

#include <gtest/gtest.h>
#include <sqlite3.h>

#include "agent/readers/KeptSettings.h"
#include "agent/readers/StableIndices.h"
#include "agent/readers/StateFile.h"

namespace kvloamd {

/// One run of the agent, as far as its index file is concerned.
struct AgentRun {
    explicit AgentRun(std::string const& path, std::uint32_t base = 1000, Retention retention = {})
        : file(path, "interfaces", std::chrono::milliseconds::zero()),
          indices(file, base, std::move(retention)),
          kept(file, indices, settings) {
        file.open();
    }

    /// The indices of a board's things, saved.
    std::vector<std::uint32_t> ask(std::string const& board, std::vector<IndexKey> const& keys,
                                   bool stable = true) {
        auto given = indices.indicesOf({board, stable}, keys);
        indices.save();
        return given;
    }
    void set(SettingKey key, std::optional<SettingValue> value) {
        settings.exchange(key, std::move(value));
        kept.save();
    }

    Settings settings;
    StateFile file;
    StableIndices indices;
    KeptSettings kept;
};

class StateFolder : public ::testing::Test {
  protected:
    StateFolder() {
        std::string folder = ::testing::TempDir() + "state-XXXXXX";
        if (mkdtemp(folder.data()) == nullptr) throw std::runtime_error("no temporary folder");
        m_folder = folder;
    }
    ~StateFolder() override {
        std::error_code ignored;
        std::filesystem::remove_all(m_folder, ignored);
    }

    std::string file() const { return m_folder + "/ifindex.sqlite"; }
    static std::vector<IndexKey> lines(int count) {
        std::vector<IndexKey> keys;
        for (int i = 1; i <= count; ++i)
            keys.push_back({IndexKind::Line, "line" + std::to_string(i)});
        return keys;
    }
    std::vector<std::string> damagedFiles() const {
        std::vector<std::string> names;
        for (auto const& entry : std::filesystem::directory_iterator(m_folder))
            if (std::string name = entry.path().filename(); name.find(".damaged-") != name.npos)
                names.push_back(std::move(name));
        return names;
    }
    void write(std::string const& content) const {
        std::ofstream stream(file(), std::ios::binary);
        stream << content;
    }

    std::string m_folder;
};

/// Another program that uses the index file.
class OtherProgram {
  public:
    explicit OtherProgram(std::string const& file) { sqlite3_open(file.c_str(), &m_database); }
    ~OtherProgram() { sqlite3_close(m_database); }
    OtherProgram(OtherProgram const&) = delete;
    OtherProgram& operator=(OtherProgram const&) = delete;

    void execute(char const* sql) {
        char* why = nullptr;
        EXPECT_EQ(sqlite3_exec(m_database, sql, nullptr, nullptr, &why), SQLITE_OK)
            << sql << ": " << (why == nullptr ? "" : why);
        sqlite3_free(why);
    }

  private:
    sqlite3* m_database = nullptr;
};

} // namespace kvloamd
