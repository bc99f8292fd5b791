// Lights: the factory and kind names, the records of every kind in every version,
// round trips, comparison, and the XML assets with the sun lights' naming.
#include "archive/Members.hpp"
#include "archive/QuickArchive.hpp"
#include "lights/BaseLight.hpp"
#include "lights/LightKinds.hpp"
#include "lights/SunLight.hpp"
#include "xml/AssetXmlWriter.hpp"

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <climits>
#include <cstdint>
#include <random>
#include <string>
#include <type_traits>
#include <vector>

using namespace OrvexKavorCore;

namespace {

using ByteVector = std::vector<std::uint8_t>;

// Little-endian record images assembled by hand.
struct Image {
    ByteVector bytes;

    Image& u32(std::uint32_t v) {
        for (int i = 0; i < 4; ++i) bytes.push_back(static_cast<std::uint8_t>(v >> (8 * i)));
        return *this;
    }
    Image& version(std::uint16_t a, std::uint16_t b) { return u32(a | (std::uint32_t{b} << 16)); }
    Image& put(float v) { return u32(std::bit_cast<std::uint32_t>(v)); }
    Image& put(std::int32_t v) { return u32(static_cast<std::uint32_t>(v)); }
    Image& put(std::uint32_t v) { return u32(v); }
    Image& put(bool v) {
        bytes.push_back(v ? 1 : 0);
        return *this;
    }
    Image& put(const Vector& v) { return put(v.x).put(v.y).put(v.z); }
    Image& put(const Color& c) { return put(c.r).put(c.g).put(c.b); }
    Image& put(const Transform& t) { return put(t.m[0]).put(t.m[1]).put(t.m[2]).put(t.offs); }
    Image& put(const std::string& s) {
        u32(static_cast<std::uint32_t>(s.size()));
        bytes.insert(bytes.end(), s.begin(), s.end());
        return *this;
    }
    // The keyed transform's own record.
    Image& put(const AnimatedTransform& a) {
        version(0, 1).u32(static_cast<std::uint32_t>(a.keys().size())).u32(8);
        for (const auto& key : a.keys()) {
            const auto time = std::bit_cast<std::uint64_t>(key.time);
            u32(static_cast<std::uint32_t>(time)).u32(static_cast<std::uint32_t>(time >> 32));
            put(key.value);
        }
        return *this;
    }
};

ByteVector recordOf(BaseLight& light) {
    QuickArchive ar;
    EXPECT_TRUE(light.writeToArchive(ar));
    ByteVector out(ar.writePosition());
    ar.getRaw(out.data(), out.size());
    return out;
}

// Reads a record; on success the whole image must have been consumed.
bool readInto(BaseLight& light, const ByteVector& bytes, QuickArchive* keep = nullptr) {
    QuickArchive ar(bytes.data(), bytes.size());
    const bool ok = light.readFromArchive(ar);
    if (ok) {
        EXPECT_EQ(ar.readPosition(), bytes.size());
    }
    if (keep) *keep = ar;
    return ok;
}

std::string xmlOf(BaseLight& light, const std::string& path = "/Sky") {
    std::string out;
    AssetXmlWriter writer(out);
    light.writeXml(writer, path);
    EXPECT_EQ(writer.depth(), 0u);
    return out;
}

// Every field of each kind, in declaration order.
template <class F, class... T>
void each(F& f, T&... fields) {
    (f(fields), ...);
}
template <class F>
void eachField(MayaDirectLight& l, F&& f) {
    each(f, l.transform, l.color, l.shadowColor, l.shadowBias, l.shadowRadius, l.md_f1, l.md_f2, l.photonSubdivs,
         l.causticSubdivs, l.shadowSubdivs, l.md_i1, l.enabled, l.shadows);
}
template <class F>
void eachField(OmniLight& l, F&& f) {
    each(f, l.transform, l.color, l.shadowColor, l.cutoffThreshold, l.shadowBias, l.shadowRadius, l.decay,
         l.intensity, l.omni_f1, l.units, l.photonSubdivs, l.causticSubdivs, l.shadowSubdivs, l.omni_i1, l.enabled,
         l.shadows, l.affectDiffuse, l.affectSpecular);
}
template <class F>
void eachField(SpotLight& l, F&& f) {
    each(f, l.transform, l.color, l.shadowColor, l.cutoffThreshold, l.barnDoorLeft, l.barnDoorRight, l.barnDoorTop,
         l.barnDoorBottom, l.intensity, l.decay, l.shadowBias, l.shadowRadius, l.coneAngle, l.penumbraAngle,
         l.spot_f1, l.units, l.photonSubdivs, l.causticSubdivs, l.shadowSubdivs, l.spot_i1, l.enabled, l.shadows,
         l.barnDoor, l.affectDiffuse, l.affectSpecular);
}
template <class F>
void eachField(RectangleLight& l, F&& f) {
    each(f, l.transform, l.color, l.shadowColor, l.cutoffThreshold, l.u_size, l.v_size, l.intensity, l.shadowBias,
         l.rect_f1, l.units, l.subdivs, l.causticSubdivs, l.photonSubdivs, l.rect_i1, l.storeWithIrradianceMap,
         l.doubleSided, l.invisible, l.lightPortal, l.noDecay, l.ignoreLightNormals, l.enabled, l.shadows,
         l.affectDiffuse, l.affectSpecular, l.affectReflections);
}
template <class F>
void eachField(SunLight& l, F&& f) {
    each(f, l.transform, l.up_vector, l.shadowBias, l.turbidity, l.water_vapour, l.intensity_multiplier,
         l.size_multiplier, l.photon_radius, l.photon_emit_distance, l.ozone, l.photonSubdivs, l.causticSubdivs,
         l.shadow_subdivs, l.shadows, l.enabled, l.invisible, l.identifier, l.name);
}
template <class F>
void eachField(IESLight& l, F&& f) {
    each(f, l.transform, l.color, l.shadowColor, l.filter_color, l.shadowBias, l.cutoffThreshold, l.intensity,
         l.photonSubdivs, l.causticSubdivs, l.shadow_subdivs, l.enabled, l.shadows, l.soft_shadows, l.ies_file,
         l.affectDiffuse, l.affectSpecular);
}
template <class F>
void eachField(SphereLight& l, F&& f) {
    each(f, l.transform, l.color, l.shadowColor, l.sph_f1, l.sph_f2, l.sph_f3, l.sph_f4, l.sph_u1, l.sph_u2,
         l.sph_u3, l.sph_u4, l.sph_b1, l.sph_b2, l.sph_b3, l.sph_b4, l.sph_b5, l.sph_b6, l.sph_b7, l.sph_b8);
}

// Calls f with the light as its own class.
template <class F>
void asKind(BaseLight& light, F&& f) {
    if (auto* l = dynamic_cast<MayaDirectLight*>(&light)) return f(*l);
    if (auto* l = dynamic_cast<OmniLight*>(&light)) return f(*l);
    if (auto* l = dynamic_cast<SpotLight*>(&light)) return f(*l);
    if (auto* l = dynamic_cast<RectangleLight*>(&light)) return f(*l);
    if (auto* l = dynamic_cast<SunLight*>(&light)) return f(*l);
    if (auto* l = dynamic_cast<IESLight*>(&light)) return f(*l);
    if (auto* l = dynamic_cast<SphereLight*>(&light)) return f(*l);
    FAIL() << "not a light kind";
}

struct Randomiser {
    std::mt19937 rng{20240917};

