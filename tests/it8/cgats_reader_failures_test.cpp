// Every failure of the reader by a minimal file, and malformed input of every kind: the reader
// answers with its code, holds memory in proportion to the file, and leaves an empty object.
#include <gtest/gtest.h>

#include <filesystem>
#include <random>
#include <string>

#include "it8/measured_it8.h"
#include "it8_test_files.h"

using namespace vantrel;
using namespace vantrel::test;
using namespace vantrel::test::it8;

namespace {

const char* const kHead = "CGATS.17\nBEGIN_DATA_FORMAT\nID CMYK_C LAB_L\nEND_DATA_FORMAT\n";

int Read(Measured_IT8& it8, const std::string& text) {
    TempDir dir;
    return it8.ReadIt8(WriteFile(dir, "t.it8", text));
}

// The state of a freshly constructed object.
void ExpectEmpty(const Measured_IT8& it8) {
    EXPECT_EQ(it8.PatchCount(), 0);
    EXPECT_EQ(it8.FieldCount(), 0);
    EXPECT_TRUE(it8.Rows().empty());
    EXPECT_TRUE(it8.FieldNames().empty());
    EXPECT_EQ(it8.Header().numberOfSets, -1);
    EXPECT_EQ(it8.Column(kColLabL), -1);
    EXPECT_EQ(it8.GetLab(0, 0), -1.0);
    EXPECT_EQ(it8.GetCmyk(0, 0), -1.0);
}

}  // namespace

