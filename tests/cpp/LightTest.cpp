// Lights: the factory and kind names, the records of every kind in every version,
// round trips, comparison, and the XML assets with the sun lights' naming.
#include "TrimSupport.hpp"

#include <dexmor/archive/Members.hpp>
#include <dexmor/lights/BaseLight.hpp>
#include <dexmor/lights/LightKinds.hpp>
#include <dexmor/lights/SunLight.hpp>

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

// The record of one version, assembled by hand, and the light it reads to; flags
// take a value that differs from the default where the version allows.
Assembled<MayaDirectLight> directional(int v) {
    using L = MayaDirectLight;
    Assembled<L> s(v);
    s.c(&L::color);
    if (v >= 4) s.c(&L::shadowColor);
    s.f(&L::shadowBias).f(&L::md_f1).f(&L::md_f2).u(&L::causticSubdivs).u(&L::photonSubdivs).i(&L::md_i1);
    s.b(&L::enabled, false);
    if (v >= 2) s.b(&L::shadows, false).u(&L::shadowSubdivs).f(&L::shadowRadius);
    if (v == 2) s.plain(&L::transform, kPlacement);
    if (v >= 3) s.put(&L::transform, animatedPlacement());
    return s;
}

Assembled<OmniLight> omni(int v) {
    using L = OmniLight;
    Assembled<L> s(v);
    s.c(&L::color);
    if (v >= 3) s.c(&L::shadowColor).f(&L::cutoffThreshold);
    s.f(&L::shadowBias).f(&L::decay).f(&L::intensity).f(&L::omni_f1);
    if (v >= 3) s.i(&L::units);
    s.u(&L::photonSubdivs).u(&L::causticSubdivs).i(&L::omni_i1).b(&L::enabled, false);
    if (v >= 2) s.b(&L::shadows, false).u(&L::shadowSubdivs).f(&L::shadowRadius).put(&L::transform, kPlacement);
    if (v >= 4) s.b(&L::affectDiffuse, false).b(&L::affectSpecular, false);
    return s;
}

Assembled<SpotLight> spot(int v) {
    using L = SpotLight;
    Assembled<L> s(v);
    s.c(&L::color);
    if (v >= 3) s.c(&L::shadowColor).f(&L::cutoffThreshold);
    if (v >= 3) s.f(&L::barnDoorLeft).f(&L::barnDoorRight).f(&L::barnDoorTop).f(&L::barnDoorBottom);
    s.f(&L::shadowBias).f(&L::decay).f(&L::intensity).f(&L::spot_f1);
    if (v >= 3) s.i(&L::units);
    s.u(&L::photonSubdivs).u(&L::causticSubdivs).i(&L::spot_i1).b(&L::enabled, false);
    if (v >= 3) s.b(&L::barnDoor, true);
    if (v >= 2) s.b(&L::shadows, false).u(&L::shadowSubdivs).f(&L::shadowRadius).put(&L::transform, kPlacement);
    if (v >= 2) s.f(&L::coneAngle).f(&L::penumbraAngle);
    if (v >= 4) s.b(&L::affectDiffuse, false).b(&L::affectSpecular, false);
    return s;
}

Assembled<RectangleLight> rectangle(int v) {
    using L = RectangleLight;
    Assembled<L> s(v);
    s.c(&L::color);
    if (v >= 3) s.c(&L::shadowColor).f(&L::cutoffThreshold);
    s.f(&L::shadowBias).f(&L::intensity).f(&L::rect_f1);
    if (v >= 3) s.i(&L::units);
    s.u(&L::subdivs).u(&L::causticSubdivs).u(&L::photonSubdivs).i(&L::rect_i1);
    s.b(&L::doubleSided, true).b(&L::invisible, true).b(&L::lightPortal, true).b(&L::noDecay, true);
    s.b(&L::enabled, false).b(&L::storeWithIrradianceMap, true).b(&L::ignoreLightNormals, false);
    if (v >= 2) s.b(&L::shadows, false).put(&L::transform, kPlacement).f(&L::u_size).f(&L::v_size);
    if (v >= 4) s.b(&L::affectDiffuse, false).b(&L::affectSpecular, false).b(&L::affectReflections, false);
    return s;
}

Assembled<IESLight> ies(int v) {
    using L = IESLight;
    Assembled<L> s(v);
    s.put(&L::transform, kPlacement).c(&L::color).c(&L::shadowColor).c(&L::filter_color);
    s.f(&L::shadowBias).f(&L::cutoffThreshold).u(&L::photonSubdivs).u(&L::causticSubdivs).u(&L::shadow_subdivs);
    s.b(&L::enabled, false).b(&L::shadows, false).b(&L::soft_shadows, true);
    s.put(&L::ies_file, std::string("C:\\lights\\r\xC3\xA9sum\xC3\xA9 & co.ies"));
    if (v >= 2) s.b(&L::affectDiffuse, false).b(&L::affectSpecular, false);
    if (v >= 3) s.f(&L::intensity);
    return s;
}