    float real() { return std::uniform_real_distribution<float>(-1000.0f, 1000.0f)(rng); }
    Vector vector() { return {real(), real(), real()}; }
    Transform transform() { return {Matrix{{vector(), vector(), vector()}}, vector()}; }

    template <class T>
    void operator()(T& v) {
        if constexpr (std::is_same_v<T, bool>)
            v = (rng() & 1) != 0;
        else if constexpr (std::is_same_v<T, float>)
            v = real();
        else if constexpr (std::is_integral_v<T>)
            v = static_cast<T>(rng());
        else if constexpr (std::is_same_v<T, Color>)
            v = {real(), real(), real()};
        else if constexpr (std::is_same_v<T, Vector>)
            v = vector();
        else if constexpr (std::is_same_v<T, Transform>)
            v = transform();
        else if constexpr (std::is_same_v<T, std::string>)
            v = "r\xC3\xA9sum\xC3\xA9 " + std::to_string(rng()); // non-ASCII UTF-8
        else if constexpr (std::is_same_v<T, AnimatedTransform>) {
            v.setConstant(transform());
            v.setValue(transform(), 1.0 + (rng() % 100));
        } else
            static_assert(!sizeof(T), "no random value for this field type");
    }
};

// Changes one value so that it differs from before.
struct Nudge {
    template <class T>
    void operator()(T& v) {
        if constexpr (std::is_same_v<T, bool>)
            v = !v;
        else if constexpr (std::is_arithmetic_v<T>)
            v = static_cast<T>(v + 1);
        else if constexpr (std::is_same_v<T, Color>)
            v.g += 1.0f;
        else if constexpr (std::is_same_v<T, Vector>)
            v.z += 1.0f;
        else if constexpr (std::is_same_v<T, Transform>)
            v.offs.y += 1.0f;
        else if constexpr (std::is_same_v<T, std::string>)
            v += "x";
        else
            v.setValue(Transform::zero(), 500.0);
    }
};

const std::int32_t kKinds[] = {0, 2, 3, 4, 5, 6, 7};

// A record of an older layout, assembled field by field from `source`; `expected`
// is what reading it must give: the defaults with the fields the record holds.
template <class L>
struct OldRecord {
    const L& source;
    L expected;
    Image image;

