// Lights: the factory and kind names, the records of every kind in every version,
// round trips, comparison, and the XML assets with the sun lights' naming.
#include "TrimSupport.hpp"

#include <dexmor/archive/Members.hpp>
#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/lights/BaseLight.hpp>
#include <dexmor/lights/LightKinds.hpp>
#include <dexmor/lights/SunLight.hpp>

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <climits>
#include <cstdint>
#include <map>
#include <string>
#include <type_traits>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

const std::int32_t kKinds[] = {0, 2, 3, 4, 5, 6, 7};

const Transform kPlacement{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 2}}}, Vector{10, 20, 30}};

// A placement with two keys.
AnimatedTransform animatedPlacement() {
    AnimatedTransform a;
    a.setConstant(kPlacement);
    a.setValue(Transform{Matrix{{{2, 0, 0}, {0, 3, 0}, {0, 0, 4}}}, Vector{-1, -2, -3}}, 1.5);
    return a;
}

// The placement a record stores as a plain Transform: its value at time 0.
AnimatedTransform plainPlacement() {
    AnimatedTransform a;
    a.setValue(kPlacement, 0.0);
    return a;
}

// The record of one version, assembled by hand, and the light it reads to: the
// defaults with the values the record holds. Every stored value is distinct and
// differs from its default where a flag allows, so that a value read into another
// field, or a field read from another place, shows.
template <class L>
struct Stored {
    Image image;
    L light;
};

Stored<MayaDirectLight> directional(int v) {
    Stored<MayaDirectLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v)).f32({1, 2, 3});
    if (v >= 4) i.f32({4, 5, 6});
    i.f32({7, 8, 9}).u32(10).u32(11).i32(12).flag(false);
    if (v >= 2) i.flag(false).u32(13).f32({14});
    if (v == 2) i.put(kPlacement);
    if (v >= 3) i.put(animatedPlacement());

    MayaDirectLight& l = s.light;
    l.color = {1, 2, 3};
    if (v >= 4) l.shadowColor = {4, 5, 6};
    l.shadowBias = 7, l.md_f1 = 8, l.md_f2 = 9, l.causticSubdivs = 10, l.photonSubdivs = 11, l.md_i1 = 12;
    l.enabled = false;
    if (v >= 2) l.shadows = false, l.shadowSubdivs = 13, l.shadowRadius = 14;
    if (v == 2) l.transform = plainPlacement();
    if (v >= 3) l.transform = animatedPlacement();
    return s;
}

Stored<OmniLight> omni(int v) {
    Stored<OmniLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v)).f32({1, 2, 3});
    if (v >= 3) i.f32({4, 5, 6, 7});
    i.f32({8, 9, 10, 11});
    if (v >= 3) i.i32(12);
    i.u32(13).u32(14).i32(15).flag(false);
    if (v >= 2) i.flag(false).u32(16).f32({17}).put(kPlacement);
    if (v >= 4) i.flag(false).flag(false);

    OmniLight& l = s.light;
    l.color = {1, 2, 3};
    if (v >= 3) l.shadowColor = {4, 5, 6}, l.cutoffThreshold = 7, l.units = 12;
    l.shadowBias = 8, l.decay = 9, l.intensity = 10, l.omni_f1 = 11;
    l.photonSubdivs = 13, l.causticSubdivs = 14, l.omni_i1 = 15, l.enabled = false;
    if (v >= 2) l.shadows = false, l.shadowSubdivs = 16, l.shadowRadius = 17, l.transform = kPlacement;
    if (v >= 4) l.affectDiffuse = false, l.affectSpecular = false;
    return s;
}

Stored<SpotLight> spot(int v) {
    Stored<SpotLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v)).f32({1, 2, 3});
    if (v >= 3) i.f32({4, 5, 6, 7, 8, 9, 10, 11});
    i.f32({12, 13, 14, 15});
    if (v >= 3) i.i32(16);
    i.u32(17).u32(18).i32(19).flag(false);
    if (v >= 3) i.flag(true);
    if (v >= 2) i.flag(false).u32(20).f32({21}).put(kPlacement).f32({22, 23});
    if (v >= 4) i.flag(false).flag(false);

    SpotLight& l = s.light;
    l.color = {1, 2, 3};
    if (v >= 3) {
        l.shadowColor = {4, 5, 6}, l.cutoffThreshold = 7;
        l.barnDoorLeft = 8, l.barnDoorRight = 9, l.barnDoorTop = 10, l.barnDoorBottom = 11;
        l.units = 16, l.barnDoor = true;
    }
    l.shadowBias = 12, l.decay = 13, l.intensity = 14, l.spot_f1 = 15;
    l.photonSubdivs = 17, l.causticSubdivs = 18, l.spot_i1 = 19, l.enabled = false;
    if (v >= 2) {
        l.shadows = false, l.shadowSubdivs = 20, l.shadowRadius = 21, l.transform = kPlacement;
        l.coneAngle = 22, l.penumbraAngle = 23;
    }
    if (v >= 4) l.affectDiffuse = false, l.affectSpecular = false;
    return s;
}

