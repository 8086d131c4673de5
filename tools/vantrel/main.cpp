// vantrel: the library's jobs from a shell. One subcommand per job; results on stdout, messages
// on stderr; exit status 0, 1 (failure) or 2 (usage).

#include <cstdio>
#include <cstring>
#include <exception>
#include <string>

#include "cli_support.h"
#include "commands.h"

using namespace vantrel::cli;

namespace {

void Overview(FILE* to) {
    std::fprintf(to, "usage: vantrel COMMAND [ARGS] [--json] [--quiet]\n       vantrel COMMAND --help\n"
                     "       vantrel --version\n\ncommands:\n");
    for (const Command& c : Commands()) std::fprintf(to, "  %-10s %s\n", c.name, c.summary);
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2) {
        Overview(stderr);
        return kUsage;
    }
    const std::string first = argv[1];
    if (first == "--version") {
        std::printf("vantrel %s\n", VANTREL_VERSION);
        return kOk;
    }
    if (first == "--help" || first == "-h" || first == "help") {
        Overview(stdout);
        return kOk;
    }
    for (const Command& c : Commands()) {
        if (first != c.name) continue;
        for (int i = 2; i < argc; ++i)
            if (!std::strcmp(argv[i], "--help") || !std::strcmp(argv[i], "-h")) {
                std::printf("vantrel %s: %s\n%s", c.name, c.summary, c.help);
                return kOk;
            }
        try {
            return c.run(argc - 2, argv + 2);
        } catch (const CommandError& error) {
            std::fprintf(stderr, "vantrel %s: %s\n", c.name, error.text.c_str());
            if (error.status == kUsage) std::fprintf(stderr, "(vantrel %s --help shows its usage)\n", c.name);
            return error.status;
        } catch (const std::exception& error) {
            std::fprintf(stderr, "vantrel %s: %s\n", c.name, error.what());
            return kFailed;
        }
    }
    std::fprintf(stderr, "vantrel: unknown command \"%s\" (vantrel --help lists the commands)\n", first.c_str());
    return kUsage;
}