    OldRecord(const L& s, std::uint16_t version) : source(s) { image.version(0, version); }

    template <class T>
    OldRecord& operator()(T L::*member) {
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
OldRecord<L> oldRecord(const L& source, std::uint16_t version) {
    OldRecord<L> r(source, version);
    layout(r, version);
    return r;
}

// --- expected XML, line by line ---
std::string pad(int depth) { return std::string(2 * static_cast<std::size_t>(depth), ' '); }
std::string scalar(const char* type, const std::string& name, const std::string& value) {
    return pad(5) + "<parameter type=\"" + type + "\" name=\"" + name + "\" listType=\"none\" label=\"" + name +
           "\">\n" + pad(6) + "<value>" + value + "</value>\n" + pad(5) + "</parameter>\n";
}
std::string F(const std::string& n, const std::string& v) { return scalar("float", n, v); }
std::string I(const std::string& n, const std::string& v) { return scalar("integer", n, v); }
std::string B(const std::string& n, bool v) { return scalar("bool", n, v ? "1" : "0"); }
std::string S(const std::string& n, const std::string& v) { return scalar("string", n, v); }
std::string block(const char* type, const std::string& name, const std::string& lines) {
    return pad(5) + "<parameter type=\"" + type + "\" name=\"" + name + "\" listType=\"none\" label=\"" + name +
           "\">\n" + pad(6) + "<value>\n" + lines + pad(6) + "</value>\n" + pad(5) + "</parameter>\n";
}
std::string C(const std::string& n, const char* r, const char* g, const char* b) {
    return block("color", n,
                 pad(7) + "<r>" + r + "</r>\n" + pad(7) + "<g>" + g + "</g>\n" + pad(7) + "<b>" + b + "</b>\n");
}
std::string vectorLines(const char* x, const char* y, const char* z) {
    return pad(7) + "<vector>\n" + pad(8) + "<x>" + x + "</x>\n" + pad(8) + "<y>" + y + "</y>\n" + pad(8) + "<z>" +
           z + "</z>\n" + pad(7) + "</vector>\n";
}
std::string V(const std::string& n, const char* x, const char* y, const char* z) {
    return block("vector", n, vectorLines(x, y, z));
}
// A transform block: the three columns, then the offset.
std::string T(const std::string& n, const std::array<const char*, 12>& v) {
    std::string lines;
    for (int i = 0; i < 12; i += 3) lines += vectorLines(v[i], v[i + 1], v[i + 2]);
    return block("transform", n, lines);
}
std::string identityTransform(const std::string& n) {
    return T(n, {"1", "0", "0", "0", "1", "0", "0", "0", "1", "0", "0", "0"});
}
std::string asset(const std::string& url, const std::string& plugin, std::initializer_list<std::string> params) {
    std::string s = pad(1) + "<Asset layout=\"\" renderer=\"kavor\" type=\"light\" url=\"" + url + "\" >\n" + pad(2) +
                    "<plugin>\n" + pad(3) + "<kavorplugin name=\"" + plugin + "\" type=\"light\">\n" + pad(4) +
                    "<parameters>\n";
    for (const std::string& p : params) s += p;
    return s + pad(4) + "</parameters>\n" + pad(3) + "</kavorplugin>\n" + pad(2) + "</plugin>\n" + pad(1) +
           "</Asset>\n";
}

std::size_t occurrences(const std::string& text, const std::string& what) {
    std::size_t n = 0;
    for (auto at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++n;
    return n;
}

} // namespace

// --- the factory and the kind names ---

TEST(LightFactory, CreatesTheSevenKindsAndNothingElse) {
    const std::pair<std::int32_t, const char*> known[] = {{0, "MayaLightDirect"}, {2, "LightOmni"},
                                                          {3, "LightRectangle"},  {4, "LightSpot"},
                                                          {5, "SunLight"},        {6, "LightIES"},
                                                          {7, ""}};
    for (const auto& [kind, plugin] : known) {
        const LightPtr light = createLight(kind);
        ASSERT_TRUE(light) << kind;
        EXPECT_EQ(light->kindId(), kind);
        EXPECT_EQ(light->pluginType(), plugin);
        EXPECT_EQ(light->assetType(), "light");
    }
    for (std::int32_t kind : {1, 8, 9, 100, -1, INT_MIN, INT_MAX}) EXPECT_FALSE(createLight(kind)) << kind;
}

TEST(LightFactory, KindNamesAreBoundsChecked) {
    const char* names[] = {"Infinite Direct Light", "Positional Direct Light", "Omni Light",
                           "Rectangle Light",       "Spot Light",              "Sun Light",
                           "IES Light",             "Sphere Light",            "Invalid Light"};
    for (std::int32_t kind = 0; kind <= 8; ++kind) EXPECT_EQ(lightKindName(kind), names[kind]);
    for (std::int32_t kind : {-1, 9, INT_MIN, INT_MAX}) EXPECT_EQ(lightKindName(kind), "") << kind;
}

TEST(LightFactory, AnOwnerRefusesAMemberOfAKindWithoutClass) {
    for (std::int32_t kind : {1, 8}) {
        Image image;
        image.put(kind).version(0, 1);
        QuickArchive ar(image.bytes.data(), image.bytes.size());
        LightPtr member;
        EXPECT_FALSE(readMember(ar, member, "sun"));
        ASSERT_TRUE(ar.failed());
        EXPECT_NE(ar.failure()->reason.find("unknown light kind " + std::to_string(kind)), std::string::npos);
    }
}

// --- round trips and comparison ---

TEST(LightRecord, EveryKindRoundTripsWithRandomValues) {
    Randomiser random;
    for (std::int32_t kind : kKinds) {
        SCOPED_TRACE(lightKindName(kind));
        const LightPtr original = createLight(kind);
        asKind(*original, [&](auto& l) { eachField(l, random); });
        const ByteVector record = recordOf(*original);

        const LightPtr read = createLight(kind);
        ASSERT_TRUE(readInto(*read, record));
        EXPECT_TRUE(original->isEqual(read));
        EXPECT_TRUE(read->isEqual(original));
        EXPECT_EQ(recordOf(*read), record);

        const LightPtr copy = original->clone();
        EXPECT_NE(copy.get(), original.get());
        EXPECT_TRUE(copy->isEqual(original));
        EXPECT_EQ(recordOf(*copy), record);
    }
}

TEST(LightRecord, ComparisonNoticesEveryFieldAndTheKind) {
    Randomiser random;
    for (std::int32_t kind : kKinds) {
        SCOPED_TRACE(lightKindName(kind));
        const LightPtr original = createLight(kind);
        asKind(*original, [&](auto& l) { eachField(l, random); });
        std::size_t fieldCount = 0;
        asKind(*original, [&](auto& l) { eachField(l, [&](auto&) { ++fieldCount; }); });
        for (std::size_t changed = 0; changed < fieldCount; ++changed) {
            const LightPtr other = original->clone();
            std::size_t index = 0;
            asKind(*other, [&](auto& l) {
                eachField(l, [&](auto& value) {
                    if (index++ == changed) Nudge{}(value);
                });
            });
            EXPECT_FALSE(original->isEqual(other)) << "field " << changed;
            EXPECT_FALSE(other->isEqual(original)) << "field " << changed;
        }
        for (std::int32_t otherKind : kKinds)
            if (otherKind != kind) {
                EXPECT_FALSE(createLight(kind)->isEqual(createLight(otherKind)));
            }
        EXPECT_FALSE(original->isEqual(LightPtr()));
    }
}

// --- stored layouts of every version ---

namespace {
template <class L>
void checkEveryVersion() {
    Randomiser random;
    L source;
    eachField(source, random);
    for (std::uint16_t v = 1; v <= L::kInfo.version; ++v) {
        SCOPED_TRACE(std::string(L::kInfo.what) + " version " + std::to_string(v));
        OldRecord<L> r = oldRecord(source, v);
        L read;
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
    }
    // The writer stores the current layout exactly.
    L copy = source;
    EXPECT_EQ(recordOf(copy), oldRecord(source, L::kInfo.version).image.bytes);
}
} // namespace

TEST(LightRecord, EveryVersionOfEveryKindReads) {
    checkEveryVersion<MayaDirectLight>();
    checkEveryVersion<OmniLight>();
    checkEveryVersion<SpotLight>();
    checkEveryVersion<RectangleLight>();
    checkEveryVersion<SunLight>();
    checkEveryVersion<IESLight>();
    checkEveryVersion<SphereLight>();
}

TEST(LightRecord, VersionOneOmniKeepsTheDefaultsOfLaterFields) {
    OmniLight source;
    source.color = {0.5f, 0.25f, 0.125f};
    source.shadowColor = {0.5f, 0.5f, 0.5f};
    source.cutoffThreshold = 0.25f;
    source.units = 2;
    source.affectDiffuse = source.affectSpecular = false;
    OmniLight omni;
    ASSERT_TRUE(readInto(omni, oldRecord(source, 1).image.bytes));
    EXPECT_EQ(omni.color, source.color);
    EXPECT_EQ(omni.shadowColor, (Color{0, 0, 0}));
    EXPECT_EQ(omni.cutoffThreshold, 0.005f);
    EXPECT_EQ(omni.units, 0);
    EXPECT_TRUE(omni.affectDiffuse);
    EXPECT_TRUE(omni.affectSpecular);
}

TEST(LightRecord, OldPlainTransformsBecomeThePlacementAtTimeZero) {
    const Transform t{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 2}}}, Vector{10, 20, 30}};
    MayaDirectLight source;
    source.transform.setValue(t, 0.0);
    MayaDirectLight direct;
    direct.transform.setValue(Transform::zero(), 5.0); // dropped by the reset before reading
    ASSERT_TRUE(readInto(direct, oldRecord(source, 2).image.bytes));
    EXPECT_EQ(direct.transform.keyCount(), 1);
    EXPECT_EQ(direct.transform.valueAt(0.0), t);

