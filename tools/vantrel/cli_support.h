#pragma once
// What every subcommand of the vantrel command shares: its arguments, its one-line errors, the
// library handle with a progress bar and Ctrl-C, checks of the files it is given, and JSON output.

#include <map>
#include <string>
#include <vector>

namespace vantrel::cli {

// Exit statuses.
inline constexpr int kOk = 0;
inline constexpr int kFailed = 1;
inline constexpr int kUsage = 2;

// Thrown by the checks; main prints "vantrel <command>: <text>" and exits with the status.
struct CommandError {
    int status;
    std::string text;
};
[[noreturn]] void Fail(const std::string& text);
[[noreturn]] void UsageError(const std::string& text);

// Positional arguments and --options; an option takes the next argument as its value unless it
// is one of the given flags.
class Args {
public:
    Args(int argc, char** argv, const std::vector<std::string>& flags);
    bool Has(const std::string& name) const { return m_Options.count(name) != 0; }
    std::string Get(const std::string& name, const std::string& fallback = "") const;
    double Number(const std::string& name, double fallback) const;
    const std::vector<std::string>& Positional() const { return m_Positional; }
    // The n-th positional argument; a usage error naming `what` when it is missing.
    const std::string& At(size_t n, const char* what) const;
    // Usage error for anything not in `known` (flags and options together).
    void Only(const std::vector<std::string>& known, size_t maxPositional) const;

private:
    std::map<std::string, std::string> m_Options;
    std::vector<std::string> m_Positional;
};

// The library's tool object for one command, in a private scratch folder that goes with it.
// Progress goes to stderr (a bar on a terminal, plain lines elsewhere); Ctrl-C makes the
// progress answer non-zero, which the measurement scans and the optimisation loops obey.
class Session {
public:
    explicit Session(bool quiet);
    ~Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    void* Handle() const { return m_Handle; }
    const std::string& Scratch() const { return m_Scratch; }
    // A copy of `path` in the scratch folder (the library may rewrite measurement files).
    std::string CopyIn(const std::string& path) const;
    // Fails with "interrupted" once Ctrl-C was pressed.
    void CheckInterrupted() const;

private:
    void* m_Handle = nullptr;
    std::string m_Scratch;
};
bool Interrupted();

// Checks that fail with a one-line message naming the file.
void RequireFile(const std::string& path);
// The profile exists and the library's reader takes its tag table and `tag` table.
void RequireProfile(const std::string& path, const char* tag = "A2B0");
// The CGATS file reads; with needDevice it has CMYK, RGB or channel columns; with needColour Lab or XYZ.
void RequireChart(const std::string& path, bool needDevice, bool needColour);

// Where a command writes: `out`, or the input itself with --in-place. Refuses to overwrite the
// input without --in-place; copies the input to out (when they differ) so the library works on it.
std::string OutputCopy(const Args& args, const std::string& input);
// The file a command writes: removed again when the command fails or is interrupted before
// Keep(), unless it is the input itself (--in-place) or was there before.
class OutputFile {
public:
    OutputFile(const Args& args, const std::string& input);
    explicit OutputFile(const std::string& path);  // a new file the library writes itself
    ~OutputFile();
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;
    const std::string& Path() const { return m_Path; }
    void Keep() { m_Keep = true; }

private:
    std::string m_Path;
    bool m_Keep = false;
};
void CopyFile(const std::string& from, const std::string& to);

// A flat JSON object, written on one line.
class Json {
public:
    Json& Add(const std::string& key, double value);
    Json& Add(const std::string& key, const std::string& value);
    Json& AddRaw(const std::string& key, const std::string& json);
    std::string Text() const;

private:
    std::vector<std::pair<std::string, std::string>> m_Fields;
};
std::string JsonString(const std::string& text);
std::string JsonNumber(double value);

// Library ints (x 1000) as numbers.
inline double FromHost(int value) { return value / 1000.0; }

}  // namespace vantrel::cli
