// Lights: the factory and kind names, the records of every kind in every version,
// round trips, comparison, and the XML assets with the sun lights' naming.
#include "TestSupport.hpp"

#include <dexmor/archive/Members.hpp>
#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/lights/BaseLight.hpp>
#include <dexmor/lights/LightKinds.hpp>
#include <dexmor/lights/SunLight.hpp>

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <map>
#include <random>
#include <string>
#include <type_traits>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// Sets any field to a random value.
struct Randomiser {
    std::mt19937 rng{20240917};

    float real() { return std::uniform_real_distribution<float>(-1000.0f, 1000.0f)(rng); }
    Vector vector() { return {real(), real(), real()}; }
    Transform transform() { return {Matrix{{vector(), vector(), vector()}}, vector()}; }
    void operator()(bool& v) { v = (rng() & 1) != 0; }
    void operator()(float& v) { v = real(); }
    void operator()(std::int32_t& v) { v = static_cast<std::int32_t>(rng()); }
    void operator()(std::uint32_t& v) { v = rng(); }
    void operator()(Color& v) { v = {real(), real(), real()}; }
    void operator()(Vector& v) { v = vector(); }
    void operator()(Transform& v) { v = transform(); }
    void operator()(std::string& v) { v = "r\xC3\xA9sum\xC3\xA9 " + std::to_string(rng()); } // non-ASCII UTF-8
    void operator()(AnimatedTransform& v) {
        v.setConstant(transform());
        v.setValue(transform(), 1.0 + (rng() % 100));
    }
};

const std::int32_t kKinds[] = {0, 2, 3, 4, 5, 6, 7};

// A record of an older layout, assembled field by field from `source`; `expected`
// is what reading it must give: the defaults with the fields the record holds.
// With `fill`, every field the record holds is first set to a random value.
template <class L>
struct OldRecord {
    L& source;
    Randomiser* fill;
    L expected;
    Image image;

    OldRecord(L& s, std::uint16_t version, Randomiser* f) : source(s), fill(f) { image.version(0, version); }

    template <class T>
    OldRecord& operator()(T L::*member) {
        if (fill) (*fill)(source.*member);
        image.put(source.*member);
        expected.*member = source.*member;
        return *this;
    }
    // A plain Transform standing for the animated placement's value at time 0.
    OldRecord& plain(AnimatedTransform L::*member) {
        const Transform t = (source.*member).valueAt(0.0);
        image.put(t);
        (expected.*member).setValue(t, 0.0);
        return *this;
    }
};

