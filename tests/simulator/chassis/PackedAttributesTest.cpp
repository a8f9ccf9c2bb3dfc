// SPDX-License-Identifier: BSD-2-Clause
#include "simulator/chassis/PackedAttributes.h"

#include <map>
#include <random>
#include <stdexcept>
#include <string>
#include <utility>

#include <gtest/gtest.h>

namespace kvlsim {
namespace {

using Contents = std::map<std::string, std::pair<ValueForm, std::string>>;

Contents contentsOf(PackedAttributes const& attributes) {
    Contents contents;
    attributes.forEach([&](std::string_view name, AttributeValue const& value) {
        EXPECT_TRUE(contents.try_emplace(std::string(name), value.form(), value.bytes()).second)
            << name << " is there twice";
    });
    EXPECT_EQ(attributes.size(), contents.size());
    return contents;
}

TEST(PackedAttributesTest, HaveTheNamesFormsAndBytesOfTheDescription) {
    AttributeMap described;
    described.emplace("TEXT", AttributeValue::text("a text that is longer than most of them"));
    described.emplace("NUMBER", AttributeValue::number(-1));
    described.emplace("SHORT", AttributeValue::shortNumber(0x0100));
    described.emplace("BYTE", AttributeValue::byte(-128));
    described.emplace("EMPTY", AttributeValue::empty());
    described.emplace("WORDS", AttributeValue::descriptor({1, 2, 3, 0xFFFF}));
    PackedAttributes const attributes(described);
    EXPECT_EQ(attributes.find("TEXT")->asText(), "a text that is longer than most of them");
    EXPECT_EQ(attributes.find("NUMBER")->asNumber(), -1);
    EXPECT_EQ(attributes.find("SHORT")->asNumber(), 0x0100);
    EXPECT_EQ(attributes.find("SHORT")->form(), ValueForm::shortNumber);
    EXPECT_EQ(attributes.find("BYTE")->asNumber(), -128);
    EXPECT_EQ(attributes.find("EMPTY")->bytes(), "");
    EXPECT_EQ(attributes.find("WORDS")->asDescriptor(), (DescriptorWords{1, 2, 3, 0xFFFF}));
}

TEST(PackedAttributesTest, FindNothingWithoutTheAttribute) {
    PackedAttributes attributes;
    EXPECT_FALSE(attributes.find("NAME"));
    EXPECT_FALSE(attributes.find(""));
    attributes.set("NAME", AttributeValue::text("NAME2"));
    EXPECT_FALSE(attributes.find("NAM"));
    EXPECT_FALSE(attributes.find("NAME2"));
    EXPECT_FALSE(attributes.unset("NAME2"));
}

TEST(PackedAttributesTest, NameThatIsTooLongChangesNothing) {
    PackedAttributes attributes;
    attributes.set("NAME", AttributeValue::number(1));
    std::string const name(PackedAttributes::kMaxName + 1, 'N');
    EXPECT_THROW(attributes.set(name, AttributeValue::number(2)), std::length_error);
    EXPECT_EQ(contentsOf(attributes).size(), 1U);
    attributes.set(name.substr(1), AttributeValue::number(3));
    EXPECT_EQ(attributes.find(name.substr(1))->asNumber(), 3);
}

TEST(PackedAttributesTest, AreAsAMapAfterRandomChanges) {
    std::mt19937 random(1);
    PackedAttributes attributes;
    Contents expected;
    for (int change = 0; change < 5000; ++change) {
        std::string const name(1 + random() % 30, static_cast<char>('A' + random() % 3));
        if (random() % 3 == 0) {
            EXPECT_EQ(attributes.unset(name), expected.erase(name) == 1);
        } else {
            auto const value = random() % 2 == 0
                                   ? AttributeValue::text(std::string(random() % 40, 'x'))
                                   : AttributeValue::number(static_cast<std::int32_t>(random()));
            attributes.set(name, value);
            expected.insert_or_assign(name, std::pair(value.form(), std::string(value.bytes())));
        }
        ASSERT_EQ(contentsOf(attributes), expected);
    }
}

} // namespace
} // namespace kvlsim
