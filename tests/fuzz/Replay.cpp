// SPDX-License-Identifier: BSD-2-Clause
// Runs a fuzz target without libFuzzer: the given inputs, then a fixed number of mutations of them,
// the same in every run. The target runs in a child process; an input that ends it is saved.
//
//   fuzz_<target> [--mutations COUNT] FILE|FOLDER...
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <string>
#include <vector>

#include "tests/fuzz/FuzzInput.h"

namespace {

constexpr std::size_t kMaxInput = std::size_t{1} << 20;
/// An input that takes longer is a finding.
constexpr unsigned kPatience = 120; // seconds

/// The input that is running, where the parent sees it after the child's end.
struct Running {
    std::size_t size;
    char octets[kMaxInput];
};

std::vector<std::string> readInputs(std::vector<std::string> const& places) {
    std::vector<std::filesystem::path> files;
    for (std::string const& place : places) {
        if (!std::filesystem::is_directory(place)) {
            files.emplace_back(place);
            continue;
        }
        for (auto const& entry : std::filesystem::recursive_directory_iterator(place))
            if (entry.is_regular_file()) files.push_back(entry.path());
    }
    std::ranges::sort(files);
    std::vector<std::string> inputs;
    for (auto const& file : files) {
        std::ifstream stream(file, std::ios::binary);
        if (!stream) {
            std::fprintf(stderr, "%s: cannot be read\n", file.c_str());
            std::exit(2);
        }
        inputs.emplace_back(std::istreambuf_iterator<char>(stream),
                            std::istreambuf_iterator<char>());
        inputs.back().resize(std::min(inputs.back().size(), kMaxInput));
    }
    return inputs;
}

/// A `Mutator` changes inputs as libFuzzer does, but the same way in every run.
class Mutator {
  public:
    explicit Mutator(std::vector<std::string> const& inputs) : m_inputs(inputs) {}

    std::string next() {
        std::string input = any();
        for (std::size_t changes = 1 + below(4); changes > 0; --changes)
            change(input);
        input.resize(std::min(input.size(), kMaxInput));
        return input;
    }

  private:
    std::size_t below(std::size_t limit) { return m_random() % limit; }
    std::string const& any() { return m_inputs[below(m_inputs.size())]; }

    void change(std::string& input) {
        static constexpr char kSpecial[] = {0, 1, 16, 32, 127, -128, -1, '"', '\n', ' ', '0', '9'};
        std::size_t const at = below(input.size() + 1);
        std::size_t const size = below(std::min<std::size_t>(input.size() - at, 64) + 1);
        switch (below(7)) {
        case 0:
            if (at < input.size())
                input[at] =
                    static_cast<char>(static_cast<unsigned char>(input[at]) ^ 1U << below(8));
            break;
        case 1:
            if (at < input.size()) input[at] = kSpecial[below(sizeof kSpecial)];
            break;
        case 2:
            if (at < input.size()) input[at] = static_cast<char>(below(256));
            break;
        case 3:
            input.erase(at, size);
            break;
        case 4:
            input.insert(at, std::string(input, at, size));
            break;
        case 5:
            input.insert(at, 1 + below(8), kSpecial[below(sizeof kSpecial)]);
            break;
        default: { // a piece of another input
            std::string const& other = any();
            std::size_t const from = below(other.size() + 1);
            input.replace(at, size, other, from, below(64));
        }
        }
    }

    std::vector<std::string> const& m_inputs;
    std::mt19937 m_random{20261122}; // NOLINT(cert-msc51-cpp): every run is the same
};

void run(Running& running, std::string const& input) {
    running.size = input.size();
    std::memcpy(running.octets, input.data(), input.size());
    alarm(kPatience);
    // A copy on the heap, so that AddressSanitizer sees a read past its end.
    std::vector<std::uint8_t> const octets(input.begin(), input.end());
    LLVMFuzzerTestOneInput(octets.data(), octets.size());
}

[[noreturn]] void runAll(Running& running, std::vector<std::string> const& inputs,
                         std::size_t mutations) {
    for (std::string const& input : inputs)
        run(running, input);
    Mutator mutator(inputs);
    for (std::size_t i = 0; i < mutations; ++i)
        run(running, mutator.next());
    alarm(0);
    std::exit(0);
}

} // namespace

int main(int argc, char** argv) {
    std::vector<std::string> places(argv + 1, argv + argc);
    std::size_t mutations = 0;
    if (places.size() > 1 && places[0] == "--mutations") {
        mutations = std::strtoul(places[1].c_str(), nullptr, 10);
        places.erase(places.begin(), places.begin() + 2);
    }
    std::vector<std::string> const inputs = readInputs(places);
    if (inputs.empty()) {
        std::fprintf(stderr, "%s: there is no input\n", argv[0]);
        return 2;
    }
    void* const shared =
        mmap(nullptr, sizeof(Running), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    if (shared == MAP_FAILED) return 2;
    auto& running = *static_cast<Running*>(shared);
    pid_t const child = fork();
    if (child < 0) return 2;
    if (child == 0) runAll(running, inputs, mutations);
    int status = 0;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    if (status == 0) {
        std::printf("%zu inputs and %zu mutations\n", inputs.size(), mutations);
        return 0;
    }
    std::string const file = std::string(argv[0]) + ".failed-input";
    std::ofstream(file, std::ios::binary)
        .write(running.octets, static_cast<std::streamsize>(running.size));
    std::fprintf(stderr, "%s (%s %d): the last input is %s\n", argv[0],
                 WIFSIGNALED(status) ? "signal" : "status",
                 WIFSIGNALED(status) ? WTERMSIG(status) : WEXITSTATUS(status), file.c_str());
    return 1;
}
