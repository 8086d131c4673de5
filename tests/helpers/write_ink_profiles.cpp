// Writes the ink-model test profiles into a folder, for the tests that run outside the test
// binary (the Windows comparison):
//   vantrel_ink_profiles DIR     (writes DIR/ink-7CLR.icc and DIR/ink-CMYK.icc, once)
#include <cstdio>
#include <filesystem>
#include <string>

#include "helpers/multi_ink_profiles.h"

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: vantrel_ink_profiles DIR\n");
        return 2;
    }
    using vantrel::test::InkSet;
    for (InkSet set : {InkSet::kCmykRGB, InkSet::kCmyk}) {
        const std::string path = std::string(argv[1]) + "/ink-" + vantrel::test::InkColourSpace(set) + ".icc";
        if (std::filesystem::exists(path)) continue;
        const std::string part = path + ".tmp";
        if (!vantrel::test::multi_ink::WriteProfile(set, part)) {
            std::fprintf(stderr, "vantrel_ink_profiles: cannot write %s\n", path.c_str());
            return 1;
        }
        std::filesystem::rename(part, path);
    }
    return 0;
}