Stored<RectangleLight> rectangle(int v) {
    Stored<RectangleLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v)).f32({1, 2, 3});
    if (v >= 3) i.f32({4, 5, 6, 7});
    i.f32({8, 9, 10});
    if (v >= 3) i.i32(11);
    i.u32(12).u32(13).u32(14).i32(15);
    i.flag(true).flag(true).flag(true).flag(true).flag(false).flag(true).flag(false);
    if (v >= 2) i.flag(false).put(kPlacement).f32({16, 17});
    if (v >= 4) i.flag(false).flag(false).flag(false);

    RectangleLight& l = s.light;
    l.color = {1, 2, 3};
    if (v >= 3) l.shadowColor = {4, 5, 6}, l.cutoffThreshold = 7, l.units = 11;
    l.shadowBias = 8, l.intensity = 9, l.rect_f1 = 10;
    l.subdivs = 12, l.causticSubdivs = 13, l.photonSubdivs = 14, l.rect_i1 = 15;
    l.doubleSided = true, l.invisible = true, l.lightPortal = true, l.noDecay = true, l.enabled = false;
    l.storeWithIrradianceMap = true, l.ignoreLightNormals = false;
    if (v >= 2) l.shadows = false, l.transform = kPlacement, l.u_size = 16, l.v_size = 17;
    if (v >= 4) l.affectDiffuse = false, l.affectSpecular = false, l.affectReflections = false;
    return s;
}

Stored<IESLight> ies(int v) {
    const std::string file = "C:\\lights\\r\xC3\xA9sum\xC3\xA9 & co.ies";
    Stored<IESLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v)).put(kPlacement).f32({1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11});
    i.u32(12).u32(13).u32(14).flag(false).flag(false).flag(true).text(file);
    if (v >= 2) i.flag(false).flag(false);
    if (v >= 3) i.f32({15});

    IESLight& l = s.light;
    l.transform = kPlacement, l.color = {1, 2, 3}, l.shadowColor = {4, 5, 6}, l.filter_color = {7, 8, 9};
    l.shadowBias = 10, l.cutoffThreshold = 11, l.photonSubdivs = 12, l.causticSubdivs = 13, l.shadow_subdivs = 14;
    l.enabled = false, l.shadows = false, l.soft_shadows = true, l.ies_file = file;
    if (v >= 2) l.affectDiffuse = false, l.affectSpecular = false;
    if (v >= 3) l.intensity = 15;
    return s;
}

Stored<SphereLight> sphere(int v) {
    Stored<SphereLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v)).put(kPlacement).f32({1, 2, 3, 4, 5, 6, 7, 8, 9, 10});
    i.u32(11).u32(12).u32(13).u32(14).flag(false).flag(false).flag(true).flag(true).flag(true);
    if (v >= 2) i.flag(false).flag(false).flag(false);

    SphereLight& l = s.light;
    l.transform = kPlacement, l.color = {1, 2, 3}, l.shadowColor = {4, 5, 6};
    l.sph_f1 = 7, l.sph_f2 = 8, l.sph_f3 = 9, l.sph_f4 = 10, l.sph_u1 = 11, l.sph_u2 = 12, l.sph_u3 = 13, l.sph_u4 = 14;
    l.sph_b1 = false, l.sph_b2 = false, l.sph_b3 = true, l.sph_b4 = true, l.sph_b5 = true;
    if (v >= 2) l.sph_b6 = false, l.sph_b7 = false, l.sph_b8 = false;
    return s;
}

