// Bringing a measurement and its reference into one patch order: each patch of one file is looked
// up by its device values in the other, which is rewritten in that order.
#include <cmath>
#include <memory>
#include <string>
#include <vector>

#include "analysis/device_index.h"
#include "analysis/it8_kind.h"
#include "interface/tool_object.h"
#include "it8/patch_record.h"

namespace vantrel {
namespace {

constexpr const char* kAlignedSuffix = ".$$$";
constexpr const char* kScanValues = "Scan IT8 for Values...";
constexpr const char* kFinished = "Finished ...";

// Rewrites `scanned` in the order of `order`: record i holds the whole-number device values of
// patch i of `order` and the colour of the first patch of `scanned` with the same values (zeros
// when none has them). The file goes to name + ".$$$", which then becomes the slot's file.
// Both files have one device kind (the caller checks); an empty `order` leaves everything as is.
void AlignInOrderOf(const CIterativtoolDlg& tool, const Measured_IT8& order, std::unique_ptr<Measured_IT8>& scanned,
                    std::string& scannedName, Lab& scannedWhite) {
    const int n = order.PatchCount();
    if (n < 1) return;
    const It8Kind kind = ProbeIt8Kind(*scanned, kScanProbePatch);
    const int channels = ComparedChannels(kind);
    const DevicePatchIndex index(*scanned, kind);

    std::vector<PatchRecord> records(static_cast<std::size_t>(n));
    records[0].kind = static_cast<uint32_t>(channels == 0 ? 4 : channels);
    // One report per looked-up patch; once the host asks to stop, the remaining patches find nothing.
    bool cancelled = false;
    tool.Progress(kScanValues, 0, n);
    for (int i = 0; i < n; ++i) {
        if (!cancelled && tool.Progress(kScanValues, i + 1, n) != 0) cancelled = true;
        const DeviceKey target = PatchDevice(order, kind, i);
        const int found = cancelled ? -1 : index.Find(target);
        const Lab lab = found >= 0 ? tool.PatchLab(*scanned, found, kind.colourFromXyz) : Lab{};

        PatchRecord& record = records[static_cast<std::size_t>(i)];
        record.sampleNumber = static_cast<uint32_t>(i + 1);
        for (int c = 0; c < channels; ++c) record.device[c] = std::trunc(target[static_cast<std::size_t>(c)] + 0.5);
        tool.SetRecordColour(record, lab);
    }
    tool.Progress(kFinished, 1, 1);

    const std::string name = scannedName + kAlignedSuffix;
    scanned->WriteIt8(name, records, n, 0, 0, 0);
    scannedName = name;
    scanned = std::make_unique<Measured_IT8>();
    scanned->ReadIt8(name);
    scannedWhite = tool.ScanIt8ForWhitePoint(*scanned);
}

}  // namespace

void CIterativtoolDlg::AlignReferenceToMeasurement() {
    AlignInOrderOf(*this, *m_MeasIT8, m_ReferenceIT8, m_ReferenceIT8Name, m_RefWhite);
}

void CIterativtoolDlg::AlignMeasurementToReference() {
    AlignInOrderOf(*this, *m_ReferenceIT8, m_MeasIT8, m_MeasIT8Name, m_MeasWhite);
}

}  // namespace vantrel
