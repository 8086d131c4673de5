// The fixed files in a folder everyone can write: used only when nobody else could have put
// them there.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <functional>

#include "helpers/cgats_files.h"
#include "support/platform.h"

using namespace vantrel;

TEST(FixedFiles, OnlyARegularFileOfThisUserThatOthersCannotWriteIsRead) {
    test::TempDir dir;
    const std::string own = test::WriteText(dir, "own.txt", "10\n20\n");
    ::chmod(own.c_str(), 0644);
    const struct {
        const char* what;
        std::function<std::string()> make;
        bool trusted;
    } cases[] = {
        {"own file, 0644", [&] { return own; }, true},
        {"own file, 0600", [&] { const auto p = test::WriteText(dir, "a.txt", "1\n"); ::chmod(p.c_str(), 0600); return p; }, true},
        {"group-writable", [&] { const auto p = test::WriteText(dir, "g.txt", "1\n"); ::chmod(p.c_str(), 0664); return p; }, false},
        {"world-writable", [&] { const auto p = test::WriteText(dir, "w.txt", "1\n"); ::chmod(p.c_str(), 0646); return p; }, false},
        {"symbolic link to an own file", [&] { const auto p = dir.File("link.txt"); std::filesystem::create_symlink(own, p); return p; }, false},
        {"FIFO", [&] { const auto p = dir.File("fifo"); ::mkfifo(p.c_str(), 0600); return p; }, false},
        {"directory", [&] { return dir.Path(); }, false},
        {"absent", [&] { return dir.File("absent.txt"); }, false},
        // Root can hand a file to another user: then it is someone else's.
        {"another user's", [&] {
             const auto p = test::WriteText(dir, "other.txt", "1\n");
             ::chmod(p.c_str(), 0644);
             if (::geteuid() != 0 || ::chown(p.c_str(), 65534, 65534) != 0) return own;  // cannot be tested
             return p;
         }, ::geteuid() != 0},
    };
    for (const auto& c : cases) {
        const std::string path = c.make();
        uint64_t size = 0;
        EXPECT_EQ(platform::FixedFileTrusted(path.c_str(), size), c.trusted) << c.what;
        std::FILE* file = platform::OpenFixedFile(path.c_str());
        EXPECT_EQ(file != nullptr, c.trusted) << c.what;
        if (file) std::fclose(file);
    }
    uint64_t size = 0;
    ASSERT_TRUE(platform::FixedFileTrusted(own.c_str(), size));
    EXPECT_EQ(size, 6u);
}
