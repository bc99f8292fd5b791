// The sky texture: its three record versions, its sun, the shared default sun
// (per conversion and per thread) and its XML with the document's sun map.
#include "TextureTestSupport.hpp"

#include "textures/SkyTexture.hpp"

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <cctype>
#include <string>
#include <thread>

using namespace OrvexKavorCore;
using namespace texturetest;

namespace {

// Every sky test starts from a pristine default sun, as every conversion does.
class Sky : public ::testing::Test {
protected:
    void SetUp() override { resetSharedDefaultSun(); }
};
using SkyXml = Sky;

SunLight& sunOf(const SkyTexture& sky) { return dynamic_cast<SunLight&>(*sky.sun); }

// The plain numbers of a sky record from up_vector to identifier.
Image& skyFields(Image& image, const std::string& identifier) {
    return image.f32({0, 1, 0})
        .f32({0.5f, 4, 2.5f, 1.5f, 2, 60, 160, 0.3f})
        .i32(400)
        .i32(900)
        .i32(16)
        .flag(false)
        .flag(true)
        .text(identifier);
}

void expectFieldsOfTheImage(const SkyTexture& sky) {
    EXPECT_EQ(sky.up_vector, (Vector{0, 1, 0}));
    EXPECT_EQ(sky.shadowBias, 0.5f);
    EXPECT_EQ(sky.turbidity, 4.0f);
    EXPECT_EQ(sky.ozone, 0.3f);
    EXPECT_EQ(sky.photonSubdivs, 400);
    EXPECT_EQ(sky.shadow_subdivs, 16);
    EXPECT_FALSE(sky.flag1);
    EXPECT_TRUE(sky.flag2);
}

} // namespace

TEST_F(Sky, NewSkiesShareTheDefaultSunAndHaveTheirOwnIdentifiers) {
    const auto defaultSun = sharedDefaultSun();
    EXPECT_EQ(defaultSun->name, "Default");
    EXPECT_EQ(defaultSun->identifier, "{D3BE9766-E4AA-418b-81A9-23414A2BA98D}");

    SkyTexture a;
    SkyTexture b;
    EXPECT_EQ(a.sun.get(), defaultSun.get());
    EXPECT_EQ(b.sun.get(), defaultSun.get());
    EXPECT_NE(a.identifier, b.identifier);
    EXPECT_EQ(a.identifier.size(), 36u);
    for (char c : a.identifier) EXPECT_FALSE(std::isupper(static_cast<unsigned char>(c))) << a.identifier;
    EXPECT_EQ(a.transform.keyCount(), 1);
    EXPECT_EQ(a.transform.valueAt(0), Transform::identity());
}

TEST_F(Sky, Version1HoldsOnlyTheSun) {
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

TEST_F(Sky, Version2HoldsAPlainTransformThenTheFields) {
    const Transform placed{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 1}}}, Vector{1, 2, 3}};
    Image v2;
    v2.version(0, 2).flag(false).f32({0, 1, 0, -1, 0, 0, 0, 0, 1, 1, 2, 3});
    skyFields(v2, "ABCDEF01-0000-0000-0000-000000000000");
    SkyTexture read;
    ASSERT_TRUE(readInto(read, v2.bytes));
    EXPECT_EQ(read.transform.keyCount(), 1);
    EXPECT_EQ(read.transform.valueAt(0), placed);
    expectFieldsOfTheImage(read);
    EXPECT_EQ(read.identifier, "ABCDEF01-0000-0000-0000-000000000000");

    // Written back as version 3, which reads to the same sky.
    const ByteVector v3 = recordOf(read);
    EXPECT_EQ((ByteVector(v3.begin(), v3.begin() + 4)), (ByteVector{0, 0, 3, 0}));
    const auto again = boost::make_shared<SkyTexture>();
    ASSERT_TRUE(readInto(*again, v3));
    EXPECT_TRUE(again->isEqual(boost::make_shared<SkyTexture>(read)));
}

TEST_F(Sky, Version3Layout) {
    SkyTexture sky;
    auto own = boost::make_shared<SunLight>("Noon", "{0A0B}");
    sky.sun = own;
    sky.up_vector = Vector{0, 1, 0};
    sky.shadowBias = 0.5f;
    sky.turbidity = 4;
    sky.water_vapour = 2.5f;
    sky.intensity_multiplier = 1.5f;
    sky.size_multiplier = 2;
    sky.photon_radius = 60;
    sky.photon_emit_distance = 160;
    sky.ozone = 0.3f;
    sky.photonSubdivs = 400;
    sky.causticSubdivs = 900;
    sky.shadow_subdivs = 16;
    sky.flag1 = false;
    sky.flag2 = true;
    sky.identifier = "0f0e";
    AnimatedTransform identity;

    Image expected;
    expected.version(0, 3).flag(true).append(recordOf(*own));
    skyFields(expected, "0f0e");
    expected.append(recordOf(identity)).append(recordOf(*sharedDefaultSun())).flag(false);
    EXPECT_EQ(recordOf(sky), expected.bytes);
}

