#include <gtest/gtest.h>

#include <array>
#include <fstream>
#include <string>

#include "helpers/test_paths.h"
#include "interface/host_number.h"
#include "interface/parameter_file.h"

using vantrel::ReadParameterFile;
using vantrel::test::TempDir;

namespace {

std::array<int, 20> Read(const std::string& content, int* stored = nullptr) {
    TempDir dir;
    std::ofstream(dir.File("params.txt"), std::ios::binary) << content;
    std::array<int, 20> values{};
    const int n = ReadParameterFile(dir.File("params.txt"), values.data(), 20);
    if (stored) *stored = n;
    return values;
}

}  // namespace

TEST(ParameterFile, TwentyFiveNumbersFillTwenty) {
    std::string content;
    for (int i = 1; i <= 25; ++i) content += std::to_string(i) + "\n";
    int stored = 0;
    auto values = Read(content, &stored);
    EXPECT_EQ(stored, 20);
    EXPECT_EQ(values[0], 1);
    EXPECT_EQ(values[19], 20);
}

TEST(ParameterFile, CommentsEmptyLinesAndWordsAreSkipped) {
    int stored = 0;
    auto values = Read("# minimum tone values\n\n\r\n12.9\nyellow\n-3.7\n  5\n", &stored);
    EXPECT_EQ(stored, 3);
    EXPECT_EQ(values[0], 12);
    EXPECT_EQ(values[1], -3);
    EXPECT_EQ(values[2], 5);
    EXPECT_EQ(values[3], 0);
}

TEST(ParameterFile, MissingFileLeavesZeros) {
    std::array<int, 20> values{};
    EXPECT_EQ(ReadParameterFile("/nonexistent/vantrelparams.txt", values.data(), 20), 0);
    EXPECT_EQ(values, (std::array<int, 20>{}));
}

TEST(ParameterFile, LongLinesAndBinaryBytesStayInBounds) {
    int stored = 0;
    const std::string longLine = "7" + std::string(10000, '9') + "\n";
    std::string binary("\x01\xff\x00\x80\n", 5);
    auto values = Read(longLine + binary + "4\n" + "1e300\n", &stored);
    // The long line is one (clamped) value, not forty pieces.
    EXPECT_EQ(stored, 3);
    EXPECT_EQ(values[0], INT32_MAX);
    EXPECT_EQ(values[1], 4);
    EXPECT_EQ(values[2], INT32_MAX);
}

TEST(HostNumbers, RoundHalfUpThenTruncateTowardZero) {
    EXPECT_EQ(vantrel::ToHostInt(-2.5), -2499);
    EXPECT_EQ(vantrel::ToHostInt(2.5), 2500);
    EXPECT_EQ(vantrel::ToHostInt(-0.0004), 0);
    EXPECT_EQ(vantrel::ToHostInt(-1.2345), -1234);
    EXPECT_EQ(vantrel::ToHostIntTruncated(1.2349), 1234);
    EXPECT_EQ(vantrel::ToHostIntTruncated(-1.2349), -1234);
    EXPECT_EQ(vantrel::ToHostInt(1e300), INT32_MAX);
}