// The stored layouts of every version, one function per kind.
void layout(OldRecord<MayaDirectLight>& r, int v) {
    using L = MayaDirectLight;
    r(&L::color);
    if (v >= 4) r(&L::shadowColor);
    r(&L::shadowBias)(&L::md_f1)(&L::md_f2)(&L::causticSubdivs)(&L::photonSubdivs)(&L::md_i1)(&L::enabled);
    if (v >= 2) r(&L::shadows)(&L::shadowSubdivs)(&L::shadowRadius);
    if (v == 2) r.plain(&L::transform);
    if (v >= 3) r(&L::transform);
}
void layout(OldRecord<OmniLight>& r, int v) {
    using L = OmniLight;
    r(&L::color);
    if (v >= 3) r(&L::shadowColor)(&L::cutoffThreshold);
    r(&L::shadowBias)(&L::decay)(&L::intensity)(&L::omni_f1);
    if (v >= 3) r(&L::units);
    r(&L::photonSubdivs)(&L::causticSubdivs)(&L::omni_i1)(&L::enabled);
    if (v >= 2) r(&L::shadows)(&L::shadowSubdivs)(&L::shadowRadius)(&L::transform);
    if (v >= 4) r(&L::affectDiffuse)(&L::affectSpecular);
}
void layout(OldRecord<SpotLight>& r, int v) {
    using L = SpotLight;
    r(&L::color);
    if (v >= 3) r(&L::shadowColor)(&L::cutoffThreshold)(&L::barnDoorLeft)(&L::barnDoorRight)(&L::barnDoorTop)(&L::barnDoorBottom);
    r(&L::shadowBias)(&L::decay)(&L::intensity)(&L::spot_f1);
    if (v >= 3) r(&L::units);
    r(&L::photonSubdivs)(&L::causticSubdivs)(&L::spot_i1)(&L::enabled);
    if (v >= 3) r(&L::barnDoor);
    if (v >= 2) r(&L::shadows)(&L::shadowSubdivs)(&L::shadowRadius)(&L::transform)(&L::coneAngle)(&L::penumbraAngle);
    if (v >= 4) r(&L::affectDiffuse)(&L::affectSpecular);
}
void layout(OldRecord<RectangleLight>& r, int v) {
    using L = RectangleLight;
    r(&L::color);
    if (v >= 3) r(&L::shadowColor)(&L::cutoffThreshold);
    r(&L::shadowBias)(&L::intensity)(&L::rect_f1);
    if (v >= 3) r(&L::units);
    r(&L::subdivs)(&L::causticSubdivs)(&L::photonSubdivs)(&L::rect_i1)(&L::doubleSided)(&L::invisible);
    r(&L::lightPortal)(&L::noDecay)(&L::enabled)(&L::storeWithIrradianceMap)(&L::ignoreLightNormals);
    if (v >= 2) r(&L::shadows)(&L::transform)(&L::u_size)(&L::v_size);
    if (v >= 4) r(&L::affectDiffuse)(&L::affectSpecular)(&L::affectReflections);
}
void layout(OldRecord<SunLight>& r, int v) {
    using L = SunLight;
    if (v <= 3) r.plain(&L::transform);
    r(&L::up_vector)(&L::shadowBias)(&L::turbidity)(&L::water_vapour)(&L::intensity_multiplier);
    r(&L::size_multiplier)(&L::photon_radius)(&L::photon_emit_distance)(&L::ozone);
    r(&L::photonSubdivs)(&L::causticSubdivs)(&L::shadow_subdivs)(&L::shadows);
    if (v >= 2) r(&L::identifier)(&L::name);
    if (v >= 3) r(&L::enabled)(&L::invisible);
    if (v >= 4) r(&L::transform);
}
void layout(OldRecord<IESLight>& r, int v) {
    using L = IESLight;
    r(&L::transform)(&L::color)(&L::shadowColor)(&L::filter_color)(&L::shadowBias)(&L::cutoffThreshold);
    r(&L::photonSubdivs)(&L::causticSubdivs)(&L::shadow_subdivs)(&L::enabled)(&L::shadows)(&L::soft_shadows);
    r(&L::ies_file);
    if (v >= 2) r(&L::affectDiffuse)(&L::affectSpecular);
    if (v >= 3) r(&L::intensity);
}
void layout(OldRecord<SphereLight>& r, int v) {
    using L = SphereLight;
    r(&L::transform)(&L::color)(&L::shadowColor)(&L::sph_f1)(&L::sph_f2)(&L::sph_f3)(&L::sph_f4);
    r(&L::sph_u1)(&L::sph_u2)(&L::sph_u3)(&L::sph_u4)(&L::sph_b1)(&L::sph_b2)(&L::sph_b3)(&L::sph_b4)(&L::sph_b5);
    if (v >= 2) r(&L::sph_b6)(&L::sph_b7)(&L::sph_b8);
}

template <class L>
OldRecord<L> oldRecord(L& source, std::uint16_t version, Randomiser* fill = nullptr) {
    OldRecord<L> r(source, version, fill);
    layout(r, version);
    return r;
}

// A light with every stored field random.
template <class L>
L randomLight(Randomiser& random) {
    L light;
    oldRecord(light, L::kInfo.version, &random);
    return light;
}

} // namespace

// --- the factory and the kind names ---

TEST(LightFactory, KindsNamesAndUnknownMembers) {
    for (std::int32_t kind : kKinds) EXPECT_EQ(createLight(kind)->kindId(), kind);
    for (std::int32_t kind : {1, 8, 9, 100, -1, INT_MIN, INT_MAX}) EXPECT_FALSE(createLight(kind)) << kind;
    for (std::int32_t kind : kKinds) {
        for (std::int32_t other : kKinds)
            if (other != kind) {
                EXPECT_FALSE(createLight(kind)->isEqual(createLight(other)));
            }
        EXPECT_FALSE(createLight(kind)->isEqual(LightPtr()));
    }

    // The names of the kind ids are bounds-checked.
    const char* names[] = {"Infinite Direct Light", "Positional Direct Light", "Omni Light",
                           "Rectangle Light",       "Spot Light",              "Sun Light",
                           "IES Light",             "Sphere Light",            "Invalid Light"};
    for (std::int32_t kind = 0; kind <= 8; ++kind) EXPECT_EQ(lightKindName(kind), names[kind]);
    for (std::int32_t kind : {-1, 9, INT_MIN, INT_MAX}) EXPECT_EQ(lightKindName(kind), "") << kind;

    // An owner refuses a member of a kind without class.
    for (std::int32_t kind : {1, 8}) {
        const ByteVector image = Image{}.i32(kind).version(0, 1).bytes;
        QuickArchive ar(image.data(), image.size());
        LightPtr member;
        EXPECT_FALSE(readMember(ar, member, "sun"));
        EXPECT_NE(failureOf(ar).find("unknown light kind " + std::to_string(kind)), std::string::npos);
    }

    // Every new sun has an identifier of its own.
    const SunLight a, b;
    EXPECT_FALSE(a.identifier.empty());
    EXPECT_NE(a.identifier, b.identifier);
}