TEST(CgatsReaderFailures, EachCodeByAMinimalFile) {
    struct Case {
        const char* what;
        std::string text;
        int code;
    };
    const std::string head = kHead;
    const Case cases[] = {
        {"sets 0", head + "NUMBER_OF_SETS 0\nBEGIN_DATA\nEND_DATA\n", kIt8NoSets},
        {"sets absent", head + "BEGIN_DATA\n1 2 3\nEND_DATA\n", kIt8NoSets},
        {"sets negative", head + "NUMBER_OF_SETS -5\nBEGIN_DATA\nEND_DATA\n", kIt8NoSets},
        {"sets not a number", head + "NUMBER_OF_SETS many\nBEGIN_DATA\nEND_DATA\n", kIt8NoSets},
        {"format empty", "BEGIN_DATA_FORMAT\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1\nEND_DATA\n",
         kIt8NoFieldNames},
        {"format blank line", "BEGIN_DATA_FORMAT\n \t \nID\nEND_DATA_FORMAT\n", kIt8NoFieldNames},
        {"format at the end", "NUMBER_OF_SETS 1\nBEGIN_DATA_FORMAT\n", kIt8NoFieldNames},
        {"no format", "NUMBER_OF_SETS 1\nBEGIN_DATA\n1\nEND_DATA\n", kIt8NoFieldNames},
        {"no data block", head + "NUMBER_OF_SETS 1\n1 2 3\nEND_DATA\n", kIt8NoDataBlock},
        {"empty file", "", kIt8NoDataBlock},
        {"ends in data", head + "NUMBER_OF_SETS 2\nBEGIN_DATA\n1 2 3\n", kIt8EndsInDataBlock},
        {"ends before END_DATA", head + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3\n", kIt8EndsInDataBlock},
        {"too few sets", head + "NUMBER_OF_SETS 3\nBEGIN_DATA\n1 2 3\nEND_DATA\n", kIt8TooFewSets},
        {"row short", head + "NUMBER_OF_SETS 2\nBEGIN_DATA\n1 2 3\n2 3\nEND_DATA\n", kIt8RowFieldCount},
        {"row long", head + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3 4\nEND_DATA\n", kIt8RowFieldCount},
        {"row blank", head + "NUMBER_OF_SETS 1\nBEGIN_DATA\n  \nEND_DATA\n", kIt8RowFieldCount},
        {"too many sets", head + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3\n2 3 4\nEND_DATA\n", kIt8TooManySets},
    };
    for (const Case& c : cases) {
        Measured_IT8 it8;
        EXPECT_EQ(Read(it8, c.text), c.code) << c.what;
        ExpectEmpty(it8);
    }
}

TEST(CgatsReaderFailures, MissingFileOrDirectoryCannotBeOpened) {
    TempDir dir;
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, SmallCmykLabFile()), 0);
    EXPECT_EQ(it8.ReadIt8(dir.File("absent.it8")), kIt8CannotOpen);
    ExpectEmpty(it8);
    EXPECT_EQ(it8.ReadIt8(dir.Path()), kIt8CannotOpen);
    EXPECT_EQ(it8.ReadIt8(""), kIt8CannotOpen);
    // Devices never end; they are not measurement files.
    for (const char* device : {"/dev/zero", "/dev/null", "/dev/urandom"}) {
        if (std::filesystem::exists(device)) {
            EXPECT_EQ(it8.ReadIt8(device), kIt8CannotOpen) << device;
        }
    }
}

TEST(CgatsReaderFailures, HugeAnnouncedSetCountsNeedTheRowsInTheFile) {
    const std::string head = kHead;
    for (const char* sets : {"2000000000", "2147483647", "99999999999999999999"}) {
        Measured_IT8 it8;
        EXPECT_EQ(Read(it8, head + "NUMBER_OF_SETS " + sets + "\nBEGIN_DATA\n1 2 3\n2 3 4\n"), kIt8EndsInDataBlock)
            << sets;
        ExpectEmpty(it8);
        EXPECT_EQ(Read(it8, head + "NUMBER_OF_SETS " + sets + "\nBEGIN_DATA\n1 2 3\nEND_DATA\n"), kIt8TooFewSets);
    }
}

TEST(CgatsReaderFailures, TruncationAtEveryLineOfARealFile) {
    const std::string path = SystemIccDir() + "TR002.ti3";
    if (!std::filesystem::exists(path)) GTEST_SKIP() << path << " missing";
    const std::string text = ReadFile(path);
    const std::size_t endData = text.rfind("END_DATA");
    TempDir dir;
    Measured_IT8 it8;
    int lines = 0;
    for (std::size_t cut = 0; cut <= text.size(); ++cut) {
        if (cut != text.size() && text[cut] != '\n') continue;
        ++lines;
        const std::string part = text.substr(0, cut);
        const int result = it8.ReadIt8(WriteFile(dir, "cut.ti3", part));
        if (cut >= endData + 8) {
            EXPECT_EQ(result, 0) << "cut at " << cut;
            EXPECT_EQ(it8.PatchCount(), 928);
        } else {
            EXPECT_LT(result, 0) << "cut at " << cut;
            EXPECT_EQ(it8.PatchCount(), 0);
        }
    }
    EXPECT_GT(lines, 900);
}

TEST(CgatsReaderFailures, TruncationAtEveryByteOfASmallFile) {
    const std::string text = SmallCmykLabFile();
    TempDir dir;
    Measured_IT8 it8;
    for (std::size_t cut = 0; cut < text.size(); ++cut) {
        const int result = it8.ReadIt8(WriteFile(dir, "cut.it8", text.substr(0, cut)));
        // Only a cut inside the last line's line end, or after END_DATA, still gives the whole file.
        if (cut >= text.size() - 1) {
            EXPECT_EQ(result, 0);
        } else if (cut < text.size() - 9) {
            EXPECT_LT(result, 0) << "cut at " << cut;
        }
    }
}

TEST(CgatsReaderFailures, AMegabyteLineEndsTheReadableText) {
    const std::string longLine(4 << 20, 'A');
    const std::string head = kHead;
    Measured_IT8 it8;
    EXPECT_EQ(Read(it8, "CGATS.17\n# " + longLine + "\n" + SmallCmykLabFile()), kIt8NoDataBlock);
    EXPECT_EQ(Read(it8, "BEGIN_DATA_FORMAT\n" + longLine + "\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n"),
              kIt8NoFieldNames);
    EXPECT_EQ(Read(it8, head + "NUMBER_OF_SETS 2\nBEGIN_DATA\n1 2 3\n" + longLine + "\nEND_DATA\n"),
              kIt8EndsInDataBlock);
    ExpectEmpty(it8);
    // Just below the limit a line is still a line.
    const std::string wide(64 * 1024 - 10, 'B');
    EXPECT_EQ(Read(it8, head + "# " + wide + "\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3\nEND_DATA\n"), 0);
}

TEST(CgatsReaderFailures, NulAndHighBitBytesInsideTheDataBreakTheRow) {
    const std::string head = kHead;
    Measured_IT8 it8;
    EXPECT_EQ(Read(it8, head + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2" + std::string(1, '\0') + " 3\nEND_DATA\n"),
              kIt8RowFieldCount);
    EXPECT_EQ(Read(it8, head + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 \xE9 2 3\nEND_DATA\n"), kIt8RowFieldCount);
    EXPECT_EQ(Read(it8, std::string("BEGIN_DATA_FORMAT\nID CMYK_C") + '\0' +
                            " LAB_L\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3\nEND_DATA\n"),
              kIt8RowFieldCount);
    ExpectEmpty(it8);
}

TEST(CgatsReaderFailures, BinaryGarbageEndsInACode) {
    std::mt19937 random(1234);
    TempDir dir;
    Measured_IT8 it8;
    for (int round = 0; round < 20; ++round) {
        std::string bytes(1 << 16, '\0');
        for (char& b : bytes) b = static_cast<char>(random());
        if (round % 2) bytes = std::string(kHead) + "NUMBER_OF_SETS 5\nBEGIN_DATA\n" + bytes;
        EXPECT_LT(it8.ReadIt8(WriteFile(dir, "noise.it8", bytes)), 0) << round;
        ExpectEmpty(it8);
    }
    // A real profile is not a measurement file either.
    const std::string icc = SystemIccDir() + "ghostscript/default_cmyk.icc";
    if (std::filesystem::exists(icc)) {
        EXPECT_LT(it8.ReadIt8(icc), 0);
    }
}