Assembled<SphereLight> sphere(int v) {
    using L = SphereLight;
    Assembled<L> s(v);
    s.put(&L::transform, kPlacement).c(&L::color).c(&L::shadowColor);
    s.f(&L::sph_f1).f(&L::sph_f2).f(&L::sph_f3).f(&L::sph_f4).u(&L::sph_u1).u(&L::sph_u2).u(&L::sph_u3).u(&L::sph_u4);
    s.b(&L::sph_b1, false).b(&L::sph_b2, false).b(&L::sph_b3, true).b(&L::sph_b4, true).b(&L::sph_b5, true);
    if (v >= 2) s.b(&L::sph_b6, false).b(&L::sph_b7, false).b(&L::sph_b8, false);
    return s;
}

// Version 1 holds no identifier (the reader makes a new one; see checkKind).
Assembled<SunLight> sun(int v) {
    using L = SunLight;
    Assembled<L> s(v);
    if (v <= 3) s.plain(&L::transform, kPlacement);
    s.v(&L::up_vector).f(&L::shadowBias).f(&L::turbidity).f(&L::water_vapour).f(&L::intensity_multiplier);
    s.f(&L::size_multiplier).f(&L::photon_radius).f(&L::photon_emit_distance).f(&L::ozone);
    s.i(&L::photonSubdivs).i(&L::causticSubdivs).i(&L::shadow_subdivs).b(&L::shadows, false);
    if (v >= 2) s.put(&L::identifier, std::string("{5a1e-1d}")).put(&L::name, std::string("Soleil d'\xC3\xA9t\xC3\xA9"));
    if (v >= 3) s.b(&L::enabled, false).b(&L::invisible, true);
    if (v >= 4) s.put(&L::transform, animatedPlacement());
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
void checkKind(Assembled<L> (*stored)(int version)) {
    SCOPED_TRACE(L::kInfo.what);
    const Assembled<L> current = stored(L::kInfo.version);
    for (int v = 1; v <= L::kInfo.version; ++v) {
        SCOPED_TRACE("version " + std::to_string(v));
        Assembled<L> old = stored(v);
        L read = current.object;
        ASSERT_TRUE(readInto(read, old.image.bytes));
        if constexpr (std::is_same_v<L, SunLight>) {
            if (v == 1) {
                EXPECT_FALSE(read.identifier.empty());
                EXPECT_NE(read.identifier, current.object.identifier);
                old.object.identifier = read.identifier;
            }
        }
        const char* difference = record::firstDifference(read, old.object, L::recordFields());
        EXPECT_EQ(difference, nullptr) << difference;
    }
    const auto original = boost::make_shared<L>(current.object);
    const ByteVector record = expectRoundTrip(original, [] { return boost::make_shared<L>(); });
    EXPECT_EQ(record, current.image.bytes);
    // Only the version words, the placement's counts and text lengths may leave a changed record unreadable.
    EXPECT_GE(expectEveryStoredByteCompared(original, record, [] { return boost::make_shared<L>(); }) + 24,
              record.size());

    const std::pair<std::uint16_t, std::uint16_t> refused[] = {
        {0, 0}, {0, static_cast<std::uint16_t>(L::kInfo.version + 1)}, {0, 0xFFFF}, {1, L::kInfo.version}};
    for (const auto& [first, second] : refused) {
        L light = current.object;
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
    std::string out;
    AssetXmlWriter writer(out);
    SunLight first("A", "{id-a}"), second("B", "{id-b}"), third("C", "{id-c}");

    first.writeXml(writer, "/Oak");
    second.writeXml(writer, "/Oak");

    // Another sun with an identifier already written adds nothing, whatever its values.
    const std::string before = out;
    SunLight again("other", "{id-a}");
    again.turbidity = 9;
    again.writeXml(writer, "/Pine");
    first.clone()->writeXml(writer, "/Pine");
    EXPECT_EQ(out, before);

    third.writeXml(writer, "/Pine");
    EXPECT_EQ(occurrences(out, "<Asset "), 3u);
    EXPECT_EQ(PerConversion<DocumentSunUrls>::current().urls, (std::map<std::string, std::string>{
                                    {"{id-a}", "/SunLight"}, {"{id-b}", "/SunLight1"}, {"{id-c}", "/SunLight2"}}));
    EXPECT_EQ(writer.depth(), 0u);
}
