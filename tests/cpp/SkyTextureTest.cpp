// The sky texture: its three record versions, its sun, the shared default sun
// (per conversion and per thread) and its XML with the document's sun map. Every
// test starts from a pristine default sun (FreshContextPerTest), as every
// conversion does.
#include "TrimSupport.hpp"

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/textures/SkyTexture.hpp>

#include <cctype>
#include <thread>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

SunLight& sunOf(const SkyTexture& sky) { return dynamic_cast<SunLight&>(*sky.sun); }

// The plain numbers of a sky record from up_vector to identifier.
Image& skyFields(Image& image, const std::string& identifier) {
    return image.f32({0, 1, 0, 0.5f, 4, 2.5f, 1.5f, 2, 60, 160, 0.3f}).i32(400).i32(900).i32(16).flag(false).flag(true)
        .text(identifier);
}

// A sky holds the values of the image above.
void expectFieldsOfTheImage(const SkyTexture& s) {
    EXPECT_EQ(std::tuple(s.up_vector, s.shadowBias, s.turbidity, s.water_vapour, s.intensity_multiplier,
                         s.size_multiplier, s.photon_radius, s.photon_emit_distance, s.ozone),
              std::tuple(Vector{0, 1, 0}, 0.5f, 4.0f, 2.5f, 1.5f, 2.0f, 60.0f, 160.0f, 0.3f));
    EXPECT_EQ(std::tuple(s.photonSubdivs, s.causticSubdivs, s.shadow_subdivs, s.flag1, s.flag2),
              std::tuple(400, 900, 16, false, true));
}

} // namespace

TEST(Sky, NewSkiesShareTheDefaultSunAndHaveTheirOwnIdentifiers) {
    const auto defaultSun = sharedDefaultSun(); // (its identifier: the lookalike test)
    SkyTexture a, b;
    EXPECT_TRUE(a.sun == defaultSun && b.sun == defaultSun);
    EXPECT_NE(a.identifier, b.identifier);
    EXPECT_EQ(a.identifier.size(), 36u);
    for (char c : a.identifier) EXPECT_FALSE(std::isupper(static_cast<unsigned char>(c))) << a.identifier;
}

TEST(Sky, Version1HoldsOnlyTheSun) {
    SunLight stored("Noon", "{0A0B}");
    stored.turbidity = 5;
    SkyTexture read;
    ASSERT_TRUE(readInto(read, Image{}.version(0, 1).flag(true).append(recordOf(stored)).bytes));
    ASSERT_NE(read.sun.get(), sharedDefaultSun().get());
    EXPECT_TRUE(read.sun->isEqual(boost::make_shared<SunLight>(stored)));
    EXPECT_EQ(read.turbidity, 3.0f);

    // Without a stored sun the sky keeps the default sun.
    SkyTexture withoutSun;
    ASSERT_TRUE(readInto(withoutSun, Image{}.version(0, 1).flag(false).bytes));
    EXPECT_EQ(withoutSun.sun.get(), sharedDefaultSun().get());
}

TEST(Sky, Versions2And3) {
    // Version 3: own sun, the fields, the keyed placement, the default sun, whether
    // the sky's sun is the default sun. Read and written back byte for byte.
    SunLight own("Noon", "{0A0B}");
    const ByteVector defaultSun = recordOf(*sharedDefaultSun());
    AnimatedTransform placement;
    placement.setValue(Transform{Matrix::identity(), Vector{1, 2, 3}}, 4.0);
    Image v3 = Image{}.version(0, 3).flag(true).append(recordOf(own));
    skyFields(v3, "0f0e").put(placement).append(defaultSun).flag(false);
    SkyTexture read;
    ASSERT_TRUE(readInto(read, v3.bytes));
    expectFieldsOfTheImage(read);
    EXPECT_EQ(read.identifier, "0f0e");
    EXPECT_TRUE(read.sun->isEqual(boost::make_shared<SunLight>(own)));
    EXPECT_EQ(recordOf(read), v3.bytes);

    // Version 2: a plain transform instead of the keyed one, no default sun.
    const Transform placed{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 1}}}, Vector{1, 2, 3}};
    Image v2 = Image{}.version(0, 2).flag(false).put(placed);
    skyFields(v2, "ABCDEF01-0000-0000-0000-000000000000");
    ASSERT_TRUE(readInto(read, v2.bytes));
    EXPECT_EQ(read.transform.keyCount(), 1);
    EXPECT_EQ(read.transform.valueAt(0), placed);
    expectFieldsOfTheImage(read);
    EXPECT_EQ(read.identifier, "ABCDEF01-0000-0000-0000-000000000000");
    // Written back as version 3 with the default sun as its sun.
    placement = AnimatedTransform();
    placement.setValue(placed, 0.0);
    v3 = Image{}.version(0, 3).flag(true).append(defaultSun);
    skyFields(v3, "ABCDEF01-0000-0000-0000-000000000000").put(placement).append(defaultSun).flag(true);
    EXPECT_EQ(recordOf(read), v3.bytes);
}

