#pragma once
// The profile every benchmark measures: the Argyll-built FOGRA39 fixture (make bench builds it).

#include <filesystem>
#include <string>

namespace vantrel::bench {

// Its path, or empty when the fixture has not been built.
inline std::string Fogra() {
    const std::string path = std::string(VANTREL_FIXTURE_DIR) + "/FOGRA39L.icc";
    return std::filesystem::exists(path) ? path : std::string();
}

}  // namespace vantrel::bench
