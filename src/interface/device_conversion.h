#pragma once

namespace vantrel {

class CIterativtoolDlg;

// The device values a conversion export takes, and how they reach the 0..255 device scale.
enum class DeviceRecord {
    Cmyk,     // 4 ints in percent
    Rgb,      // 3 ints on 0..255, used as they are
    Cmykrgb,  // 7 ints in percent
};

// Converts count records of device values through the named profile (loaded into the
// reference slot and released again) into Lab and XYZ, each x 1000. -1 when the name is
// null or empty, or an array the records need is missing; else 0.
int ConvertDeviceRecords(CIterativtoolDlg& tool, const char* profile, int count, const int* in, int* lab,
                         int* xyz, DeviceRecord kind);

}  // namespace vantrel
