// BRDF layers: the factory, every record version of every kind (assembled by hand
// from random values), the Fresnel switch of the older reflection records,
// comparison, copies and the XML assets.
#include "TrimSupport.hpp"

#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/textures/Textures.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// A record of one version assembled field by field from random values, and the
// layer that reading it must give: a new layer holding what the record holds.
template <class B>
struct Layout {
    std::mt19937 rng;
    bool textures;         // seed 0: every texture item absent, every path empty
    std::int32_t legacyOn; // the Fresnel switch of the older reflection records
    float legacyIor = 0.0f;
    B expect;
    Image image;

    Layout(unsigned version, std::uint32_t seed) : rng(seed), textures(seed != 0), legacyOn(seed % 2 ? 7 : 0) {
        image.version(0, static_cast<std::uint16_t>(version));
    }
    bool coin() { return rng() % 2 == 0; }
    // Never zero, so that flipping any bit changes the value.
    float real() { return std::uniform_real_distribution<float>(0.5f, 100.0f)(rng) * (coin() ? 1.0f : -1.0f); }
    TexturePtr texture() {
        if (!textures || coin()) return {};
        switch (rng() % 3) {
        case 0: return boost::make_shared<AColorTexture>(AColor{real(), real(), real(), real()});
        case 1: return boost::make_shared<CheckerTexture>();
        default: return makeBitmapTexture("maps/m\xC3\xA4p " + std::to_string(rng()) + ".png");
        }
    }

    Layout& c(Color B::*m) {
        expect.*m = Color{real(), real(), real()};
        image.f32({(expect.*m).r, (expect.*m).g, (expect.*m).b});
        return *this;
    }
    Layout& f(float B::*m) { image.f32({expect.*m = real()}); return *this; }
    Layout& i(std::int32_t B::*m) { image.i32(expect.*m = static_cast<std::int32_t>(rng())); return *this; }
    Layout& ior() { image.f32({legacyIor = 1.25f + real()}); return *this; }
    Layout& on() { image.i32(legacyOn); return *this; }
    Layout& tex(TexturePtr B::*m) {
        const TexturePtr& t = expect.*m = texture();
        image.flag(static_cast<bool>(t));
        if (t) image.i32(t->kindId()).append(recordOf(*t));
        return *this;
    }
    // A bitmap path, or an empty one for no texture.
    Layout& path(TexturePtr B::*m) {
        const std::string file = texture() ? "C:/maps/" + std::to_string(rng()) + ".png" : "";
        image.text(file);
        expect.*m = makeBitmapTexture(file);
        return *this;
    }
    Layout& base() {
        expect.name = "layer \xC3\xA9 " + std::to_string(rng());
        expect.flag1 = coin(), expect.flag2 = coin(), expect.flag3 = coin();
        image.version(0, 4).text(expect.name).flag(expect.flag1).flag(expect.flag2).flag(expect.flag3);
        return *this;
    }
    void fresnel(TexturePtr B::*m) {
        if (legacyOn == 0) return;
        auto made = boost::make_shared<FresnelTexture>();
        made->fresnel_ior = legacyIor;
        expect.*m = made;
    }
};

void diffuse(Layout<Diffuse_BRDF>& r, unsigned v) {
    using B = Diffuse_BRDF;
    r.c(&B::color).c(&B::transparency).f(&B::colorTexMult).f(&B::transparencyTexMult);
    if (v == 1) r.path(&B::colorTex).path(&B::transparencyTex);
    if (v >= 2) r.tex(&B::colorTex).tex(&B::transparencyTex);
    if (v >= 3) r.base();
}