TEST_F(Sky, Version3OverwritesTheSharedDefaultSunAndCanPointAtIt) {
    // A record written while the default sun held other numbers.
    sharedDefaultSun()->turbidity = 7.5f;
    SkyTexture writer;
    const ByteVector bytes = recordOf(writer);
    EXPECT_EQ(bytes.back(), 1); // its sun is the default sun

    resetSharedDefaultSun();
    EXPECT_EQ(sharedDefaultSun()->turbidity, 3.0f);
    SkyTexture read;
    ASSERT_TRUE(readInto(read, bytes));
    EXPECT_EQ(sharedDefaultSun()->turbidity, 7.5f);
    EXPECT_EQ(read.sun.get(), sharedDefaultSun().get());

    // Within one conversion every later sky sees the overwritten default sun ...
    SkyTexture later;
    EXPECT_EQ(sunOf(later).turbidity, 7.5f);
    // ... and the next conversion starts from a pristine one.
    resetSharedDefaultSun();
    SkyTexture next;
    EXPECT_EQ(sunOf(next).turbidity, 3.0f);
    EXPECT_NE(next.sun.get(), read.sun.get());
    EXPECT_EQ(sunOf(read).turbidity, 7.5f);
}

TEST_F(Sky, ConvertingOneFileDoesNotChangeTheNextOne) {
    // File B: a version-1 sky without a sun, so it shows the default sun.
    const ByteVector fileB = Image{}.version(0, 1).flag(false).bytes;
    auto convert = [](const ByteVector& bytes) {
        resetSharedDefaultSun(); // as every conversion does
        SkyTexture sky;
        EXPECT_TRUE(readInto(sky, bytes));
        return xmlOf(sky, "/m/sky");
    };
    const std::string alone = convert(fileB);

    // File A: a version-3 sky whose stored default sun differs.
    sharedDefaultSun()->intensity_multiplier = 42;
    SkyTexture skyA;
    const ByteVector fileA = recordOf(skyA);
    resetSharedDefaultSun();
    const std::string a = convert(fileA);
    EXPECT_NE(a.find("<value>42</value>"), std::string::npos);

    EXPECT_EQ(convert(fileB), alone);
}

