#include <gtest/gtest.h>

#include <lcms2.h>

#include <random>
#include <vector>

#include "resources/identity_profiles.h"

using vantrel::BuildIdentityProfile;

namespace {

struct LcmsProfile {
    cmsHPROFILE h;
    explicit LcmsProfile(const std::vector<uint8_t>& bytes)
        : h(cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size()))) {}
    ~LcmsProfile() {
        if (h) cmsCloseProfile(h);
    }
};

uint32_t BigEndian32(const std::vector<uint8_t>& b, size_t at) {
    return uint32_t{b[at]} << 24 | uint32_t{b[at + 1]} << 16 | uint32_t{b[at + 2]} << 8 | b[at + 3];
}

// Pushes random 16-bit values through a 16-bit transform of `channels` channels and
// returns the largest difference between what went in and what came out.
int LargestDeviation(cmsHTRANSFORM transform, int channels) {
    std::mt19937 random(7);
    std::uniform_int_distribution<int> value(0, 65535);
    int worst = 0;
    std::vector<uint16_t> in(channels), out(channels);
    for (int n = 0; n < 5000; ++n) {
        for (int c = 0; c < channels; ++c) in[c] = static_cast<uint16_t>(n < 2 ? n * 65535 : value(random));
        cmsDoTransform(transform, in.data(), out.data(), 1);
        for (int c = 0; c < channels; ++c) worst = std::max(worst, std::abs(int{in[c]} - int{out[c]}));
    }
    return worst;
}

}  // namespace

TEST(IdentityProfiles, HeadersNameTheirClassAndSpaces) {
    struct Want {
        int id;
        const char *deviceClass, *space;
    } wants[] = {{102, "spac", "Lab "}, {103, "link", "CMYK"}, {104, "link", "6CLR"}, {105, "link", "7CLR"}};
    for (const Want& want : wants) {
        const auto bytes = BuildIdentityProfile(want.id);
        ASSERT_GT(bytes.size(), 132u);
        EXPECT_EQ(BigEndian32(bytes, 0), bytes.size());
        EXPECT_EQ(BigEndian32(bytes, 8), 0x02400000u);
        EXPECT_EQ(std::string(bytes.begin() + 12, bytes.begin() + 16), want.deviceClass);
        EXPECT_EQ(std::string(bytes.begin() + 16, bytes.begin() + 20), want.space);
        EXPECT_EQ(std::string(bytes.begin() + 20, bytes.begin() + 24), want.space);
        EXPECT_EQ(std::string(bytes.begin() + 36, bytes.begin() + 40), "acsp");
    }
    EXPECT_EQ(BuildIdentityProfile(102).size(), 714612u);
    EXPECT_TRUE(BuildIdentityProfile(101).empty());
}

TEST(IdentityProfiles, Neutral3ccTablesAreTheIdentityForLcms) {
    LcmsProfile neutral(BuildIdentityProfile(102));
    ASSERT_NE(neutral.h, nullptr);
    EXPECT_EQ(cmsGetDeviceClass(neutral.h), cmsSigColorSpaceClass);
    // Each table as lcms decodes it, code value in, code value out.
    for (cmsTagSignature tag : {cmsSigAToB0Tag, cmsSigAToB1Tag, cmsSigAToB2Tag, cmsSigBToA0Tag, cmsSigBToA1Tag,
                                cmsSigBToA2Tag}) {
        auto* pipeline = static_cast<cmsPipeline*>(cmsReadTag(neutral.h, tag));
        ASSERT_NE(pipeline, nullptr);
        std::mt19937 random(11);
        std::uniform_int_distribution<int> value(0, 65535);
        int worst = 0;
        for (int n = 0; n < 5000; ++n) {
            cmsUInt16Number in[3], out[3];
            for (int c = 0; c < 3; ++c) in[c] = static_cast<cmsUInt16Number>(n < 2 ? n * 65535 : value(random));
            cmsPipelineEval16(in, out, pipeline);
            for (int c = 0; c < 3; ++c) worst = std::max(worst, std::abs(int{in[c]} - int{out[c]}));
        }
        EXPECT_LE(worst, 1);
    }
    // Through a whole transform, Lab in and Lab out, colours come back where they were.
    cmsHPROFILE lab = cmsCreateLab4Profile(nullptr);
    cmsHTRANSFORM t = cmsCreateTransform(neutral.h, TYPE_Lab_DBL, lab, TYPE_Lab_DBL, INTENT_RELATIVE_COLORIMETRIC,
                                         cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
    ASSERT_NE(t, nullptr);
    for (cmsCIELab in : {cmsCIELab{50, 0, 0}, cmsCIELab{90, -40, 60}, cmsCIELab{20, 70, -90}}) {
        cmsCIELab out;
        cmsDoTransform(t, &in, &out, 1);
        EXPECT_LT(cmsDeltaE(&in, &out), 0.05);
    }
    cmsDeleteTransform(t);
    cmsCloseProfile(lab);
}

TEST(IdentityProfiles, DeviceLinksAreTheIdentityForLcms) {
    struct Link {
        int id, channels;
        cmsUInt32Number format;
    } links[] = {
        {103, 4, TYPE_CMYK_16},
        {104, 6, COLORSPACE_SH(PT_MCH6) | CHANNELS_SH(6) | BYTES_SH(2)},
        {105, 7, COLORSPACE_SH(PT_MCH7) | CHANNELS_SH(7) | BYTES_SH(2)},
    };
    for (const Link& link : links) {
        LcmsProfile profile(BuildIdentityProfile(link.id));
        ASSERT_NE(profile.h, nullptr) << link.id;
        EXPECT_EQ(cmsGetDeviceClass(profile.h), cmsSigLinkClass);
        cmsHTRANSFORM t = cmsCreateTransform(profile.h, link.format, nullptr, link.format, INTENT_PERCEPTUAL,
                                             cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
        ASSERT_NE(t, nullptr) << link.id;
        EXPECT_LE(LargestDeviation(t, link.channels), 1) << link.id;
        cmsDeleteTransform(t);
    }
}