void glass(Layout<Glass_BRDF>& r, unsigned v) {
    using B = Glass_BRDF;
    r.c(&B::color).c(&B::fogColor).f(&B::ior).f(&B::ior2).f(&B::cutoff).f(&B::fogColorMult).f(&B::glossiness);
    r.i(&B::extraInt).i(&B::subdivs).i(&B::affectShadows).i(&B::affectAlpha);
    if (v >= 2) r.f(v >= 5 ? &B::colorTexMult : &B::transparencyTexMult).f(&B::glossinessTexMult).f(&B::iorTexMult);
    if (v == 2 || v == 3) r.path(&B::transparencyTex).path(&B::glossinessTex).path(&B::iorTex);
    if (v >= 3) r.i(&B::translucencyOn).f(&B::thickness).f(&B::scatterCoeff).f(&B::scatterDirection);
    if (v >= 3) r.f(&B::translucencyTexMult).c(&B::translucency);
    if (v == 3) r.path(&B::translucencyTex);
    if (v >= 4) r.tex(v == 4 ? &B::transparencyTex : &B::colorTex);
    if (v >= 4) r.tex(&B::glossinessTex).tex(&B::iorTex).tex(&B::translucencyTex);
    if (v >= 5) r.c(&B::transparency).f(&B::transparencyTexMult).tex(&B::transparencyTex);
    if (v >= 6) r.base();
}

void mirror(Layout<Mirror_BRDF>& r, unsigned v) {
    using B = Mirror_BRDF;
    r.c(&B::color).c(&B::transparency).f(&B::transparencyTexMult);
    if (v <= 4) r.ior();
    r.f(&B::cutoff);
    if (v <= 4) r.on();
    r.i(&B::extraInt);
    if (v <= 2) r.path(&B::transparencyTex);
    if (v == 2) r.f(&B::colorTexMult).path(&B::colorTex);
    if (v >= 3) r.f(&B::colorTexMult).tex(&B::transparencyTex).tex(&B::colorTex);
    if (v >= 4) r.base();
    if (v <= 4) r.fresnel(&B::transparencyTex);
}

template <class B>
void glossy(Layout<B>& r, unsigned v) {
    r.c(&B::color).c(&B::transparency).f(&B::hilightGlossiness).f(&B::reflectionGlossiness);
    if (v <= 5) r.ior();
    r.f(&B::cutoff).i(&B::subdivs);
    if (v <= 5) r.on();
    r.i(&B::backSide).i(&B::extraInt);
    if (v >= 2) r.f(&B::colorTexMult).f(&B::hilightGlossinessTexMult).f(&B::reflectionGlossinessTexMult);
    if (v >= 6) r.f(&B::transparencyTexMult);
    if (v == 2 || v == 3) r.path(&B::colorTex).path(&B::hilightGlossinessTex).path(&B::reflectionGlossinessTex);
    if (v >= 4) r.tex(&B::colorTex).tex(&B::hilightGlossinessTex).tex(&B::reflectionGlossinessTex);
    if (v >= 6) r.tex(&B::transparencyTex);
    if (v >= 3) r.f(&B::anisotropy).f(&B::anisotropyRotation);
    if (v >= 5) r.base();
    if (v <= 5) r.fresnel(&B::transparencyTex);
}

void light(Layout<Light_BRDF>& r, unsigned v) {
    using B = Light_BRDF;
    if (v == 1) r.c(&B::color).f(&B::intensity).f(&B::transparencyTexMult).path(&B::transparencyTex);
    if (v == 1) return;
    r.c(&B::color).c(&B::transparency).f(&B::intensity).f(&B::extraFloat).f(&B::colorTexMult);
    r.f(&B::transparencyTexMult);
    if (v == 2) r.path(&B::colorTex).path(&B::transparencyTex);
    if (v >= 3) r.tex(&B::colorTex).tex(&B::transparencyTex);
    if (v >= 4) r.base();
    if (v >= 5) r.i(&B::doubleSided);
}

// Calls check(layout, current version) for every kind.
template <class Check>
void forEveryKind(Check check) {
    check(diffuse, 3);
    check(glass, 6);
    check(mirror, 5);
    check(glossy<Phong_BRDF>, 6);
    check(glossy<Blinn_BRDF>, 6);
    check(light, 5);
}