// --- records ---

namespace {
// One kind: every version reads, over a light holding other values, to the defaults
// with the fields the record holds; the writer stores the current layout exactly,
// and so do copies; every stored byte takes part in comparison; unknown versions
// are refused and leave the defaults.
template <class L>
void checkKind() {
    SCOPED_TRACE(L::kInfo.what);
    Randomiser random;
    L source = randomLight<L>(random);
    for (std::uint16_t v = 1; v <= L::kInfo.version; ++v) {
        SCOPED_TRACE("version " + std::to_string(v));
        OldRecord<L> r = oldRecord(source, v);
        L read = randomLight<L>(random);
        ASSERT_TRUE(readInto(read, r.image.bytes));
        if constexpr (std::is_same_v<L, SunLight>) {
            if (v == 1) { // the record holds no identifier: the reader makes a new one
                EXPECT_FALSE(read.identifier.empty());
                EXPECT_NE(read.identifier, source.identifier);
                r.expected.identifier = read.identifier;
            }
        }
        const char* difference = record::firstDifference(read, r.expected, L::recordFields());
        EXPECT_EQ(difference, nullptr) << difference;
        if (v == L::kInfo.version) {
            EXPECT_EQ(recordOf(read), r.image.bytes);
        }
    }
    const auto original = boost::make_shared<L>(source);
    const ByteVector record = recordOf(*original);
    EXPECT_EQ(record, oldRecord(source, L::kInfo.version).image.bytes);
    const LightPtr copy = original->clone();
    EXPECT_NE(copy.get(), original.get());
    EXPECT_TRUE(copy->isEqual(original));
    EXPECT_EQ(recordOf(*copy), record);
    // Only the version words, the placement's counts and text lengths may leave a changed record unreadable.
    EXPECT_GE(expectEveryStoredByteCompared(original, record, [] { return boost::make_shared<L>(); }) + 24,
              record.size());

    const std::pair<std::uint16_t, std::uint16_t> refused[] = {
        {0, 0}, {0, static_cast<std::uint16_t>(L::kInfo.version + 1)}, {0, 0xFFFF}, {1, L::kInfo.version}};
    for (const auto& [first, second] : refused) {
        ByteVector image = record;
        std::copy_n(Image{}.version(first, second).bytes.begin(), 4, image.begin());
        L light = randomLight<L>(random);
        QuickArchive ar;
        EXPECT_FALSE(readInto(light, image, &ar)) << first << "." << second;
        EXPECT_NE(failureOf(ar).find("version"), std::string::npos);
        L defaults;
        if constexpr (std::is_same_v<L, SunLight>) defaults.identifier = light.identifier;
        EXPECT_EQ(record::firstDifference(light, defaults, L::recordFields()), nullptr);
    }
}
} // namespace

TEST(LightRecord, EveryKindInEveryVersion) {
    checkKind<MayaDirectLight>();
    checkKind<OmniLight>();
    checkKind<SpotLight>();
    checkKind<RectangleLight>();
    checkKind<SunLight>();
    checkKind<IESLight>();
    checkKind<SphereLight>();
}

