#include "interface/device_conversion.h"

#include "eval/forward.h"
#include "interface/host_number.h"
#include "interface/tool_object.h"

namespace vantrel {

int ConvertDeviceRecords(CIterativtoolDlg& tool, const char* profile, int count, const int* in, int* lab,
                         int* xyz, DeviceRecord kind) {
    if (!profile || !*profile) return -1;
    if (count > 0 && (!in || !lab || !xyz)) return -1;
    tool.m_RefName = profile;
    tool.LoadRefProfile();
    CProfil& ref = *tool.m_Refprof;

    const int channels = kind == DeviceRecord::Cmyk ? 4 : kind == DeviceRecord::Rgb ? 3 : 7;
    const double scale = kind == DeviceRecord::Rgb ? 1.0 : kPercentToDevice;
    for (int i = 0; i < count; ++i) {
        // Twenty entries: the multi-colourant evaluation reads them all.
        double values[CProfil::kEvalSize] = {};
        for (int c = 0; c < channels; ++c) values[c] = in[channels * i + c] * scale;
        switch (kind) {
            case DeviceRecord::Cmyk: CmykToLab(ref, values); break;
            case DeviceRecord::Rgb: RgbToLab(ref, values); break;
            case DeviceRecord::Cmykrgb: MultiToLab(ref, values); break;
        }
        const double L = values[0] / kLightnessScale;
        lab[3 * i] = ToHostInt(L);
        lab[3 * i + 1] = ToHostInt(values[1]);
        lab[3 * i + 2] = ToHostInt(values[2]);
        const XYZ XYZ = tool.LabToXYZ(L, values[1], values[2]);
        xyz[3 * i] = ToHostInt(XYZ.X);
        xyz[3 * i + 1] = ToHostInt(XYZ.Y);
        xyz[3 * i + 2] = ToHostInt(XYZ.Z);
    }
    ref.Release();
    return 0;
}

}  // namespace vantrel