// The layer class of a layout function.
template <class B>
B layerOf(void (*)(Layout<B>&, unsigned));

template <class B>
void expectSameBase(const Base_BRDF& read, const B& expect) {
    EXPECT_EQ(read.name, expect.name);
    EXPECT_EQ((std::array{read.flag1, read.flag2, read.flag3}), (std::array{expect.flag1, expect.flag2, expect.flag3}));
}

} // namespace

// (Each kind's plugin type and default name: the golden documents.)
TEST(BRDF, FactoryKindsAndDefaults) {
    for (std::int32_t kind : {0, 3, 6, 64, 128, -1, INT_MIN}) EXPECT_FALSE(createBRDF(kind)) << kind;
    // Each reflection layer has a Fresnel transparency of its own (Phong and Blinn:
    // the golden documents), and so has its copy.
    const auto mirror = boost::make_shared<Mirror_BRDF>();
    ASSERT_TRUE(dynamic_cast<FresnelTexture*>(mirror->transparencyTex.get()));
    EXPECT_NE(mirror->transparencyTex, Mirror_BRDF().transparencyTex);
    const BRDFPtr copy = mirror->clone();
    auto& copied = static_cast<Mirror_BRDF&>(*copy).transparencyTex;
    EXPECT_NE(copied, mirror->transparencyTex);
    static_cast<FresnelTexture&>(*copied).fresnel_ior = 2.0f;
    EXPECT_FALSE(copy->isEqual(mirror));
}

// Every version reads to the layer it holds (the fields it lacks at their
// defaults, name and flags only with a base record; an absent transparency item
// leaves no texture, although a new reflection layer has a Fresnel one); the
// current one writes back byte for byte, and so do its copies. Changing any stored
// value outside the base record makes the layers unequal; the name and the flags
// are not compared.
TEST(BRDFRecord, EveryVersionOfEveryKind) {
    forEveryKind([](auto layout, unsigned current) {
        using B = decltype(layerOf(layout));
        for (unsigned v = 1; v <= current; ++v) {
            for (std::uint32_t seed = 0; seed < 6; ++seed) {
                Layout<B> r(v, seed);
                layout(r, v);
                SCOPED_TRACE(std::string(B::kInfo.what) + " version " + std::to_string(v) + " seed " +
                             std::to_string(seed));
                const BRDFPtr expect = boost::make_shared<B>(r.expect), read = createBRDF(B::kInfo.kind);
                QuickArchive ar;
                ASSERT_TRUE(readInto(*read, r.image.bytes, &ar)) << failureOf(ar);
                EXPECT_TRUE(read->isEqual(expect));
                expectSameBase(*read, r.expect);
                if (v < current) continue;
                EXPECT_EQ(expectRoundTrip(read, [] { return createBRDF(B::kInfo.kind); }), r.image.bytes);
                const BRDFPtr copy = read->clone();
                EXPECT_EQ(xmlOf(*copy, "/M"), xmlOf(*read, "/M"));
                if (seed != 0) continue;
                const ByteVector& bytes = r.image.bytes;
                const std::size_t baseEnd = bytes.size() - (B::kInfo.kind == Base_BRDF::kLight ? 4 : 0);
                const std::size_t baseBegin = baseEnd - 11 - r.expect.name.size();
                const std::size_t compared = expectEveryStoredByteCompared(
                    expect, bytes, [] { return createBRDF(B::kInfo.kind); }, baseBegin, baseEnd);
                EXPECT_GE(compared + 20 + r.expect.name.size(), bytes.size());
                copy->name = "other";
                copy->flag3 = !copy->flag3;
                EXPECT_TRUE(copy->isEqual(expect));
                EXPECT_FALSE(expect->isEqual(BRDFPtr()));
            }
        }
    });
}

