#pragma once
// The subcommands of the vantrel command: each takes its arguments (without the command name)
// and answers the exit status; failures throw CommandError.

#include <string>
#include <vector>

namespace vantrel::cli {

struct Command {
    const char* name;
    const char* summary;
    const char* help;  // usage, options and an example
    int (*run)(int argc, char** argv);
};

const std::vector<Command>& Commands();

}  // namespace vantrel::cli
