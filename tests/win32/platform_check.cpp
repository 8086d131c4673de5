// The Windows side of the platform layer that the DLL's exports do not show: the user's
// number format. Checked under Wine, once per regional setting (run_wine.sh). The file is Windows-only: in the Linux test binary it is empty.
//   vantrel_win32_platform_check.exe EXPECTED_DECIMAL_POINT
#if defined(_WIN32)

#include <cstdio>
#include <cstring>
#include <locale>
#include <sstream>

#include "it8/number_locale.h"
#include "support/platform.h"

namespace {

int g_failed = 0;

void Expect(bool ok, const char* what) {
    if (!ok) {
        std::printf("FAILED: %s\n", what);
        ++g_failed;
    }
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2 || std::strlen(argv[1]) != 1) {
        std::fprintf(stderr, "usage: %s EXPECTED_DECIMAL_POINT\n", argv[0]);
        return 2;
    }
    const char expected = argv[1][0];
    Expect(vantrel::platform::UserDecimalPoint() == expected, "decimal point of the regional settings");

    // Measurement files take the separator and never group digits.
    std::ostringstream text;
    text.imbue(vantrel::MeasurementNumberLocale());
    text << 1617.25;
    const std::string want = std::string("1617") + expected + "25";
    Expect(text.str() == want, "measurement numbers written with that separator and no grouping");

    std::printf("platform check (decimal point '%c'): %s\n", expected, g_failed ? "failed" : "passed");
    return g_failed ? 1 : 0;
}

#endif
