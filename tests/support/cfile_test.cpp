#include <gtest/gtest.h>

#include <fstream>

#include "helpers/test_paths.h"
#include "support/cfile.h"

using vantrel::CFile;
using vantrel::test::TempDir;

TEST(CFile, ClosedFileAnswersWithFailures) {
    CFile file;
    char buffer[4] = {'a', 'b', 'c', 'd'};
    EXPECT_EQ(file.Read(buffer, 4), 0u);
    EXPECT_EQ(file.Write(buffer, 4), 0u);
    EXPECT_EQ(file.Seek(0, 0), -1);
    EXPECT_EQ(file.Tell(), -1);
    EXPECT_EQ(file.Size(), -1);
    EXPECT_FALSE(file.Open("/nonexistent/file", CFile::kBinary));
}

TEST(CFile, ReopeningClosesTheFirstStreamAndPatchesInPlace) {
    TempDir dir;
    std::ofstream(dir.File("a"), std::ios::binary) << "0123456789";
    std::ofstream(dir.File("b"), std::ios::binary) << "xy";
    CFile file(dir.File("a"), CFile::kBinary);
    EXPECT_EQ(file.Size(), 10);
    ASSERT_TRUE(file.Open(dir.File("b"), CFile::kBinary | CFile::kReadWrite));
    EXPECT_EQ(file.Size(), 2);
    EXPECT_EQ(file.Seek(1, 0), 0);
    EXPECT_EQ(file.Write("Z", 1), 1u);
    file.Close();
    std::string bytes;
    ASSERT_TRUE(vantrel::ReadWholeFile(dir.File("b"), bytes));
    EXPECT_EQ(bytes, "xZ");
    EXPECT_FALSE(vantrel::ReadWholeFile(dir.File("a"), bytes, 9));  // over the size limit
}

TEST(CFile, CopySkipsAMissingSourceAndCopiesBytesOtherwise) {
    TempDir dir;
    std::ofstream(dir.File("to"), std::ios::binary) << "keep";
    EXPECT_FALSE(vantrel::CopyWholeFile(dir.File("missing"), dir.File("to")));
    std::string bytes;
    ASSERT_TRUE(vantrel::ReadWholeFile(dir.File("to"), bytes));
    EXPECT_EQ(bytes, "keep");
    std::ofstream(dir.File("from"), std::ios::binary) << std::string("a\0b\r\n", 5);
    EXPECT_TRUE(vantrel::CopyWholeFile(dir.File("from"), dir.File("to")));
    ASSERT_TRUE(vantrel::ReadWholeFile(dir.File("to"), bytes));
    EXPECT_EQ(bytes, std::string("a\0b\r\n", 5));
    EXPECT_FALSE(vantrel::CopyWholeFile(dir.Path(), dir.File("to")));
}
