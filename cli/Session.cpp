// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Session.h"

#include <algorithm>
#include <chrono>
#include <sstream>
#include <string>
#include <thread>

#include "cli/Text.h"

namespace kvloam {

std::string redrawn(Screen const& screen, std::string const& text) {
    // Home; each line, and the rest of it cleared; what is below cleared.
    std::string result = "\033[H";
    std::size_t lines = 0;
    std::size_t const most =
        screen.height == Screen::kUnlimited ? screen.height : screen.height - 1;
    for (std::size_t begin = 0; begin < text.size() && lines < most; ++lines) {
        std::size_t const end = std::min(text.find('\n', begin), text.size());
        result += text.substr(begin, end - begin) + "\033[K\n";
        begin = end + 1;
    }
    return result + "\033[J";
}

int watch(Session& session, Action const& action, double interval) {
    session.client.keepAnswers();
    if (session.screen.isTerminal && !session.asJson) session.out << "\033[2J";
    for (;;) {
        std::ostringstream text;
        Session round{session.client,
                      session.measure,
                      session.measure(),
                      text,
                      session.errors,
                      session.asJson,
                      true};
        try {
            action(round);
        } catch (CliError const& error) {
            // Restarts of the agent are part of what is watched.
            if (error.status() != kNoAgent || session.asJson) throw;
            text.str("");
            text << "kvloam: " << round.screen.clean(error.what()) << '\n';
        }
        if (session.asJson || !session.screen.isTerminal)
            session.out << text.str();
        else
            session.out << redrawn(round.screen, text.str());
        session.out.flush();
        if (!session.out) return kFailure;
        std::this_thread::sleep_for(std::chrono::duration<double>(interval));
    }
}

} // namespace kvloam