    // A version-3 sun: VersionWord, the plain transform, then up_vector.
    SunLight sun("Noon", "{sun}");
    sun.transform.setValue(t, 0.0);
    sun.up_vector = {0, 1, 0};
    const ByteVector v3 = oldRecord(sun, 3).image.bytes;
    EXPECT_EQ(ByteVector(v3.begin() + 4, v3.begin() + 64), Image().put(t).put(sun.up_vector).bytes);
    SunLight read;
    ASSERT_TRUE(readInto(read, v3));
    EXPECT_EQ(read.transform.valueAt(0.0), t);
    EXPECT_EQ(read.up_vector, sun.up_vector);
    EXPECT_EQ(read.identifier, "{sun}");
}

TEST(LightRecord, VersionFourSunStoresThePlacementAfterInvisible) {
    SunLight sun("Noon", "{sun}");
    sun.invisible = true;
    sun.transform.setValue(Transform::zero(), 24.0);
    const ByteVector record = recordOf(sun);
    // VersionWord, Vector, 8 floats, 3 integers, shadows, two WStrings, enabled, invisible.
    const std::ptrdiff_t placement = 4 + 12 + 32 + 12 + 1 + (4 + 5) + (4 + 4) + 2;
    ASSERT_EQ(record.size(), static_cast<std::size_t>(placement) + 12 + 2 * (8 + 48));
    EXPECT_EQ(record[placement - 1], 1); // invisible
    EXPECT_EQ(ByteVector(record.begin() + placement, record.begin() + placement + 12),
              Image().version(0, 1).u32(2).u32(8).bytes);
}