TEST(LightRecord, RefusesBrokenPlacementsAndOverlongTexts) {
    MayaDirectLight direct;
    ByteVector record = recordOf(direct);
    record[record.size() - 48 - 8 - 4] = 4; // the placement's key-time size: 4 instead of 8
    QuickArchive ar;
    EXPECT_FALSE(readInto(direct, record, &ar));
    EXPECT_TRUE(ar.failed());

    SunLight sun;
    record = recordOf(sun);
    record[record.size() - 48 - 8 - 4 - 4 - 2] = 2; // the placement's version (0, 2)
    EXPECT_FALSE(readInto(sun, record));

    Image ies; // version 1, its ies_file claiming more bytes than the archive holds
    ies.version(0, 1).put(Transform::identity()).put(Color{}).put(Color{}).put(Color{}).f32({0, 0});
    ies.u32(8).u32(8).u32(8).flag(true).flag(true).flag(false).u32(100000).text("abc");
    IESLight light;
    EXPECT_FALSE(readInto(light, ies.bytes));
}

// --- XML ---

// A count beyond 2^31 - 1 shows as its signed value; a sun's asset stands at the
// top of the document, whatever the path; the sphere light has none.
TEST(LightXml, AssetsOfEveryKind) {
    OmniLight omni;
    omni.transform = Transform{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 2}}}, Vector{10, 20, 30}};
    omni.color = {0.5f, 0.25f, 1.0f}, omni.shadowBias = 0.125f, omni.decay = 2.0f, omni.shadowRadius = 0.75f;
    omni.units = 3, omni.shadows = false, omni.affectSpecular = false, omni.photonSubdivs = 4294967295u;
    expectGolden(xmlOf(omni, "/Sky"), "light_omni.xml");

    MayaDirectLight direct;
    direct.shadowBias = 0.5f, direct.shadowRadius = 1.5f, direct.shadows = false;
    expectGolden(xmlOf(direct, "/Env"), "light_direct.xml");

    SpotLight spot;
    spot.barnDoorLeft = 1, spot.barnDoorRight = 2, spot.barnDoorTop = 3, spot.barnDoorBottom = 4;
    spot.shadowBias = 0.25f, spot.decay = 0.5f, spot.shadowRadius = 0.75f, spot.penumbraAngle = 5, spot.units = 2;
    spot.barnDoor = true, spot.affectDiffuse = false;
    expectGolden(xmlOf(spot, "/Sky"), "light_spot.xml");

    RectangleLight rect;
    rect.u_size = 2, rect.v_size = 3, rect.shadowBias = 0.25f;
    rect.doubleSided = true, rect.lightPortal = true, rect.affectReflections = false;
    expectGolden(xmlOf(rect, "/Sky"), "light_rectangle.xml");

    IESLight ies;
    ies.filter_color = {0.5f, 0.5f, 0.25f}, ies.photonSubdivs = 16, ies.soft_shadows = true;
    ies.ies_file = "C:\\lights\\a&b.ies";
    expectGolden(xmlOf(ies, "/Sky"), "light_ies.xml");

    SunLight sun;
    sun.shadowBias = 0.5f, sun.size_multiplier = 2, sun.shadows = false, sun.invisible = true;
    expectGolden(xmlOf(sun, "/Oak/environment"), "light_sun.xml");

    SphereLight sphere;
    EXPECT_EQ(xmlOf(sphere, "/Sky"), "");
}

TEST(SunLightXml, OneAssetPerIdentifierNamedInWritingOrder) {
    const ConversionContext context;
    std::string out;
    AssetXmlWriter writer(out);
    SunLight first("A", "{id-a}"), second("B", "{id-b}"), third("C", "{id-c}");

    first.writeXml(writer, "/Oak");
    EXPECT_NE(out.find("url=\"/SunLight\""), std::string::npos);
    second.writeXml(writer, "/Oak");
    EXPECT_NE(out.find("url=\"/SunLight1\""), std::string::npos);

    // Another sun with an identifier already written adds nothing, whatever its values.
    const std::string before = out;
    SunLight again("other", "{id-a}");
    again.turbidity = 9;
    again.writeXml(writer, "/Pine");
    first.clone()->writeXml(writer, "/Pine");
    EXPECT_EQ(out, before);

    third.writeXml(writer, "/Pine");
    EXPECT_NE(out.find("url=\"/SunLight2\""), std::string::npos);
    EXPECT_EQ(occurrences(out, "<Asset "), 3u);
    EXPECT_EQ(PerConversion<DocumentSunUrls>::current().urls, (std::map<std::string, std::string>{
                                    {"{id-a}", "/SunLight"}, {"{id-b}", "/SunLight1"}, {"{id-c}", "/SunLight2"}}));
    EXPECT_EQ(writer.depth(), 0u);
}
