// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/ModuleLoader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;

/// Loads from the folder of deliberately broken modules.
class ModuleLoaderTest : public ::testing::Test {
  protected:
    /// The error of loading `name` and creating its factory; empty if there is none.
    static std::string complaint(std::string const& name) {
        try {
            LoadedModule(name, BROKEN_MODULE_DIR).createFactory();
        } catch (ModuleError const& error) {
            return error.what();
        }
        return {};
    }

    /// The error for a module that was built for another version.
    static std::string refusal(std::string const& name) {
        return "module '" + name + "' refuses version " +
               std::to_string(KVL_BOARD_MODULE_ABI_VERSION) +
               " of the module interface; rebuild it for this agent";
    }
};

TEST_F(ModuleLoaderTest, UnknownModuleIsNamedWithThePathThatWasTried) {
    EXPECT_THAT(complaint("nothing"),
                AllOf(HasSubstr("'nothing'"), HasSubstr(BROKEN_MODULE_DIR "/nothingkvl.so")));
}

TEST_F(ModuleLoaderTest, FileThatIsNoSharedObjectIsRefused) {
    EXPECT_THAT(complaint("text"),
                AllOf(HasSubstr("'text'"), HasSubstr("cannot be loaded"), HasSubstr("textkvl.so")));
}

TEST_F(ModuleLoaderTest, ModuleWithoutEntryPointIsRefused) {
    EXPECT_THAT(complaint("noentry"),
                AllOf(HasSubstr("'noentry'"), HasSubstr("kvl_create_board_factory")));
}

TEST_F(ModuleLoaderTest, ModuleThatRefusesTheVersionIsNamedWithTheVersion) {
    EXPECT_THAT(complaint("refusing"), AllOf(HasSubstr("'refusing'"), HasSubstr("version 1")));
}

TEST_F(ModuleLoaderTest, ModuleOfTheVersionBeforeIsRefusedWithTheVersionItWasAskedFor) {
    EXPECT_EQ(complaint("older"), refusal("older"));
}

TEST_F(ModuleLoaderTest, ModuleOfTheNextVersionIsRefusedWithTheVersionItWasAskedFor) {
    EXPECT_EQ(complaint("newer"), refusal("newer"));
}

TEST_F(ModuleLoaderTest, ModuleOfThisVersionMakesAFactory) {
    EXPECT_NE(LoadedModule("current", BROKEN_MODULE_DIR).createFactory().get(), nullptr);
}

TEST_F(ModuleLoaderTest, ModuleThatThrowsIsNamedWithItsReason) {
    EXPECT_THAT(complaint("throwing"), AllOf(HasSubstr("'throwing'"), HasSubstr("out of boards")));
}

TEST_F(ModuleLoaderTest, ModuleThatThrowsSomethingOddIsRefused) {
    EXPECT_THAT(complaint("throwing-odd"), HasSubstr("'throwing-odd'"));
}

TEST_F(ModuleLoaderTest, NameWithAPathIsRefused) {
    EXPECT_THAT(complaint("../modules/refusing"), HasSubstr("--module-dir"));
}

TEST_F(ModuleLoaderTest, EveryComplaintIsOneLine) {
    for (char const* const name : {"nothing", "text", "noentry", "refusing", "older", "newer",
                                   "throwing", "throwing-odd", "a/b", ""})
        EXPECT_THAT(complaint(name), AllOf(Not(""), Not(HasSubstr("\n")))) << name;
}

} // namespace
} // namespace kvloamd