TEST(LightRecord, RefusesUnknownVersionsAndKeepsTheDefaults) {
    Randomiser random;
    for (std::int32_t kind : kKinds) {
        SCOPED_TRACE(lightKindName(kind));
        const ByteVector valid = recordOf(*createLight(kind));
        const auto current = static_cast<std::uint16_t>(valid[2] | valid[3] << 8);
        const std::pair<std::uint16_t, std::uint16_t> refused[] = {
            {0, 0}, {0, static_cast<std::uint16_t>(current + 1)}, {0, 0xFFFF}, {1, current}};
        for (const auto& [first, second] : refused) {
            Image image;
            image.version(first, second);
            image.bytes.insert(image.bytes.end(), valid.begin() + 4, valid.end());
            const LightPtr light = createLight(kind);
            asKind(*light, [&](auto& l) { eachField(l, random); });
            QuickArchive ar;
            EXPECT_FALSE(readInto(*light, image.bytes, &ar)) << first << "." << second;
            ASSERT_TRUE(ar.failed());
            EXPECT_NE(ar.failure()->reason.find("version"), std::string::npos);

            const LightPtr defaults = createLight(kind);
            if (auto* sun = dynamic_cast<SunLight*>(defaults.get()))
                sun->identifier = dynamic_cast<SunLight&>(*light).identifier;
            EXPECT_TRUE(light->isEqual(defaults));
        }
    }
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
    ies.version(0, 1).put(Transform::identity()).put(Color{}).put(Color{}).put(Color{}).put(0.0f).put(0.0f);
    ies.put(std::uint32_t{8}).put(std::uint32_t{8}).put(std::uint32_t{8}).put(true).put(true).put(false);
    ies.u32(100000).put(std::string("abc"));
    IESLight light;
    EXPECT_FALSE(readInto(light, ies.bytes));
}

