#pragma once

namespace vantrel {

// Cube roots of k / 1024 for k = 0..1024 in single precision, plus a guard entry of 1.0.
constexpr int kCubeRootEntries = 1026;
extern const float kCubeRootTable[kCubeRootEntries];

}  // namespace vantrel