// Version 1 holds no identifier (the reader makes a new one; see checkKind).
Stored<SunLight> sun(int v) {
    const std::string identifier = "{5a1e-1d}", name = "Soleil d'\xC3\xA9t\xC3\xA9";
    Stored<SunLight> s;
    Image& i = s.image;
    i.version(0, static_cast<std::uint16_t>(v));
    if (v <= 3) i.put(kPlacement);
    i.f32({1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11}).i32(12).i32(13).i32(14).flag(false);
    if (v >= 2) i.text(identifier).text(name);
    if (v >= 3) i.flag(false).flag(true);
    if (v >= 4) i.put(animatedPlacement());

    SunLight& l = s.light;
    l.transform = v <= 3 ? plainPlacement() : animatedPlacement();
    l.up_vector = {1, 2, 3}, l.shadowBias = 4, l.turbidity = 5, l.water_vapour = 6, l.intensity_multiplier = 7;
    l.size_multiplier = 8, l.photon_radius = 9, l.photon_emit_distance = 10, l.ozone = 11;
    l.photonSubdivs = 12, l.causticSubdivs = 13, l.shadow_subdivs = 14, l.shadows = false;
    if (v >= 2) l.identifier = identifier, l.name = name;
    if (v >= 3) l.enabled = false, l.invisible = true;
    return s;
}

} // namespace

// --- the factory and the kind names ---

TEST(LightFactory, KindsNamesAndUnknownMembers) {
    for (std::int32_t kind : {1, 8, 9, 100, -1, INT_MIN, INT_MAX}) EXPECT_FALSE(createLight(kind)) << kind;
    for (std::int32_t kind : kKinds) {
        EXPECT_EQ(createLight(kind)->kindId(), kind);
        for (std::int32_t other : kKinds)
            EXPECT_TRUE(other == kind || !createLight(kind)->isEqual(createLight(other))) << kind << " " << other;
        EXPECT_FALSE(createLight(kind)->isEqual(LightPtr()));
    }
    // The names of the kind ids are bounds-checked; kind 8 is named but has no class.
    EXPECT_EQ(lightKindName(8), "Invalid Light");
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
    EXPECT_TRUE(!a.identifier.empty() && a.identifier != b.identifier);
}

// --- records ---

namespace {
// One kind: every version reads, over a light holding other values, to the defaults
// with the values the record holds; the writer stores the current record exactly,
// and so do copies; every stored byte takes part in comparison; unknown versions
// are refused and leave the defaults.
template <class L>
void checkKind(Stored<L> (*stored)(int version)) {
    SCOPED_TRACE(L::kInfo.what);
    const Stored<L> current = stored(L::kInfo.version);
    for (int v = 1; v <= L::kInfo.version; ++v) {
        SCOPED_TRACE("version " + std::to_string(v));
        Stored<L> old = stored(v);
        L read = current.light;
        ASSERT_TRUE(readInto(read, old.image.bytes));
        if constexpr (std::is_same_v<L, SunLight>) {
            if (v == 1) {
                EXPECT_FALSE(read.identifier.empty());
                EXPECT_NE(read.identifier, current.light.identifier);
                old.light.identifier = read.identifier;
            }
        }
        const char* difference = record::firstDifference(read, old.light, L::recordFields());
        EXPECT_EQ(difference, nullptr) << difference;
    }
    const auto original = boost::make_shared<L>(current.light);
    const ByteVector record = expectRoundTrip(original, [] { return boost::make_shared<L>(); });
    EXPECT_EQ(record, current.image.bytes);
    // Only the version words, the placement's counts and text lengths may leave a changed record unreadable.
    EXPECT_GE(expectEveryStoredByteCompared(original, record, [] { return boost::make_shared<L>(); }) + 24,
              record.size());

    const std::pair<std::uint16_t, std::uint16_t> refused[] = {
        {0, 0}, {0, static_cast<std::uint16_t>(L::kInfo.version + 1)}, {0, 0xFFFF}, {1, L::kInfo.version}};
    for (const auto& [first, second] : refused) {
        L light = current.light;
        expectReadFails(light, withVersion(record, first, second),
                        "unknown " + std::string(L::kInfo.what) + " version (" + std::to_string(first) + ", " +
                            std::to_string(second) + ") at offset 4");
        L defaults;
        if constexpr (std::is_same_v<L, SunLight>) defaults.identifier = light.identifier;
        EXPECT_EQ(record::firstDifference(light, defaults, L::recordFields()), nullptr);
    }
}
} // namespace

TEST(LightRecord, EveryKindInEveryVersion) {
    checkKind(directional);
    checkKind(omni);
    checkKind(spot);
    checkKind(rectangle);
    checkKind(sun);
    checkKind(ies);
    checkKind(sphere);
}

// --- XML ---

// A count beyond 2^31 - 1 shows as its signed value; a sun's asset stands at the
// top of the document, whatever the path; the sphere light has none.
TEST(LightXml, AssetsOfEveryKind) {
    OmniLight omni;
    omni.transform = kPlacement;
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