// --- XML ---

TEST(LightXml, OmniLightAsset) {
    OmniLight omni;
    omni.transform = Transform{Matrix{{{0, 1, 0}, {-1, 0, 0}, {0, 0, 2}}}, Vector{10, 20, 30}};
    omni.color = {0.5f, 0.25f, 1.0f};
    omni.shadowBias = 0.125f;
    omni.decay = 2.0f;
    omni.shadowRadius = 0.75f;
    omni.units = 3;
    omni.photonSubdivs = 4294967295u; // a count beyond 2^31 - 1 shows as its signed value
    omni.shadows = false;
    omni.affectSpecular = false;
    const std::string xml = xmlOf(omni);
    EXPECT_EQ(xml, asset("/Sky/LightOmni", "LightOmni",
                         {C("color", "0.5", "0.25", "1"), C("shadowColor", "0", "0", "0"),
                          F("cutoffThreshold", "0.005"), F("shadowBias", "0.125"), F("decay", "2"),
                          F("intensity", "30"), F("shadowRadius", "0.75"), I("units", "3"),
                          I("photonSubdivs", "-1"), I("causticSubdivs", "1000"), I("shadowSubdivs", "8"),
                          B("enabled", true), B("shadows", false), B("affectDiffuse", true),
                          B("affectSpecular", false),
                          T("transform", {"0", "1", "0", "-1", "0", "0", "0", "0", "2", "10", "20", "30"})}));
    EXPECT_EQ(occurrences(xml, "name=\"units\""), 1u);
    EXPECT_EQ(occurrences(xml, "name=\"causticSubdivs\""), 1u);
    // The literal text of the asset's start, as a check of the expectations above.
    const std::string start = R"(  <Asset layout="" renderer="kavor" type="light" url="/Sky/LightOmni" >
    <plugin>
      <kavorplugin name="LightOmni" type="light">
        <parameters>
          <parameter type="color" name="color" listType="none" label="color">
            <value>
              <r>0.5</r>
)";
    EXPECT_EQ(xml.substr(0, start.size()), start);
}