TEST(Sky, Version3OverwritesTheSharedDefaultSunAndCanPointAtIt) {
    // A record written while the default sun held other numbers.
    sharedDefaultSun()->turbidity = 7.5f;
    SkyTexture writer;
    const ByteVector bytes = recordOf(writer);
    EXPECT_EQ(bytes.back(), 1); // its sun is the default sun

    const ConversionContext fresh1;
    EXPECT_EQ(sharedDefaultSun()->turbidity, 3.0f);
    SkyTexture read;
    ASSERT_TRUE(readInto(read, bytes));
    EXPECT_EQ(sharedDefaultSun()->turbidity, 7.5f);
    EXPECT_EQ(read.sun.get(), sharedDefaultSun().get());

    // Within one conversion every later sky sees the overwritten default sun ...
    SkyTexture later;
    EXPECT_EQ(sunOf(later).turbidity, 7.5f);
    // ... and the next conversion starts from a pristine one.
    const ConversionContext fresh2;
    SkyTexture next;
    EXPECT_EQ(sunOf(next).turbidity, 3.0f);
    EXPECT_NE(next.sun.get(), read.sun.get());
    EXPECT_EQ(sunOf(read).turbidity, 7.5f);
}

TEST(Sky, DefaultSunBelongsToItsThread) {
    sharedDefaultSun()->turbidity = 9;
    float seen = 0;
    const void* seenSun = nullptr;
    std::thread other([&] {
        SkyTexture sky;
        seen = sunOf(sky).turbidity;
        seenSun = sky.sun.get();
    });
    other.join();
    EXPECT_EQ(seen, 3.0f);
    EXPECT_NE(seenSun, sharedDefaultSun().get());
    EXPECT_EQ(sharedDefaultSun()->turbidity, 9.0f);
}

// A sun with the default sun's identifier, in any case, is stored as the default sun.
TEST(Sky, ALookalikeOfTheDefaultSunIsStoredAsTheDefaultSunInBothPlaces) {
    // Found by fuzzing: the own sun record held the lookalike's numbers while the
    // record pointed at the default sun, so a saved sky read back to other numbers.
    SkyTexture sky;
    sky.sun = boost::make_shared<SunLight>("Copy", "{d3be9766-e4aa-418B-81a9-23414a2ba98d}");
    sunOf(sky).turbidity = 9.0f;
    const ByteVector bytes = recordOf(sky);
    EXPECT_EQ(bytes.back(), 1);
    EXPECT_EQ(sky.sun, sharedDefaultSun());
    SkyTexture read;
    ASSERT_TRUE(readInto(read, bytes));
    EXPECT_EQ(sunOf(read).turbidity, 3.0f);
    EXPECT_EQ(recordOf(read), bytes);

    // Another sun is the sky's own; a sky without a sun stores none.
    SkyTexture other, bare;
    other.sun = boost::make_shared<SunLight>();
    EXPECT_EQ(recordOf(other).back(), 0);
    bare.sun.reset();
    EXPECT_EQ(recordOf(bare)[4], 0);
}

TEST(Sky, AFailedSunReadIsIgnoredButOtherFailuresAreNot) {
    // The sun record carries a version no sun knows; the sky reads on.
    SkyTexture sky;
    QuickArchive ar;
    ASSERT_TRUE(readInto(sky, Image{}.version(0, 1).flag(true).version(0, 9).bytes, &ar));
    EXPECT_FALSE(ar.failed());
    EXPECT_NE(sky.sun, sharedDefaultSun());
    // A version-3 record whose stored default sun is refused fails.
    sky.sun.reset();
    const ByteVector bytes = recordOf(sky);
    expectReadFails(sky, withVersion(bytes, 0, 9, bytes.size() - 1 - recordOf(*sharedDefaultSun()).size()),
                    "default sun");
    for (std::uint16_t refused : {0, 4})
        expectReadFails(sky, Image{}.version(0, refused).bytes, "unknown sky texture version");
}

TEST(Sky, CopiesGetNewIdentifiersAndComparisonIgnoresTheirCase) {
    const auto sky = boost::make_shared<SkyTexture>();
    sky->sun = boost::make_shared<SunLight>("Noon", "{0A0B}");
    const TexturePtr a = sky->clone();
    EXPECT_FALSE(a->isEqual(sky->clone()) || a->isEqual(sky));
    EXPECT_NE(static_cast<SkyTexture&>(*a).sun, sky->sun);

    std::string upper = sky->identifier;
    for (char& c : upper) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    static_cast<SkyTexture&>(*a).identifier = upper;
    EXPECT_TRUE(a->isEqual(sky));
    static_cast<SkyTexture&>(*a).transform.setValue(Transform::identity(), 5.0);
    EXPECT_FALSE(a->isEqual(sky));
}

// --- XML ---

// A sky writes its sun's asset (at the top of the document) before its own; one
// sun asset per identifier in a document, the next one named "/SunLight1".
TEST(SkyXml, SkyWithItsSunAndOneSunAssetPerIdentifier) {
    SkyTexture sky;
    SkyTexture bare;
    bare.sun.reset();
    expectGolden(xmlOf(sky, "/Sky/environment") + xmlOf(bare, "/Sky/environment"), "sky_with_and_without_sun.xml");

    SkyTexture first;
    first.sun = boost::make_shared<SunLight>("Noon", "{0A0B}");
    SkyTexture second; // another object with the same identifier
    second.sun = boost::make_shared<SunLight>("Noon again", "{0A0B}");
    SkyTexture third;
    third.sun = boost::make_shared<SunLight>("Dusk", "{0C0D}");
    std::string out;
    AssetXmlWriter writer(out);
    first.writeXml(writer, "/a/sky");
    second.writeXml(writer, "/b/sky");
    third.writeXml(writer, "/c/sky");
    expectGolden(out, "sky_suns_by_identifier.xml");
}
