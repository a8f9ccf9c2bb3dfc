// SPDX-License-Identifier: BSD-2-Clause
// The numbers of notifications, their log, and informs that nobody acknowledges.
#include <algorithm>
#include <csignal>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::IsSupersetOf;

class NotificationLogTest : public AgentFixture {
  protected:
    static constexpr char kLogged[] = "1.3.6.1.2.1.92.1.3.1.1.9"; // nlmLogNotificationID
    static constexpr char kVariables[] = "1.3.6.1.2.1.92.1.3.2";

    /// The numbers of the notifications in the receiver's output, in their order.
    static std::vector<std::uint32_t> numbersIn(std::string const& output) {
        std::string const before = "KVL-OAM-MIB::kvlEventNumber.0 = ";
        std::vector<std::uint32_t> numbers;
        for (auto at = output.find(before); at != std::string::npos; at = output.find(before, at)) {
            at += before.size();
            numbers.push_back(static_cast<std::uint32_t>(std::stoul(output.substr(at))));
        }
        return numbers;
    }
    /// Waits for a notification that contains `text`. Returns its number; 0 if it does not arrive.
    std::uint32_t numberOf(std::string const& text) {
        std::uint32_t number = 0;
        eventually([&] {
            trapReceiver().hasNow(text);
            std::string const& output = trapReceiver().output();
            // The last line may not be whole yet.
            for (std::string const& line : linesOf(output.substr(0, output.rfind('\n') + 1)))
                if (line.find(text) != std::string::npos)
                    number = numbersIn(line).empty() ? 0 : numbersIn(line).back();
            return number != 0;
        });
        return number;
    }
    /// The numbers of the notifications in the log.
    std::vector<std::uint32_t> logged() const {
        std::vector<std::uint32_t> numbers;
        for (Answer const& answer : walk(kLogged))
            if (!answer.value.starts_with("No Such")) numbers.push_back(answer.name.back());
        return numbers;
    }
    std::uint32_t newestEvent() const {
        std::string const value = get("kvlEventNumber.0");
        return static_cast<std::uint32_t>(std::stoul(value.substr(value.find(' '))));
    }
    /// Starts receiver and agent, with informs of which each is asked for twice.
    void startWithInforms() {
        startTrapReceiver("authCommunity log public\n");
        configureSnmp("rocommunity public 127.0.0.1\ntrapsess -Ci -v 2c -r 1 -t 1 -c public " +
                      trapAddress() + "\n");
        startAgent();
    }
    void expectCount(std::string const& counter, int count) {
        std::string const expected = "Counter32: " + std::to_string(count) + " notifications";
        EXPECT_TRUE(eventually([&] { return get(counter + ".0") == expected; }))
            << counter << " is " << get(counter + ".0");
    }
};

TEST_F(NotificationLogTest, EveryNotificationHasAGrowingNumberAndIsInTheLog) {
    startWithReceiver();
    sim({"stop", "1"});
    sim({"fault", "2", "17"});
    ASSERT_NE(numberOf("kvlNotifyBoardStatus.0 = stopped"), 0U);
    ASSERT_NE(numberOf("kvlFaultRaised"), 0U);
    auto const numbers = numbersIn(trapReceiver().output());
    ASSERT_GE(numbers.size(), 3U) << "with coldStart";
    EXPECT_TRUE(std::ranges::is_sorted(numbers, std::ranges::less_equal{})) << "none twice";
    EXPECT_TRUE(eventually([&] { return logged().size() >= numbers.size(); }));
    EXPECT_THAT(logged(), IsSupersetOf(numbers));
    EXPECT_GE(newestEvent(), numbers.back());
}

