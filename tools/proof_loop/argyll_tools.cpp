#include "argyll_tools.h"

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

namespace vantrel::proofloop {
namespace {

std::string FindOnPath(const std::string& name) {
    const char* path = std::getenv("PATH");
    if (!path) return {};
    std::stringstream dirs(path);
    std::string dir;
    while (std::getline(dirs, dir, ':')) {
        if (dir.empty()) continue;
        std::string candidate = dir + "/" + name;
        if (access(candidate.c_str(), X_OK) == 0) return candidate;
    }
    return {};
}

// Writes rows of N numbers, runs xicclu over them and reads rows of M numbers back.
template <size_t M, size_t N>
std::vector<std::array<double, M>> LookUp(const std::string& xicclu, const std::string& profile,
                                          const std::vector<std::string>& flags,
                                          const std::vector<std::array<double, N>>& rows,
                                          const std::string& scratchDir, bool devicePercent) {
    std::string in = scratchDir + "/xicclu-in.txt", out = scratchDir + "/xicclu-out.txt";
    {
        std::ofstream file(in);
        file.precision(9);
        for (const auto& row : rows) {
            for (size_t k = 0; k < N; ++k) file << (k ? " " : "") << row[k];
            file << '\n';
        }
        if (!file) return {};
    }
    std::vector<std::string> argv{xicclu, "-v0", "-pl"};
    if (devicePercent) {
        argv.push_back("-s");
        argv.push_back("100");
    }
    argv.insert(argv.end(), flags.begin(), flags.end());
    argv.push_back(profile);
    if (RunProgram(argv, in, out) != 0) return {};
    std::vector<std::array<double, M>> result;
    std::ifstream file(out);
    std::string line;
    while (result.size() < rows.size() && std::getline(file, line)) {
        std::istringstream words(line);
        std::array<double, M> values{};
        size_t k = 0;
        while (k < M && words >> values[k]) ++k;
        if (k == M) result.push_back(values);
    }
    if (result.size() != rows.size()) result.clear();
    return result;
}

}  // namespace

std::string ArgyllTools::Missing() const {
    std::string missing;
    auto add = [&missing](const std::string& path, const char* name) {
        if (path.empty()) missing += (missing.empty() ? "" : ", ") + std::string(name);
    };
    add(xicclu, "xicclu");
    add(colprof, "colprof");
    add(refine, "refine");
    return missing;
}

ArgyllTools FindArgyllTools() {
    return ArgyllTools{FindOnPath("xicclu"), FindOnPath("colprof"), FindOnPath("refine")};
}

int RunProgram(const std::vector<std::string>& argv, const std::string& stdinFile, const std::string& stdoutFile) {
    if (argv.empty()) return -1;
    std::vector<char*> args;
    for (const auto& a : argv) args.push_back(const_cast<char*>(a.c_str()));
    args.push_back(nullptr);
    pid_t child = fork();
    if (child < 0) return -1;
    if (child == 0) {
        if (!stdinFile.empty()) {
            int fd = open(stdinFile.c_str(), O_RDONLY);
            if (fd < 0) _exit(127);
            dup2(fd, 0);
            close(fd);
        }
        int fd = open(stdoutFile.empty() ? "/dev/null" : stdoutFile.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
        if (fd < 0) _exit(127);
        dup2(fd, 1);
        close(fd);
        execv(args[0], args.data());
        _exit(127);
    }
    int status = 0;
    while (waitpid(child, &status, 0) < 0)
        if (errno != EINTR) return -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

std::vector<Triple> LookUpLab(const std::string& xicclu, const std::string& profile,
                              const std::vector<std::string>& flags, const std::vector<Quad>& cmyk,
                              const std::string& scratchDir) {
    return LookUp<3, 4>(xicclu, profile, flags, cmyk, scratchDir, true);
}

std::vector<Quad> LookUpCmyk(const std::string& xicclu, const std::string& profile,
                             const std::vector<std::string>& flags, const std::vector<Triple>& lab,
                             const std::string& scratchDir) {
    return LookUp<4, 3>(xicclu, profile, flags, lab, scratchDir, true);
}

std::vector<Triple> LookUpLabToLab(const std::string& xicclu, const std::string& profile,
                                   const std::vector<std::string>& flags, const std::vector<Triple>& lab,
                                   const std::string& scratchDir) {
    return LookUp<3, 3>(xicclu, profile, flags, lab, scratchDir, false);
}

}  // namespace vantrel::proofloop
