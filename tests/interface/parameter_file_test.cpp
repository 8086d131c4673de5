// The parameter file's line rules, and numbers as the host receives them.
#include <gtest/gtest.h>

#include <climits>
#include <cmath>
#include <string>
#include <vector>

#include "helpers/cgats_files.h"
#include "interface/host_number.h"
#include "interface/parameter_file.h"

using namespace vantrel;

TEST(ParameterFile, LineRules) {
    std::string twentyFive;
    std::vector<int> first20;
    for (int i = 1; i <= 25; ++i) twentyFive += std::to_string(i) + "\n";
    for (int i = 1; i <= 20; ++i) first20.push_back(i);
    const struct {
        const char* what;
        std::string text;
        std::vector<int> stored;
    } cases[] = {
        {"twenty-five numbers fill twenty", twentyFive, first20},
        {"comments, empty lines and words are skipped; numbers truncate toward zero",
         "# minimum tone values\n\n\r\n12.9\nyellow\n-3.7\n  5\n", {12, -3, 5}},
        // An over-long line is one (clamped) value, not forty pieces.
        {"long lines and binary bytes",
         "7" + std::string(10000, '9') + "\n" + std::string("\x01\xff\x00\x80\n", 5) + "4\n1e300\n",
         {INT_MAX, 4, INT_MAX}},
    };
    test::TempDir dir;
    for (const auto& c : cases) {
        std::vector<int> values(20, 0);
        EXPECT_EQ(ReadParameterFile(test::WriteText(dir, "params.txt", c.text), values.data(), 20),
                  static_cast<int>(c.stored.size()))
            << c.what;
        std::vector<int> want = c.stored;
        want.resize(20, 0);
        EXPECT_EQ(values, want) << c.what;
    }
    std::vector<int> values(20, 0);
    EXPECT_EQ(ReadParameterFile("/nonexistent/vantrelparams.txt", values.data(), 20), 0);
    EXPECT_EQ(values, std::vector<int>(20, 0));
}

TEST(HostNumbers, RoundHalfUpThenTruncateTowardZero) {
    EXPECT_EQ(ToHostInt(-2.5), -2499);
    EXPECT_EQ(ToHostInt(2.5), 2500);
    EXPECT_EQ(ToHostInt(-0.0004), 0);
    EXPECT_EQ(ToHostInt(-1.2345), -1234);
    EXPECT_EQ(ToHostIntTruncated(1.2349), 1234);
    EXPECT_EQ(ToHostIntTruncated(-1.2349), -1234);
    EXPECT_EQ(ToHostInt(1e300), INT_MAX);
    EXPECT_EQ(ToHostInt(-1e300), INT_MIN);
    EXPECT_EQ(ToHostInt(std::nan("")), 0);
}