TEST_F(Sky, DefaultSunBelongsToItsThread) {
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

TEST_F(Sky, WritingRecognisesTheDefaultSunByIdentifierIgnoringCase) {
    SkyTexture sky;
    auto lookalike = boost::make_shared<SunLight>("Copy", "{d3be9766-e4aa-418B-81a9-23414a2ba98d}");
    sky.sun = lookalike;
    const ByteVector bytes = recordOf(sky);
    EXPECT_EQ(bytes.back(), 1);
    EXPECT_EQ(sky.sun.get(), sharedDefaultSun().get());

    SkyTexture other;
    auto own = boost::make_shared<SunLight>();
    other.sun = own;
    EXPECT_EQ(recordOf(other).back(), 0);
    EXPECT_EQ(other.sun.get(), own.get());

    // A sky without a sun stores none.
    SkyTexture bare;
    bare.sun.reset();
    EXPECT_EQ(recordOf(bare)[4], 0);
}

TEST_F(Sky, AFailedSunReadIsIgnoredButOtherFailuresAreNot) {
    // The sun record carries a version no sun knows; the sky reads on.
    SkyTexture sky;
    QuickArchive ar;
    ASSERT_TRUE(readInto(sky, Image{}.version(0, 1).flag(true).version(0, 9).bytes, &ar));
    EXPECT_FALSE(ar.failed());
    EXPECT_NE(sky.sun.get(), sharedDefaultSun().get());

    // A version-3 record whose stored default sun is refused fails.
    SkyTexture good;
    good.sun.reset();
    ByteVector bytes = recordOf(good);
    const std::size_t defaultSunAt = bytes.size() - 1 - recordOf(*sharedDefaultSun()).size();
    bytes[defaultSunAt + 2] = 9;
    SkyTexture read;
    EXPECT_FALSE(readInto(read, bytes, &ar));
    EXPECT_NE(failureOf(ar).find("default sun"), std::string::npos) << failureOf(ar);

    for (std::uint16_t refused : {0, 4}) {
        EXPECT_FALSE(readInto(read, Image{}.version(0, refused).bytes, &ar));
        EXPECT_NE(failureOf(ar).find("unknown sky texture version"), std::string::npos) << failureOf(ar);
    }
}

TEST_F(Sky, CopiesGetNewIdentifiersAndComparisonIgnoresTheirCase) {
    const auto sky = boost::make_shared<SkyTexture>();
    sky->sun = boost::make_shared<SunLight>("Noon", "{0A0B}");
    const TexturePtr a = sky->clone();
    const TexturePtr b = sky->clone();
    EXPECT_FALSE(a->isEqual(b));
    EXPECT_FALSE(a->isEqual(sky));
    EXPECT_NE(static_cast<SkyTexture&>(*a).sun, sky->sun);

    std::string upper = sky->identifier;
    for (char& c : upper) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    static_cast<SkyTexture&>(*a).identifier = upper;
    EXPECT_TRUE(a->isEqual(sky));
    static_cast<SkyTexture&>(*a).transform.setValue(Transform::identity(), 5.0);
    EXPECT_FALSE(a->isEqual(sky));
}

// --- XML ---

namespace {

std::string sunAsset(const std::string& url) {
    auto f = [](const char* name, const char* value) {
        return std::string("          <parameter type=\"float\" name=\"") + name + "\" listType=\"none\" label=\"" +
               name + "\">\n            <value>" + value + "</value>\n          </parameter>\n";
    };
    auto i = [](const char* type, const char* name, const char* value) {
        return std::string("          <parameter type=\"") + type + "\" name=\"" + name +
               "\" listType=\"none\" label=\"" + name + "\">\n            <value>" + value +
               "</value>\n          </parameter>\n";
    };
    return "  <Asset layout=\"\" renderer=\"kavor\" type=\"light\" url=\"" + url +
           "\" >\n    <plugin>\n      <kavorplugin name=\"SunLight\" type=\"light\">\n        <parameters>\n"
           "          <parameter type=\"vector\" name=\"up_vector\" listType=\"none\" label=\"up_vector\">\n"
           "            <value>\n              <vector>\n                <x>0</x>\n                <y>0</y>\n"
           "                <z>1</z>\n              </vector>\n            </value>\n          </parameter>\n" +
           f("shadowBias", "0") + f("turbidity", "3") + f("water_vapour", "2") + f("intensity_multiplier", "1") +
           f("size_multiplier", "1") + f("photon_radius", "50") + f("photon_emit_distance", "150") +
           f("ozone", "0.35") + i("integer", "photonSubdivs", "500") + i("integer", "causticSubdivs", "1000") +
           i("integer", "shadow_subdivs", "8") + i("bool", "enabled", "1") + i("bool", "shadows", "1") +
           i("bool", "invisible", "0") + "        </parameters>\n      </kavorplugin>\n    </plugin>\n  </Asset>\n";
}

std::string skyAsset(const std::string& url, const std::string& sunParameter) {
    return "  <Asset layout=\"\" renderer=\"kavor\" type=\"texture\" url=\"" + url +
           "\" >\n    <plugin>\n      <kavorplugin name=\"TexSky\" type=\"texture\">\n        <parameters>\n" +
           sunParameter + "        </parameters>\n      </kavorplugin>\n    </plugin>\n  </Asset>\n";
}

std::string sunReference(const std::string& url) {
    return "          <parameter type=\"plugin\" name=\"sun\" listType=\"none\" label=\"sun\">\n            <value>" +
           url + "</value>\n          </parameter>\n";
}

} // namespace

TEST_F(SkyXml, SkyWithItsSun) {
    SkyTexture sky;
    EXPECT_EQ(xmlOf(sky, "/Sky/environment"),
              sunAsset("/SunLight") + skyAsset("/Sky/environment", sunReference("/SunLight")));

    SkyTexture bare;
    bare.sun.reset();
    EXPECT_EQ(xmlOf(bare, "/Sky/environment"),
              skyAsset("/Sky/environment",
                       "          <parameter type=\"plugin\" name=\"sun\" listType=\"none\" label=\"sun\">\n"
                       "          </parameter>\n"));
}

TEST_F(SkyXml, OneSunAssetPerIdentifierInADocument) {
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
    EXPECT_EQ(out, sunAsset("/SunLight") + skyAsset("/a/sky", sunReference("/SunLight")) +
                       skyAsset("/b/sky", sunReference("/SunLight")) + sunAsset("/SunLight1") +
                       skyAsset("/c/sky", sunReference("/SunLight1")));
}