TEST(BRDFRecord, MirrorFresnelSwitch) {
    // Version 1 with the switch on: a Fresnel texture of the stored index, whatever
    // the path; with the switch off the path decides.
    const auto mirrorV1 = [](std::int32_t on) {
        Mirror_BRDF mirror;
        const Image head = Image{}.version(0, 1).f32({1, 1, 1, 1, 1, 1, 1, 1.6f, 0.01f});
        EXPECT_TRUE(readInto(mirror, Image(head).i32(on).i32(1).text("C:/maps/a.png").bytes));
        return mirror.transparencyTex;
    };
    const auto fresnel = boost::dynamic_pointer_cast<FresnelTexture>(mirrorV1(1));
    ASSERT_TRUE(fresnel);
    EXPECT_EQ(fresnel->fresnel_ior, 1.6f);
    EXPECT_TRUE(mirrorV1(0)->isEqual(makeBitmapTexture("C:/maps/a.png")));
}

TEST(BRDFRecord, GlassKeepsItsFieldsThroughItsRead) {
    Glass_BRDF layer;
    layer.transparency = Color{0.25f, 0.5f, 0.75f}, layer.colorTex = boost::make_shared<AColorTexture>();
    layer.name = "Old", layer.flag1 = false;
    Layout<Glass_BRDF> r(1, 1);
    glass(r, 1);
    ASSERT_TRUE(readInto(layer, r.image.bytes));
    EXPECT_EQ(layer.ior, r.expect.ior);
    EXPECT_EQ(layer.transparency, (Color{0.25f, 0.5f, 0.75f}));
    EXPECT_TRUE(layer.colorTex);
    expectSameBase(layer, Glass_BRDF());
}

// (Failing textures, strings and first halves of version words in any record:
// the texture, archive and hostile-input tests.)
TEST(BRDFRecord, RefusedRecordsSayWhy) {
    const ByteVector diffuse = Image{}.f32({1, 1, 1, 0, 0, 0, 1, 1}).bytes;
    Diffuse_BRDF layer;
    expectReadFails(layer, Image{}.version(0, 4).append(diffuse).bytes, "unknown diffuse BRDF version (0, 4)");
    expectReadFails(layer, Image{}.version(0, 3).append(diffuse).flag(true).i32(41).bytes,
                    R"(texture "color_tex": unknown texture kind 41)");
    expectReadFails(layer, Image{}.version(0, 3).append(diffuse).flag(false).flag(false).version(0, 5).bytes,
                    "base record: unknown BRDF base record version (0, 5)");
}

// --- XML ---

// Each kind with one texture present and the others absent: the texture's asset
// first, under the layer's url and the texture's suffix, then the layer's asset.
// Phong and Blinn show the default Fresnel transparency and the same document.
TEST(BRDFXml, AssetsOfEveryKind) {
    const TexturePtr tex = boost::make_shared<AColorTexture>(AColor{0.25f, 0.5f, 1.0f, 1.0f});
    Diffuse_BRDF diffuse;
    diffuse.name = "A&B", diffuse.colorTex = tex;
    Glass_BRDF glass;
    glass.colorTex = tex, glass.affectAlpha = -2;
    Mirror_BRDF mirror;
    mirror.transparencyTex.reset(), mirror.colorTex = tex;
    Phong_BRDF phong;
    Blinn_BRDF blinn;
    Light_BRDF light;
    light.transparencyTex = tex;
    expectGolden(xmlOf(diffuse, "/Oak"), "brdf_diffuse.xml");
    expectGolden(xmlOf(glass, "/M"), "brdf_glass.xml");
    expectGolden(xmlOf(mirror, "/M"), "brdf_mirror.xml");
    expectGolden(xmlOf(phong, "/M"), "brdf_glossy.xml");
    expectGolden(xmlOf(blinn, "/M"), "brdf_glossy.xml"); // another kind with the same document
    EXPECT_FALSE(boost::make_shared<Phong_BRDF>()->isEqual(boost::make_shared<Blinn_BRDF>()));
    expectGolden(xmlOf(light, "/M"), "brdf_light.xml");
}
