// qzfgen: the control from the command line, for headless work and scripts. Subcommands in the
// style of git; "qzfgen help" and "qzfgen COMMAND --help" tell the rest.
//
// Exit codes: 0 done; 1 the control or the instrument refused (the error number and text are
// printed); 2 a misuse of the command line (one line on standard error).
#include "Arguments.h"
#include "Commands.h"

#include "qzivi/support/failure.h"

#include <cstdio>
#include <exception>
#include <string>
#include <vector>

namespace {

using qzfgen::Command;

void Overview(std::FILE* out) {
    std::fprintf(
        out, "usage: qzfgen COMMAND [ARGUMENTS] [--help]\n\n"
             "Drives a function generator by its IVI logical name through the QZIviFgen\n"
             "control. \"SampleFGen\", the built-in simulator, needs no set-up.\n\ncommands:\n");
    for (const Command& command : qzfgen::Commands())
        std::fprintf(out, "  %-10s %s\n", command.name, command.summary);
    std::fprintf(out, "\nexit codes: 0 done, 1 the control or the instrument refused, 2 misuse\n");
}

} // namespace

int main(int argc, char** argv) {
    const std::vector<std::string> words(argv + 1, argv + argc);
    if (words.empty() || words[0] == "help" || words[0] == "--help" || words[0] == "-h") {
        if (words.size() > 1) // "help COMMAND"
            for (const Command& command : qzfgen::Commands())
                if (words[1] == command.name) {
                    std::fputs(command.usage, stdout);
                    return 0;
                }
        Overview(words.empty() ? stderr : stdout);
        return words.empty() ? 2 : 0;
    }
    for (const Command& command : qzfgen::Commands()) {
        if (words[0] != command.name) continue;
        const std::vector<std::string> rest(words.begin() + 1, words.end());
        for (const std::string& word : rest)
            if (word == "--help" || word == "-h") {
                std::fputs(command.usage, stdout);
                return 0;
            }
        try {
            return command.run(rest);
        } catch (const qzfgen::Misuse& misuse) {
            std::fprintf(stderr, "qzfgen %s: %s (see qzfgen %s --help)\n", command.name,
                         misuse.what(), command.name);
            return 2;
        } catch (const qzivi::Failure& failure) {
            std::fprintf(stderr, "qzfgen %s: error %d: %s\n", command.name, failure.Number(),
                         failure.Description().c_str());
            return 1;
        } catch (const std::exception& e) {
            std::fprintf(stderr, "qzfgen %s: %s\n", command.name, e.what());
            return 1;
        }
    }
    std::fprintf(stderr, "qzfgen: unknown command \"%s\" (see qzfgen help)\n", words[0].c_str());
    return 2;
}
