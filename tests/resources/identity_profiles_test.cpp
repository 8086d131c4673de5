// The embedded identity profiles are the identity for lcms2: the Lab profile table by table, the
// device links as transforms. (dllInit's tests check the files and the Lab profile's size.)
#include <gtest/gtest.h>

#include <lcms2.h>

#include <functional>
#include <memory>
#include <random>
#include <vector>

#include "resources/identity_profiles.h"

using vantrel::BuildIdentityProfile;

namespace {

using Profile = std::unique_ptr<void, decltype(&cmsCloseProfile)>;
Profile Open(const std::vector<uint8_t>& bytes) {
    return Profile(cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size())), &cmsCloseProfile);
}

// The largest difference between the 16-bit values that go in and those that come out, over the
// two ends and random values.
int LargestDeviation(int channels, const std::function<void(const uint16_t*, uint16_t*)>& apply) {
    std::mt19937 random(7);
    std::uniform_int_distribution<int> value(0, 65535);
    std::vector<uint16_t> in(static_cast<size_t>(channels)), out(static_cast<size_t>(channels));
    int worst = 0;
    for (int n = 0; n < 5000; ++n) {
        for (uint16_t& v : in) v = static_cast<uint16_t>(n < 2 ? n * 65535 : value(random));
        apply(in.data(), out.data());
        for (size_t c = 0; c < in.size(); ++c) worst = std::max(worst, std::abs(int{in[c]} - int{out[c]}));
    }
    return worst;
}

}  // namespace

TEST(IdentityProfiles, Neutral3ccIsTheIdentityForLcms) {
    Profile neutral = Open(BuildIdentityProfile(102));
    ASSERT_NE(neutral, nullptr);
    EXPECT_EQ(cmsGetDeviceClass(neutral.get()), cmsSigColorSpaceClass);
    EXPECT_EQ(cmsGetColorSpace(neutral.get()), cmsSigLabData);
    for (cmsTagSignature tag : {cmsSigAToB0Tag, cmsSigAToB1Tag, cmsSigAToB2Tag, cmsSigBToA0Tag, cmsSigBToA1Tag, cmsSigBToA2Tag}) {
        auto* pipeline = static_cast<cmsPipeline*>(cmsReadTag(neutral.get(), tag));
        ASSERT_NE(pipeline, nullptr);
        EXPECT_LE(LargestDeviation(3, [pipeline](const uint16_t* in, uint16_t* out) { cmsPipelineEval16(in, out, pipeline); }), 1);
    }
    EXPECT_TRUE(BuildIdentityProfile(101).empty());
}

TEST(IdentityProfiles, DeviceLinksAreTheIdentityForLcms) {
    struct Link {
        int id, channels;
        cmsColorSpaceSignature space;
        cmsUInt32Number format;
    } links[] = {
        {103, 4, cmsSigCmykData, TYPE_CMYK_16},
        {104, 6, cmsSig6colorData, COLORSPACE_SH(PT_MCH6) | CHANNELS_SH(6) | BYTES_SH(2)},
        {105, 7, cmsSig7colorData, COLORSPACE_SH(PT_MCH7) | CHANNELS_SH(7) | BYTES_SH(2)},
    };
    for (const Link& link : links) {
        Profile profile = Open(BuildIdentityProfile(link.id));
        ASSERT_NE(profile, nullptr) << link.id;
        EXPECT_EQ(cmsGetDeviceClass(profile.get()), cmsSigLinkClass);
        EXPECT_EQ(cmsGetColorSpace(profile.get()), link.space);
        cmsHTRANSFORM t = cmsCreateTransform(profile.get(), link.format, nullptr, link.format, INTENT_PERCEPTUAL,
                                             cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
        ASSERT_NE(t, nullptr) << link.id;
        EXPECT_LE(LargestDeviation(link.channels, [t](const uint16_t* in, uint16_t* out) { cmsDoTransform(t, in, out, 1); }),
                  1)
            << link.id;
        cmsDeleteTransform(t);
    }
}
