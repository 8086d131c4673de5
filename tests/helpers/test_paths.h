#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>
#include <unistd.h>

namespace vantrel::test {

// Where the system's ICC profiles and characterisation data live.
inline std::string SystemIccDir() { return "/usr/share/color/icc/"; }
inline std::string FixtureDir() { return std::string(VANTREL_FIXTURE_DIR) + "/"; }
// An Argyll-built fixture profile ("FOGRA39L", "TR003"); empty when it was not built.
inline std::string FixtureProfile(const std::string& name) {
    std::string path = FixtureDir() + name + ".icc";
    return std::filesystem::exists(path) ? path : std::string();
}

// A fresh directory, removed with everything in it when the object goes.
class TempDir {
public:
    TempDir() {
        std::string pattern = (std::filesystem::temp_directory_path() / "vantrel-test-XXXXXX").string();
        if (char* made = mkdtemp(pattern.data())) path_ = made;
    }
    ~TempDir() {
        std::error_code ignored;
        if (!path_.empty()) std::filesystem::remove_all(path_, ignored);
    }
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;

    // The directory with a trailing separator, as hosts pass it.
    std::string Slash() const { return path_ + "/"; }
    std::string File(const std::string& name) const { return path_ + "/" + name; }
    const std::string& Path() const { return path_; }

private:
    std::string path_;
};

}  // namespace vantrel::test