TEST(LightXml, DirectionalSpotRectangleAndIESAssets) {
    MayaDirectLight direct;
    direct.shadowBias = 0.5f;
    direct.shadowRadius = 1.5f;
    direct.shadows = false;
    EXPECT_EQ(xmlOf(direct, "/Env"),
              asset("/Env/MayaLightDirect", "MayaLightDirect",
                    {C("color", "1", "1", "1"), C("shadowColor", "0", "0", "0"), F("shadowBias", "0.5"),
                     F("shadowRadius", "1.5"), I("causticSubdivs", "1000"), I("photonSubdivs", "500"),
                     I("shadowSubdivs", "8"), B("enabled", true), B("shadows", false)}));

    SpotLight spot;
    spot.barnDoorLeft = 1;
    spot.barnDoorRight = 2;
    spot.barnDoorTop = 3;
    spot.barnDoorBottom = 4;
    spot.shadowBias = 0.25f;
    spot.decay = 0.5f;
    spot.shadowRadius = 0.75f;
    spot.penumbraAngle = 5;
    spot.units = 2;
    spot.barnDoor = true;
    spot.affectDiffuse = false;
    EXPECT_EQ(xmlOf(spot),
              asset("/Sky/LightSpot", "LightSpot",
                    {C("color", "1", "1", "1"), C("shadowColor", "0", "0", "0"), F("cutoffThreshold", "0.005"),
                     F("barnDoorLeft", "1"), F("barnDoorRight", "2"), F("barnDoorTop", "3"),
                     F("barnDoorBottom", "4"), F("shadowBias", "0.25"), F("decay", "0.5"), F("intensity", "50"),
                     F("shadowRadius", "0.75"), F("coneAngle", "1"), F("penumbraAngle", "5"), I("units", "2"),
                     I("photonSubdivs", "500"), I("causticSubdivs", "1000"), I("shadowSubdivs", "8"),
                     B("enabled", true), B("barnDoor", true), B("shadows", true), B("affectDiffuse", false),
                     B("affectSpecular", true), identityTransform("transform")}));

    RectangleLight rect;
    rect.u_size = 2;
    rect.v_size = 3;
    rect.shadowBias = 0.25f;
    rect.doubleSided = true;
    rect.lightPortal = true;
    rect.affectReflections = false;
    EXPECT_EQ(xmlOf(rect),
              asset("/Sky/LightRectangle", "LightRectangle",
                    {C("color", "1", "1", "1"), C("shadowColor", "0", "0", "0"), F("cutoffThreshold", "0.005"),
                     F("shadowBias", "0.25"), F("intensity", "30"), F("u_size", "2"), F("v_size", "3"),
                     I("units", "0"), I("photonSubdivs", "500"), I("causticSubdivs", "1000"), I("subdivs", "8"),
                     B("enabled", true), B("doubleSided", true), B("invisible", false), B("lightPortal", true),
                     B("noDecay", false), B("storeWithIrradianceMap", false), B("ignoreLightNormals", true),
                     B("shadows", true), B("affectDiffuse", true), B("affectSpecular", true),
                     B("affectReflections", false), identityTransform("transform")}));

    IESLight ies;
    ies.filter_color = {0.5f, 0.5f, 0.25f};
    ies.photonSubdivs = 16;
    ies.soft_shadows = true;
    ies.ies_file = "C:\\lights\\a&b.ies";
    EXPECT_EQ(xmlOf(ies),
              asset("/Sky/LightIES", "LightIES",
                    {identityTransform("transform"), C("color", "1", "1", "1"), C("shadowColor", "0", "0", "0"),
                     C("filter_color", "0.5", "0.5", "0.25"), F("shadowBias", "0"), F("cutoffThreshold", "0.005"),
                     F("intensity", "1"), I("photonSubdivs", "16"), I("causticSubdivs", "1000"),
                     I("shadow_subdivs", "8"), B("enabled", true), B("shadows", true), B("soft_shadows", true),
                     B("affectDiffuse", true), B("affectSpecular", true),
                     S("ies_file", "C:\\lights\\a&amp;b.ies")}));

    SphereLight sphere;
    EXPECT_EQ(xmlOf(sphere), "");
}