TEST_F(NotificationLogTest, LogHasTheVariablesThatWereSent) {
    startWithReceiver();
    sim({"stop", "1"});
    std::string const number = std::to_string(numberOf("kvlNotifyBoardStatus.0 = stopped"));
    std::string const status = "1.3.6.1.2.1.92.1.3.2.1.7.0." + number + ".3";
    ASSERT_TRUE(eventually([&] { return get(status) == "INTEGER: 4"; })) << get(status);
    EXPECT_THAT(get("1.3.6.1.2.1.92.1.3.2.1.8.0." + number + ".2"), HasSubstr("NX50001"));
    EXPECT_EQ(get("1.3.6.1.2.1.92.1.3.1.1.9.0." + number), "OID: .1.3.6.1.4.1.32473.1.0.1");
    EXPECT_NE(get("1.3.6.1.2.1.92.1.3.1.1.2.0." + number), "Timeticks: (0) 0:00:00.00");
}

TEST_F(NotificationLogTest, LogOutlivesTheAgent) {
    startWithReceiver();
    sim({"stop", "1"});
    std::uint32_t const number = numberOf("kvlNotifyBoardStatus.0 = stopped");
    ASSERT_TRUE(eventually([&] { return std::ranges::count(logged(), number) == 1; }));
    auto const numbers = logged();
    auto const variables = walk(kVariables);
    agent().signal(SIGKILL);
    agent().wait();
    startAgent();
    EXPECT_THAT(logged(), IsSupersetOf(numbers));
    auto const again = walk(kVariables);
    for (Answer const& answer : variables)
        EXPECT_TRUE(std::ranges::any_of(again, [&](Answer const& each) {
            return each.name == answer.name && each.value == answer.value;
        })) << answer.value;
    EXPECT_EQ(get("1.3.6.1.2.1.92.1.3.1.1.2.0." + std::to_string(number)),
              "Timeticks: (0) 0:00:00.00");
    // What comes later has higher numbers.
    sim({"fail", "2"});
    EXPECT_GT(numberOf("kvlNotifyBoardStatus.0 = failed"), numbers.back());
}

TEST_F(NotificationLogTest, AcknowledgedInformsCountAsSent) {
    startWithInforms();
    expectCount("kvlNotificationsSent", 1); // coldStart
    sim({"fault", "2", "17"});
    ASSERT_TRUE(trapReceiver().waitFor("kvlFaultRaised"));
    expectCount("kvlNotificationsSent", 2);
    EXPECT_EQ(get("kvlNotificationsUnacknowledged.0"), "Counter32: 0 notifications");
}

TEST_F(NotificationLogTest, InformsThatADeadReceiverDoesNotAcknowledgeDoNotCountAsSent) {
    startWithInforms();
    expectCount("kvlNotificationsSent", 1);
    trapReceiver().signal(SIGKILL);
    trapReceiver().wait();
    sim({"fault", "2", "17"});
    expectCount("kvlNotificationsUnacknowledged", 1);
    EXPECT_EQ(get("kvlNotificationsSent.0"), "Counter32: 1 notifications");
    EXPECT_EQ(get("kvlNotificationsDropped.0"), "Counter32: 0 notifications");
}

TEST_F(NotificationLogTest, InformThatWaitsCountsAsUnacknowledgedWhenItsReceiverIsRemoved) {
    startTrapReceiver("authCommunity log public\n");
    configureSnmp("rocommunity public 127.0.0.1\ntrapsess -Ci -v 2c -r 5 -t 600 -c public " +
                  trapAddress() + "\n");
    startAgent();
    expectCount("kvlNotificationsSent", 1);
    trapReceiver().signal(SIGSTOP);
    sim({"fault", "2", "17"});
    ASSERT_TRUE(eventually([this] { return logged().size() == 2; }));
    configureSnmp("rocommunity public 127.0.0.1\n");
    agent().signal(SIGHUP);
    expectCount("kvlNotificationsUnacknowledged", 1);
    // Without receivers, notifications are sent to all of them.
    sim({"fault", "2", "17", "--clear"});
    expectCount("kvlNotificationsSent", 2);
}

} // namespace
} // namespace kvloamd::e2e
