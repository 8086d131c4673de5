#include "resources/identity_profiles.h"

#include <cstring>
#include <initializer_list>

namespace vantrel {
namespace {

// Hosts recognise the neutral Lab-to-Lab profile by its size, so it is padded to it.
constexpr size_t kNeutral3ccSize = 714612;
// D50 as s15Fixed16Numbers, the header illuminant and the neutral profile's white.
constexpr uint32_t kD50[3] = {0x0000F6D6, 0x00010000, 0x0000D32D};
constexpr const char* kCopyright = "No copyright, use freely";

class ByteWriter {
public:
    std::vector<uint8_t> bytes;

    void U8(unsigned v) { bytes.push_back(static_cast<uint8_t>(v)); }
    void U16(unsigned v) {
        U8(v >> 8);
        U8(v);
    }
    void U32(uint32_t v) {
        U16(v >> 16);
        U16(v & 0xFFFF);
    }
    void Sig(const char* s) {
        for (int i = 0; i < 4; ++i) U8(static_cast<unsigned char>(s[i]));
    }
    // A tag element's head: its type signature and the reserved word.
    void Head(const char* type) {
        Sig(type);
        U32(0);
    }
    void Zeros(size_t n) { bytes.insert(bytes.end(), n, 0); }
    void Align4() { Zeros((4 - bytes.size() % 4) % 4); }
    void PutU32At(size_t at, uint32_t v) {
        for (int i = 0; i < 4; ++i) bytes[at + i] = static_cast<uint8_t>(v >> (24 - 8 * i));
    }
};

// 0..65535 in `entries` equal steps: an identity curve or grid axis.
uint16_t Ramp(unsigned k, unsigned entries) {
    return static_cast<uint16_t>((k * 65535u + (entries - 1) / 2) / (entries - 1));
}

// An identity lut16Type: n channels in and out, `grid` points, identity curves.
std::vector<uint8_t> IdentityMft2(unsigned channels, unsigned grid, unsigned inEntries, unsigned outEntries) {
    ByteWriter t;
    t.Head("mft2");
    t.U8(channels);
    t.U8(channels);
    t.U8(grid);
    t.U8(0);
    for (int r = 0; r < 3; ++r)
        for (int c = 0; c < 3; ++c) t.U32(r == c ? 0x00010000u : 0u);
    t.U16(inEntries);
    t.U16(outEntries);
    for (unsigned ch = 0; ch < channels; ++ch)
        for (unsigned k = 0; k < inEntries; ++k) t.U16(Ramp(k, inEntries));
    // CLUT: first input slowest, output channels innermost; output j repeats input j.
    std::vector<unsigned> index(channels, 0);
    size_t points = 1;
    for (unsigned ch = 0; ch < channels; ++ch) points *= grid;
    for (size_t p = 0; p < points; ++p) {
        for (unsigned ch = 0; ch < channels; ++ch) t.U16(Ramp(index[ch], grid));
        for (int ch = static_cast<int>(channels) - 1; ch >= 0; --ch) {
            if (++index[ch] < grid) break;
            index[ch] = 0;
        }
    }
    for (unsigned ch = 0; ch < channels; ++ch)
        for (unsigned k = 0; k < outEntries; ++k) t.U16(Ramp(k, outEntries));
    return t.bytes;
}

std::vector<uint8_t> TextDescription(const char* text) {
    ByteWriter t;
    const size_t n = std::strlen(text) + 1;
    t.Head("desc");
    t.U32(static_cast<uint32_t>(n));
    for (size_t i = 0; i < n; ++i) t.U8(static_cast<unsigned char>(text[i]));
    t.U32(0);   // Unicode language code
    t.U32(0);   // Unicode count
    t.U16(0);   // ScriptCode code
    t.U8(0);    // ScriptCode count
    t.Zeros(67);
    return t.bytes;
}

std::vector<uint8_t> Text(const char* text) {
    ByteWriter t;
    t.Head("text");
    for (const char* c = text; *c; ++c) t.U8(static_cast<unsigned char>(*c));
    t.U8(0);
    return t.bytes;
}

// An element of 32-bit words: an "XYZ " number, an empty "pseq".
std::vector<uint8_t> Words(const char* type, std::initializer_list<uint32_t> words) {
    ByteWriter t;
    t.Head(type);
    for (uint32_t w : words) t.U32(w);
    return t.bytes;
}

struct Tag {
    const char* signature;
    int element;  // index into the element list; tags naming the same element share its bytes
};

std::vector<uint8_t> Assemble(const char* deviceClass, const char* dataSpace, const char* pcs,
                              const std::vector<std::vector<uint8_t>>& elements, const std::vector<Tag>& tags,
                              size_t paddedSize) {
    ByteWriter p;
    p.U32(0);  // size, patched below
    p.Sig("vtrl");
    p.U32(0x02400000);
    p.Sig(deviceClass);
    p.Sig(dataSpace);
    p.Sig(pcs);
    p.Zeros(12);  // date and time
    p.Sig("acsp");
    p.Sig("APPL");
    p.U32(0);  // flags
    p.U32(0);  // manufacturer
    p.U32(0);  // model
    p.Zeros(8);  // attributes
    p.U32(0);  // rendering intent
    for (uint32_t v : kD50) p.U32(v);
    p.Sig("vtrl");
    p.Zeros(128 - p.bytes.size());
    p.U32(static_cast<uint32_t>(tags.size()));
    const size_t tableAt = p.bytes.size();
    p.Zeros(12 * tags.size());
    std::vector<size_t> offsets;
    for (const auto& e : elements) {
        p.Align4();
        offsets.push_back(p.bytes.size());
        p.bytes.insert(p.bytes.end(), e.begin(), e.end());
    }
    for (size_t i = 0; i < tags.size(); ++i) {
        const size_t at = tableAt + 12 * i;
        for (int c = 0; c < 4; ++c) p.bytes[at + c] = static_cast<uint8_t>(tags[i].signature[c]);
        p.PutU32At(at + 4, static_cast<uint32_t>(offsets[tags[i].element]));
        p.PutU32At(at + 8, static_cast<uint32_t>(elements[tags[i].element].size()));
    }
    p.Align4();
    if (p.bytes.size() < paddedSize) p.Zeros(paddedSize - p.bytes.size());
    p.PutU32At(0, static_cast<uint32_t>(p.bytes.size()));
    return p.bytes;
}

std::vector<uint8_t> Neutral3cc() {
    std::vector<std::vector<uint8_t>> elements = {
        TextDescription("Neutral Lab to Lab correction"),
        Text(kCopyright),
        Words("XYZ ", {kD50[0], kD50[1], kD50[2]}),
        IdentityMft2(3, 33, 511, 511),
        IdentityMft2(3, 33, 4081, 4081),
    };
    std::vector<Tag> tags = {{"desc", 0}, {"cprt", 1}, {"wtpt", 2}, {"A2B0", 3}, {"A2B1", 3},
                             {"A2B2", 3}, {"B2A0", 4}, {"B2A1", 4}, {"B2A2", 4}};
    return Assemble("spac", "Lab ", "Lab ", elements, tags, kNeutral3ccSize);
}

std::vector<uint8_t> NeutralLink(const char* space, unsigned channels, const char* description) {
    std::vector<std::vector<uint8_t>> elements = {
        TextDescription(description),
        Text(kCopyright),
        Words("pseq", {0}),  // no profiles in the sequence
        IdentityMft2(channels, 5, 256, 256),
    };
    std::vector<Tag> tags = {{"desc", 0}, {"cprt", 1}, {"pseq", 2}, {"A2B0", 3}};
    return Assemble("link", space, space, elements, tags, 0);
}

}  // namespace

const std::vector<IdentityProfileInfo>& IdentityProfiles() {
    static const std::vector<IdentityProfileInfo> profiles = {
        {102, "neutral.3cc"},
        {103, "cmyk2cmyk5neutral.mcc"},
        {104, "cmykog2cmykog5neutral.mcc"},
        {105, "cmykrgb2cmykrgb5neutral.mcc"},
    };
    return profiles;
}

std::vector<uint8_t> BuildIdentityProfile(int id) {
    switch (id) {
        case 102: return Neutral3cc();
        case 103: return NeutralLink("CMYK", 4, "Neutral CMYK device link");
        case 104: return NeutralLink("6CLR", 6, "Neutral CMYKOG device link");
        case 105: return NeutralLink("7CLR", 7, "Neutral CMYKRGB device link");
        default: return {};
    }
}

}  // namespace vantrel