TEST(SunLightXml, FirstSunAsset) {
    SunLight sun;
    sun.shadowBias = 0.5f;
    sun.size_multiplier = 2;
    sun.shadows = false;
    sun.invisible = true;
    EXPECT_EQ(xmlOf(sun, "/Oak/environment"),
              asset("/SunLight", "SunLight",
                    {V("up_vector", "0", "0", "1"), F("shadowBias", "0.5"), F("turbidity", "3"),
                     F("water_vapour", "2"), F("intensity_multiplier", "1"), F("size_multiplier", "2"),
                     F("photon_radius", "50"), F("photon_emit_distance", "150"), F("ozone", "0.35"),
                     I("photonSubdivs", "500"), I("causticSubdivs", "1000"), I("shadow_subdivs", "8"),
                     B("enabled", true), B("shadows", false), B("invisible", true)}));
}

TEST(SunLightXml, OneAssetPerIdentifierNamedInWritingOrder) {
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
    EXPECT_EQ(writer.sunUrls(), (std::map<std::string, std::string>{
                                    {"{id-a}", "/SunLight"}, {"{id-b}", "/SunLight1"}, {"{id-c}", "/SunLight2"}}));
    EXPECT_EQ(writer.depth(), 0u);
}

TEST(SunLight, IdentifiersAndTheNamedConstructor) {
    const SunLight a, b;
    EXPECT_FALSE(a.identifier.empty());
    EXPECT_NE(a.identifier, b.identifier);
    EXPECT_EQ(a.name, "");

    SunLight shared("Default", "{D3BE9766-E4AA-418b-81A9-23414A2BA98D}");
    EXPECT_EQ(shared.name, "Default");
    EXPECT_EQ(shared.identifier, "{D3BE9766-E4AA-418b-81A9-23414A2BA98D}");
    auto defaults = boost::make_shared<SunLight>();
    defaults->name = shared.name;
    defaults->identifier = shared.identifier;
    EXPECT_TRUE(shared.isEqual(defaults)); // otherwise the defaults

    // The identifier is part of what a sun is.
    defaults->identifier = a.identifier;
    EXPECT_FALSE(shared.isEqual(defaults));
}
