#pragma once

namespace vantrel {

// One ICC profile in memory, with a device-to-PCS (0) and a PCS-to-device (1) direction.
// The reader and the table layout come with the ICC reader.
class CProfil {
public:
    // The precision code that marks a profile holding no tables.
    static constexpr int kReleasedMarker = -55;

    CProfil() = default;
    ~CProfil() { Release(); }
    CProfil(const CProfil&) = delete;
    CProfil& operator=(const CProfil&) = delete;

    void MarkReleased() { precision_[0] = kReleasedMarker; }
    bool HoldsTables() const { return precision_[0] != kReleasedMarker; }
    void Release() { precision_[0] = kReleasedMarker; }

private:
    int precision_[2] = {0, 0};
};

}  // namespace vantrel
