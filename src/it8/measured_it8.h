#pragma once

namespace vantrel {

// One IT8/CGATS measurement file in memory. The reader comes with the measurement issue.
class Measured_IT8 {
public:
    Measured_IT8() = default;
    Measured_IT8(const Measured_IT8&) = delete;
    Measured_IT8& operator=(const Measured_IT8&) = delete;
};

}  // namespace vantrel
