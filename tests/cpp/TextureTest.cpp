// Textures: the factory and kind names, round trips of every kind, the old record
// versions, member checks, the XML assets, colour inversion and deep trees.
#include "TextureTestSupport.hpp"

#include "lights/BaseLight.hpp"
#include "textures/BitmapBuffer.hpp"
#include "textures/Textures.hpp"
#include "textures/UVWGenerators.hpp"

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <climits>
#include <cmath>
#include <cstdint>
#include <random>
#include <string>

using namespace OrvexKavorCore;
using namespace texturetest;

namespace {

// Textures, generators and bitmaps with random content.
struct Random {
    std::mt19937 rng;

    explicit Random(std::uint32_t seed) : rng(seed) {}

    float real() { return std::uniform_real_distribution<float>(-100.0f, 100.0f)(rng); }
    std::int32_t integer() { return std::uniform_int_distribution<std::int32_t>(INT_MIN, INT_MAX)(rng); }
    bool coin() { return std::bernoulli_distribution(0.5)(rng); }
    Color color() { return Color{real(), real(), real()}; }
    AColor acolor() { return AColor{real(), real(), real(), real()}; }

    UVWPtr uvw() {
        const std::int32_t kinds[] = {0, 1, 3, 4};
        const UVWPtr made = createUVW(kinds[rng() % 4]);
        if (auto* p = dynamic_cast<GenProjectionUVW*>(made.get())) p->uvwComponents.z_rotation = real();
        if (auto* e = dynamic_cast<GenEnvironmentUVW*>(made.get())) e->mappingType = integer();
        if (auto* c = dynamic_cast<GenChannelUVW*>(made.get())) c->uvw_channel = integer();
        return made;
    }

    BitmapPtr bitmap() {
        auto b = boost::make_shared<BitmapBuffer>();
        b->file = "maps/ch\xC3\xAAne " + std::to_string(rng()) + ".png";
        b->filter_type = integer();
        b->filter_blur = real();
        b->gamma = real();
        return b;
    }

    // A texture for a mandatory member: a colour at the bottom, any kind above but
    // the sky (whose copies differ from it by design).
    TexturePtr texture(int depth) {
        if (depth <= 0) return filled(BaseTexture::kAColor, 0);
        return filled(static_cast<std::int32_t>(rng() % BaseTexture::kSky), depth - 1);
    }
    // A texture for an optional member: present or not.
    TexturePtr maybe(int depth) { return coin() ? texture(depth) : TexturePtr(); }

    // A texture of `kind` with every field and member random.
    TexturePtr filled(std::int32_t kind, int depth) {
        const TexturePtr made = createTexture(kind);
        BaseTexture* t = made.get();
        if (auto* b = dynamic_cast<BitmapTexture*>(t)) {
            b->uvwgen = uvw();
            b->bitmap = bitmap();
            b->tile = coin();
        } else if (auto* f = dynamic_cast<FresnelTexture*>(t)) {
            f->black_color_tex = maybe(depth);
            f->white_color_tex = maybe(depth);
            f->fresnel_ior_tex = maybe(depth);
            f->refract_ior_tex = maybe(depth);
            f->white_color = color();
            f->black_color = color();
            for (float* v : {&f->fresnel_ior, &f->refract_ior, &f->black_color_tex_mult, &f->white_color_tex_mult,
                             &f->fresnel_ior_tex_mult, &f->refract_ior_tex_mult})
                *v = real();
        } else if (auto* u = dynamic_cast<UVWTexture*>(t)) {
            u->uvwgen = uvw();
        } else if (auto* n = dynamic_cast<NoiseTexture*>(t)) {
            n->uvwgen = uvw();
            n->color1_tex = maybe(depth);
            n->color2_tex = maybe(depth);
            n->color1 = color();
            n->color2 = color();
            for (float* v : {&n->persistence, &n->amplitude_ratio, &n->frequency_ratio, &n->frequency1, &n->amplitude1,
                             &n->size, &n->mix_ratio, &n->bias, &n->color1_tex_mult, &n->color2_tex_mult})
                *v = real();
            for (std::int32_t* v : {&n->octaves, &n->noiseType, &n->inflection}) *v = integer();
        } else if (auto* c = dynamic_cast<CheckerTexture*>(t)) {
            c->uvwgen = uvw();
            c->white_color = texture(depth);
            c->black_color = texture(depth);
            c->whiteFactor = real();
            c->blackFactor = real();
            c->tile_u = coin();
            c->tile_v = coin();
        } else if (auto* a = dynamic_cast<AColorTexture*>(t)) {
            a->texture = acolor();
        } else if (auto* g = dynamic_cast<GridTexture*>(t)) {
            g->uvwgen = uvw();
            g->line_color = texture(depth);
            g->fill_color = texture(depth);
            for (float* v : {&g->lineFactor, &g->fillFactor, &g->u_width, &g->v_width}) *v = real();
        } else if (auto* cl = dynamic_cast<ClothTexture*>(t)) {
            cl->uvwgen = uvw();
            cl->gap_color = acolor();
            cl->u_color = acolor();
            cl->v_color = acolor();
            cl->u_width = real();
            cl->v_width = real();
            cl->tile = coin();
        } else if (auto* bu = dynamic_cast<BulgeTexture*>(t)) {
            bu->uvwgen = uvw();
            bu->u_width = real();
            bu->v_width = real();
        } else if (auto* i = dynamic_cast<InvertTexture*>(t)) {
            i->texture = texture(depth);
            i->invert_alpha = coin();
        } else if (auto* bl = dynamic_cast<BlendTexture*>(t)) {
            // A factor is stored only with its texture.
            bl->color_a = maybe(depth);
            bl->color_b = maybe(depth);
            if (bl->color_a) bl->colorAFactor = real();
            if (bl->color_b) bl->colorBFactor = real();
            bl->blend_amount = real();
        } else if (auto* r = dynamic_cast<RampTexture*>(t)) {
            r->uvwgen = uvw();
            r->colors = texture(depth);
            r->positions = real();
            r->u_wave = real();
            r->v_wave = real();
            r->type = integer();
            r->interpolation = integer();
        } else if (auto* s = dynamic_cast<SkyTexture*>(t)) {
            auto sun = boost::make_shared<SunLight>("sun " + std::to_string(rng()), newUuidText());
            sun->turbidity = real();
            sun->transform.setValue(Transform{Matrix::identity(), Vector{real(), real(), real()}}, 2.0);
            s->sun = sun;
            s->transform.setValue(Transform{Matrix::identity(), Vector{real(), 0, 0}}, 1.5);
            s->up_vector = Vector{real(), real(), real()};
            for (float* v : {&s->shadowBias, &s->turbidity, &s->water_vapour, &s->intensity_multiplier,
                             &s->size_multiplier, &s->photon_radius, &s->photon_emit_distance, &s->ozone})
                *v = real();
            for (std::int32_t* v : {&s->photonSubdivs, &s->causticSubdivs, &s->shadow_subdivs}) *v = integer();
            s->flag1 = coin();
            s->flag2 = coin();
        }
        return made;
    }
};

ByteVector planarWorldRecord() {
    GenPlanarWorldUVW uvw;
    return recordOf(uvw);
}

ByteVector colorRecord(AColor c) {
    return Image{}.version(0, 1).f32({c.r, c.g, c.b, c.a}).bytes;
}

// A mandatory texture member holding a colour texture.
Image& colorMember(Image& image, AColor c) { return image.i32(BaseTexture::kAColor).append(colorRecord(c)); }

} // namespace

// --- factory, kind names, plugin types ---

TEST(Texture, FactoryKindsNamesAndPluginTypes) {
    const char* plugins[] = {"TexBitmap", "TexFresnel", "TexUVW",    "TexNoise", "TexChecker", "TexAColor", "TexGrid",
                             "TexCloth",  "TexBulge",   "TexInvert", "TexBlend", "TexRamp",    "TexSky"};
    const char* names[] = {"Bitmap", "Fresnel", "UVW",    "Noise", "Checker", "AColor", "Grid",
                           "Cloth",  "Bulge",   "Invert", "Blend", "Ramp",    "Sky"};
    for (std::int32_t kind = 0; kind < BaseTexture::kKindCount; ++kind) {
        const TexturePtr t = createTexture(kind);
        ASSERT_TRUE(t) << kind;
        EXPECT_EQ(t->kindId(), kind);
        EXPECT_EQ(t->pluginType(), plugins[kind]);
        EXPECT_EQ(t->assetType(), "texture");
        EXPECT_EQ(textureKindName(kind), names[kind]);
    }
    for (std::int32_t kind : {-1, 13, INT_MIN, INT_MAX}) {
        EXPECT_FALSE(createTexture(kind)) << kind;
        EXPECT_EQ(textureKindName(kind), "") << kind;
    }
}

TEST(Texture, MakeBitmapTexture) {
    EXPECT_FALSE(makeBitmapTexture(""));
    const TexturePtr made = makeBitmapTexture("C:/maps/Oak.png");
    const auto* bitmap = dynamic_cast<BitmapTexture*>(made.get());
    ASSERT_TRUE(bitmap);
    EXPECT_TRUE(bitmap->uvwgen->isEqual(boost::make_shared<GenChannelUVW>()));
    auto buffer = boost::make_shared<BitmapBuffer>();
    buffer->file = "C:/maps/Oak.png";
    EXPECT_TRUE(bitmap->bitmap->isEqual(buffer));
    EXPECT_TRUE(bitmap->tile);
}

// --- records ---

TEST(Texture, RandomRoundTripsOfEveryKind) {
    Random random(20240612);
    for (std::int32_t kind = 0; kind < BaseTexture::kKindCount; ++kind) {
        for (int round = 0; round < 12; ++round) {
            const TexturePtr original = random.filled(kind, 2);
            const ByteVector bytes = recordOf(*original);

            const TexturePtr read = createTexture(kind);
            QuickArchive ar;
            ASSERT_TRUE(readInto(*read, bytes, &ar)) << kind << ": " << failureOf(ar);
            EXPECT_TRUE(read->isEqual(original)) << kind;
            EXPECT_TRUE(original->isEqual(read)) << kind;
            EXPECT_EQ(recordOf(*read), bytes) << kind;

            const TexturePtr copy = original->clone();
            ASSERT_TRUE(copy);
            ASSERT_NE(copy, original);
            // A sky's copy has an identifier of its own; with the original's it is the same sky.
            if (auto* sky = dynamic_cast<SkyTexture*>(copy.get()))
                sky->identifier = static_cast<SkyTexture&>(*original).identifier;
            EXPECT_TRUE(copy->isEqual(original)) << kind;
            EXPECT_EQ(recordOf(*copy), bytes) << kind;
        }
    }
}

TEST(Texture, CloneSeparatesMembersWhereTheCopyConstructorSharesThem) {
    Random random(7);
    const TexturePtr original = random.filled(BaseTexture::kChecker, 1);
    const auto& checker = static_cast<CheckerTexture&>(*original);

    const CheckerTexture shallow(checker);
    EXPECT_EQ(shallow.white_color, checker.white_color);

    const TexturePtr deep = original->clone();
    const auto& copy = static_cast<CheckerTexture&>(*deep);
    EXPECT_NE(copy.uvwgen, checker.uvwgen);
    EXPECT_NE(copy.white_color, checker.white_color);
    EXPECT_NE(copy.black_color, checker.black_color);
    // Changing the copy's member leaves the original alone.
    invertColors(copy.white_color);
    EXPECT_FALSE(copy.white_color->isEqual(checker.white_color));
    EXPECT_FALSE(deep->isEqual(original));
}

TEST(Texture, ComparisonSeesMembersFieldsAndKinds) {
    auto checker = boost::make_shared<CheckerTexture>();
    EXPECT_TRUE(checker->isEqual(boost::make_shared<CheckerTexture>()));
    EXPECT_FALSE(checker->isEqual(TexturePtr()));
    EXPECT_FALSE(checker->isEqual(boost::make_shared<GridTexture>()));

    // A factor that appears nowhere but the record still counts.
    auto other = boost::make_shared<CheckerTexture>();
    other->blackFactor = 0.5f;
    EXPECT_FALSE(checker->isEqual(other));

    // A difference inside a member.
    other = boost::make_shared<CheckerTexture>();
    static_cast<AColorTexture&>(*other->black_color).texture.a = 0.5f;
    EXPECT_FALSE(checker->isEqual(other));

    // A set optional member against an empty one, either way round.
    auto fresnel = boost::make_shared<FresnelTexture>();
    auto withTexture = boost::make_shared<FresnelTexture>();
    withTexture->refract_ior_tex = boost::make_shared<AColorTexture>();
    EXPECT_FALSE(fresnel->isEqual(withTexture));
    EXPECT_FALSE(withTexture->isEqual(fresnel));
}

TEST(Texture, DefaultCheckerRecord) {
    CheckerTexture checker;
    Image expected;
    expected.version(0, 2).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord());
    colorMember(expected, {1, 1, 1, 1});
    colorMember(expected, {0, 0, 0, 1});
    expected.u8(1).u8(1).f32({1, 1});
    EXPECT_EQ(recordOf(checker), expected.bytes);
    EXPECT_EQ((ByteVector(expected.bytes.begin(), expected.bytes.begin() + 4)), (ByteVector{0, 0, 2, 0}));
}

TEST(Texture, OlderVersionsReadWithDefaultsAndWriteBackAsNewest) {
    // Checker 1: no factors.
    {
        Image v1;
        v1.version(0, 1).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord());
        colorMember(v1, {0.25f, 0.5f, 0.75f, 1});
        colorMember(v1, {0, 0, 0, 1});
        v1.flag(false).flag(true);
        CheckerTexture read;
        read.whiteFactor = read.blackFactor = 9;
        ASSERT_TRUE(readInto(read, v1.bytes));
        EXPECT_EQ(read.whiteFactor, 1.0f);
        EXPECT_EQ(read.blackFactor, 1.0f);
        EXPECT_FALSE(read.tile_u);
        EXPECT_TRUE(read.tile_v);
        EXPECT_EQ(static_cast<AColorTexture&>(*read.white_color).texture, (AColor{0.25f, 0.5f, 0.75f, 1}));
        ByteVector v2 = v1.bytes;
        v2[2] = 2;
        EXPECT_EQ(recordOf(read), Image{v2}.f32({1, 1}).bytes);
    }
    // Grid 1: the widths without the factors in front of them.
    {
        Image v1;
        v1.version(0, 1).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord());
        colorMember(v1, {1, 0, 0, 1});
        colorMember(v1, {0, 1, 0, 1});
        v1.f32({0.25f, 0.5f});
        GridTexture read;
        ASSERT_TRUE(readInto(read, v1.bytes));
        EXPECT_EQ(read.u_width, 0.25f);
        EXPECT_EQ(read.v_width, 0.5f);
        EXPECT_EQ(read.lineFactor, 1.0f);
        EXPECT_EQ(read.fillFactor, 1.0f);
        Image v2;
        v2.version(0, 2).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord());
        colorMember(v2, {1, 0, 0, 1});
        colorMember(v2, {0, 1, 0, 1});
        v2.f32({1, 1, 0.25f, 0.5f});
        EXPECT_EQ(recordOf(read), v2.bytes);
    }
    // Cloth 1: no tile flag; tile stays true.
    {
        const Image body = Image{}
                               .i32(BaseUVW::kPlanarWorld)
                               .append(planarWorldRecord())
                               .f32({0.5f, 0.5f, 0.5f, 1})
                               .f32({1, 0, 0, 1})
                               .f32({0, 0, 1, 1})
                               .f32({0.2f, 0.3f});
        ClothTexture read;
        read.tile = false;
        ASSERT_TRUE(readInto(read, Image{}.version(0, 1).append(body.bytes).bytes));
        EXPECT_TRUE(read.tile);
        EXPECT_EQ(read.u_color, (AColor{1, 0, 0, 1}));
        EXPECT_EQ(read.v_width, 0.3f);
        EXPECT_EQ(recordOf(read), Image{}.version(0, 2).append(body.bytes).flag(true).bytes);
    }
    // Blend 1: no factors even when both textures are present.
    {
        Image v1;
        v1.version(0, 1).flag(true);
        colorMember(v1, {1, 1, 1, 1});
        v1.flag(true);
        colorMember(v1, {0, 0, 0, 1});
        v1.f32({0.75f});
        BlendTexture read;
        ASSERT_TRUE(readInto(read, v1.bytes));
        EXPECT_EQ(read.colorAFactor, 1.0f);
        EXPECT_EQ(read.colorBFactor, 1.0f);
        EXPECT_EQ(read.blend_amount, 0.75f);
        Image v2;
        v2.version(0, 2).flag(true);
        colorMember(v2, {1, 1, 1, 1});
        v2.f32({1}).flag(true);
        colorMember(v2, {0, 0, 0, 1});
        v2.f32({1, 0.75f});
        EXPECT_EQ(recordOf(read), v2.bytes);
    }
    // Fresnel 1: two colours and two indices; no multipliers, no textures.
    {
        const Image v1 = Image{}.version(0, 1).f32({1, 0, 0}).f32({0, 1, 0}).f32({1.33f, 2.0f});
        FresnelTexture read;
        read.white_color_tex = boost::make_shared<AColorTexture>();
        read.fresnel_ior_tex_mult = 3;
        ASSERT_TRUE(readInto(read, v1.bytes));
        EXPECT_EQ(read.white_color, (Color{1, 0, 0}));
        EXPECT_EQ(read.fresnel_ior, 1.33f);
        EXPECT_EQ(read.refract_ior, 2.0f);
        EXPECT_EQ(read.fresnel_ior_tex_mult, 1.0f);
        EXPECT_FALSE(read.white_color_tex);
        const Image v2 =
            Image{}.version(0, 2).f32({1, 0, 0}).f32({0, 1, 0}).f32({1.33f, 2.0f, 1, 1, 1, 1}).u8(0).u8(0).u8(0).u8(0);
        EXPECT_EQ(recordOf(read), v2.bytes);
    }
}

TEST(Texture, BlendFactorIsStoredOnlyWithItsTexture) {
    BlendTexture blend;
    blend.color_b = boost::make_shared<AColorTexture>();
    blend.colorAFactor = 4;
    blend.colorBFactor = 5;
    Image expected;
    expected.version(0, 2).flag(false).flag(true);
    colorMember(expected, {1, 1, 1, 1});
    expected.f32({5, 0.5f});
    const ByteVector bytes = recordOf(blend);
    EXPECT_EQ(bytes, expected.bytes);
    BlendTexture read;
    ASSERT_TRUE(readInto(read, bytes));
    EXPECT_EQ(read.colorAFactor, 1.0f);
    EXPECT_EQ(read.colorBFactor, 5.0f);
}

TEST(Texture, RefusedVersionsFailAndLeaveDefaults) {
    Random random(3);
    for (std::int32_t kind = 0; kind < BaseTexture::kKindCount; ++kind) {
        if (kind == BaseTexture::kSky) continue; // its identifier is new at every reset (sky tests)
        const std::uint16_t newest = recordOf(*random.filled(kind, 1))[2];
        const std::pair<std::uint16_t, std::uint16_t> refused[] = {{0, 0}, {0, std::uint16_t(newest + 1)}, {1, 1}};
        for (const auto& [a, b] : refused) {
            const TexturePtr t = random.filled(kind, 1);
            const ByteVector bytes = Image{}.version(a, b).bytes;
            QuickArchive ar;
            EXPECT_FALSE(readInto(*t, bytes, &ar)) << kind;
            EXPECT_NE(failureOf(ar).find("version (" + std::to_string(a) + ", " + std::to_string(b) + ")"),
                      std::string::npos)
                << failureOf(ar);
            EXPECT_TRUE(t->isEqual(createTexture(kind))) << kind;
        }
    }
}

TEST(Texture, MandatoryMembersMustBeSetToWrite) {
    for (std::int32_t kind : {BaseTexture::kBitmap, BaseTexture::kUVW, BaseTexture::kNoise, BaseTexture::kGrid,
                              BaseTexture::kCloth, BaseTexture::kInvert, BaseTexture::kRamp}) {
        QuickArchive ar;
        EXPECT_FALSE(createTexture(kind)->writeToArchive(ar)) << kind;
        EXPECT_EQ(ar.writePosition(), 0u) << kind;
    }
    // The bulge texture has written its version word when it finds the generator missing.
    QuickArchive ar;
    EXPECT_FALSE(BulgeTexture().writeToArchive(ar));
    EXPECT_EQ(ar.writePosition(), 4u);

    CheckerTexture checker;
    checker.black_color.reset();
    QuickArchive checkerArchive;
    EXPECT_FALSE(checker.writeToArchive(checkerArchive));
    EXPECT_EQ(checkerArchive.writePosition(), 0u);

    // Textures without mandatory members write as they are.
    for (std::int32_t kind : {BaseTexture::kFresnel, BaseTexture::kAColor, BaseTexture::kBlend, BaseTexture::kSky}) {
        QuickArchive any;
        EXPECT_TRUE(createTexture(kind)->writeToArchive(any)) << kind;
    }
}

TEST(Texture, UnknownMemberKindsAreRefusedWithTheirPlace) {
    struct Case {
        std::int32_t kind;
        ByteVector bytes;
        const char* expected;
    };
    const Case cases[] = {
        // A checker whose white colour names texture kind 13.
        {BaseTexture::kChecker,
         Image{}.version(0, 2).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord()).i32(13).bytes,
         "texture white_color: unknown texture kind 13"},
        // An invert texture whose texture is the stored "no texture".
        {BaseTexture::kInvert, Image{}.version(0, 1).i32(-1).bytes, "texture texture: unknown texture kind -1"},
        // A present optional Fresnel texture of kind -1.
        {BaseTexture::kFresnel,
         Image{}.version(0, 2).f32({1, 1, 1, 0, 0, 0, 1, 1, 1, 1, 1, 1}).flag(false).flag(true).i32(-1).bytes,
         "texture white_color_tex: unknown texture kind -1"},
        // A noise texture on generator kind 2.
        {BaseTexture::kNoise, Image{}.version(0, 1).i32(2).bytes, "UVW generator uvwgen: unknown UVW generator kind 2"},
        // A bitmap texture on bitmap kind 1.
        {BaseTexture::kBitmap, Image{}.version(0, 1).i32(BaseUVW::kChannel).i32(1).bytes, "unknown bitmap kind 1"},
        // A bitmap texture on generator kind 2.
        {BaseTexture::kBitmap, Image{}.version(0, 1).i32(2).i32(0).bytes, "unknown UVW generator kind 2"},
    };
    for (const Case& c : cases) {
        const TexturePtr t = createTexture(c.kind);
        QuickArchive ar;
        EXPECT_FALSE(readInto(*t, c.bytes, &ar)) << c.expected;
        EXPECT_NE(failureOf(ar).find(c.expected), std::string::npos) << failureOf(ar);
    }

    // A texture member of kind 13 or -1, and a light member of kind 1.
    for (std::int32_t kind : {13, -1}) {
        const ByteVector bytes = Image{}.i32(kind).bytes;
        QuickArchive ar(bytes.data(), bytes.size());
        TexturePtr member;
        EXPECT_FALSE(readMember(ar, member, "bump_tex"));
        EXPECT_FALSE(member);
    }
    const ByteVector light = Image{}.i32(1).version(0, 4).bytes;
    QuickArchive ar(light.data(), light.size());
    LightPtr member;
    EXPECT_FALSE(readMember(ar, member, "sun"));
    EXPECT_NE(failureOf(ar).find("unknown light kind 1"), std::string::npos) << failureOf(ar);
}

TEST(Texture, FailedMemberReadFailsTheOwner) {
    // The checker's generator record carries a version no generator knows.
    ByteVector uvw = planarWorldRecord();
    uvw[2] = 7;
    const ByteVector bytes = Image{}.version(0, 2).i32(BaseUVW::kPlanarWorld).append(uvw).bytes;
    CheckerTexture checker;
    QuickArchive ar;
    EXPECT_FALSE(readInto(checker, bytes, &ar));
    EXPECT_NE(failureOf(ar).find("UVW generator uvwgen"), std::string::npos) << failureOf(ar);
}

// --- deep trees ---

TEST(Texture, DeeplyNestedRecordFailsCleanly) {
    // An invert texture inside an invert texture, 100,000 deep.
    Image chain;
    for (int i = 0; i < 100000; ++i) chain.version(0, 1).i32(BaseTexture::kInvert);
    chain.version(0, 1).i32(BaseTexture::kAColor).append(colorRecord({1, 1, 1, 1}));
    InvertTexture root;
    QuickArchive ar;
    EXPECT_FALSE(readInto(root, chain.bytes, &ar));
    EXPECT_NE(failureOf(ar).find("nested deeper than 256"), std::string::npos) << failureOf(ar).substr(0, 200);
}

TEST(Texture, DeepTreesBuiltInMemoryStopAtTheLimit) {
    auto chainOf = [](int depth) {
        TexturePtr top = boost::make_shared<AColorTexture>();
        for (int i = 0; i < depth; ++i) {
            auto invert = boost::make_shared<InvertTexture>();
            invert->texture = top;
            top = invert;
        }
        return top;
    };

    // Within the limit every walk goes to the bottom.
    const TexturePtr shallow = chainOf(200);
    const ByteVector bytes = recordOf(*shallow);
    InvertTexture read;
    ASSERT_TRUE(readInto(read, bytes));
    EXPECT_TRUE(shallow->isEqual(shallow->clone()));
    invertColors(shallow);

    // Beyond it the walks stop instead of overflowing the stack, and the tree
    // is destroyed without recursion.
    TexturePtr deep = chainOf(100000);
    QuickArchive ar;
    EXPECT_FALSE(deep->writeToArchive(ar));
    EXPECT_FALSE(deep->isEqual(deep));
    EXPECT_FALSE(deep->isEqual(deep->clone()));
    invertColors(deep);
    const std::string xml = xmlOf(*deep, "/deep");
    std::size_t assets = 0;
    for (std::size_t at = xml.find("<Asset "); at != std::string::npos; at = xml.find("<Asset ", at + 1)) ++assets;
    EXPECT_EQ(assets, 256u);
    deep.reset();
}

// --- XML ---

namespace {

std::string componentTransform() {
    return R"(          <parameter type="componentTransform" name="uvw_transform" listType="none" label="uvw_transform">
            <value>
              <x_rotation>0</x_rotation>
              <y_rotation>0</y_rotation>
              <z_rotation>0</z_rotation>
              <x_scale>1</x_scale>
              <y_scale>1</y_scale>
              <z_scale>1</z_scale>
              <x_offset>0</x_offset>
              <y_offset>0</y_offset>
              <z_offset>0</z_offset>
              <x_mirror>0</x_mirror>
              <y_mirror>0</y_mirror>
              <z_mirror>0</z_mirror>
            </value>
          </parameter>
)";
}

std::string assetFrame(const std::string& url, const char* type, const char* plugin, const std::string& parameters) {
    return "  <Asset layout=\"\" renderer=\"kavor\" type=\"" + std::string(type) + "\" url=\"" + url +
           "\" >\n    <plugin>\n      <kavorplugin name=\"" + plugin + "\" type=\"" + type +
           "\">\n        <parameters>\n" + parameters + "        </parameters>\n      </kavorplugin>\n    </plugin>\n"
           "  </Asset>\n";
}

std::string colorAsset(const std::string& url, const char* r, const char* g, const char* b, const char* a) {
    return assetFrame(url, "texture", "TexAColor",
                      std::string("          <parameter type=\"acolor\" name=\"texture\" listType=\"none\" "
                                  "label=\"texture\">\n            <value>\n              <r>") +
                          r + "</r>\n              <g>" + g + "</g>\n              <b>" + b + "</b>\n              <a>" +
                          a + "</a>\n            </value>\n          </parameter>\n");
}

std::string inlineParameter(const char* type, const char* name, const std::string& value) {
    return std::string("          <parameter type=\"") + type + "\" name=\"" + name + "\" listType=\"none\" label=\"" +
           name + "\">\n            <value>" + value + "</value>\n          </parameter>\n";
}

std::string emptyReference(const char* name) {
    return std::string("          <parameter type=\"plugin\" name=\"") + name + "\" listType=\"none\" label=\"" + name +
           "\">\n          </parameter>\n";
}

std::string colorParameter(const char* name, const char* r, const char* g, const char* b) {
    return std::string("          <parameter type=\"color\" name=\"") + name + "\" listType=\"none\" label=\"" + name +
           "\">\n            <value>\n              <r>" + r + "</r>\n              <g>" + g +
           "</g>\n              <b>" + b + "</b>\n            </value>\n          </parameter>\n";
}

} // namespace

TEST(TextureXml, CheckerWithItsChildren) {
    CheckerTexture checker;
    checker.tile_v = false;
    const std::string url = "/Oak/diffuse_tex";
    const std::string expected =
        assetFrame(url + "/uvwgen", "uvw", "UVWGenPlanarWorld", componentTransform()) +
        colorAsset(url + "/white_color", "1", "1", "1", "1") + colorAsset(url + "/black_color", "0", "0", "0", "1") +
        assetFrame(url, "texture", "TexChecker",
                   inlineParameter("plugin", "uvwgen", "/Oak/diffuse_tex/uvwgen/UVWGenPlanarWorld") +
                       inlineParameter("plugin", "white_color", "/Oak/diffuse_tex/white_color/TexAColor") +
                       inlineParameter("plugin", "black_color", "/Oak/diffuse_tex/black_color/TexAColor") +
                       inlineParameter("bool", "tile_u", "1") + inlineParameter("bool", "tile_v", "0"));
    EXPECT_EQ(xmlOf(checker, url), expected);

    // References carry the escaped child url.
    const std::string escaped = xmlOf(checker, "/Oak & \"Ash\"");
    EXPECT_NE(escaped.find("<value>/Oak &amp; &quot;Ash&quot;/white_color/TexAColor</value>"), std::string::npos);
}

TEST(TextureXml, BitmapTextureWithGeneratorAndBuffer) {
    const TexturePtr made = makeBitmapTexture("maps/oak <old>.png");
    auto& bitmap = static_cast<BitmapTexture&>(*made);
    bitmap.tile = false;
    const std::string url = "/Oak/diffuse_tex";
    // The two children, in field order, under their child names, then the texture.
    const std::string expected =
        xmlOf(*bitmap.uvwgen, url + "/uvwgen") + xmlOf(*bitmap.bitmap, url + "/buffer") +
        assetFrame(url, "texture", "TexBitmap",
                   inlineParameter("plugin", "uvwgen", url + "/uvwgen/UVWGenChannel") +
                       inlineParameter("plugin", "bitmap", url + "/buffer/BitmapBuffer") +
                       inlineParameter("bool", "tile", "0"));
    EXPECT_EQ(xmlOf(bitmap, url), expected);
    EXPECT_NE(expected.find("maps/oak &lt;old&gt;.png"), std::string::npos);
}

TEST(TextureXml, FresnelAlwaysOldWay) {
    FresnelTexture fresnel;
    fresnel.white_color_tex = boost::make_shared<AColorTexture>(AColor{0.5f, 0.25f, 0.125f, 1});
    const std::string url = "/Glass/reflect";
    const std::string expected =
        colorAsset(url + "/refraction_tex", "0.5", "0.25", "0.125", "1") +
        assetFrame(url, "texture", "TexFresnel",
                   colorParameter("white_color", "1", "1", "1") +
                       colorParameter("black_color", "0.254902", "0.254902", "0.254902") +
                       inlineParameter("float", "fresnel_ior", "1.55") +
                       inlineParameter("float", "refract_ior", "1.55") +
                       inlineParameter("float", "black_color_tex_mult", "1") +
                       inlineParameter("float", "white_color_tex_mult", "1") +
                       inlineParameter("float", "fresnel_ior_tex_mult", "1") +
                       inlineParameter("float", "refract_ior_tex_mult", "1") + emptyReference("black_color_tex") +
                       inlineParameter("plugin", "white_color_tex", url + "/refraction_tex/TexAColor") +
                       emptyReference("fresnel_ior_tex") + emptyReference("refract_ior_tex") +
                       inlineParameter("bool", "old_way", "1"));
    EXPECT_EQ(xmlOf(fresnel, url), expected);

    // The reflection texture is the child "reflection_tex".
    fresnel.black_color_tex = boost::make_shared<AColorTexture>();
    EXPECT_NE(xmlOf(fresnel, url).find("url=\"/Glass/reflect/reflection_tex\""), std::string::npos);
}

TEST(TextureXml, ParameterOrderOfTheOtherKinds) {
    Random random(11);
    const std::pair<std::int32_t, std::vector<std::string>> kinds[] = {
        {BaseTexture::kNoise,
         {"uvwgen", "color1_tex", "color2_tex", "color1", "color2", "persistence", "amplitude_ratio", "frequency_ratio",
          "frequency1", "amplitude1", "size", "mix_ratio", "bias", "color1_tex_mult", "color2_tex_mult", "octaves",
          "noiseType", "inflection"}},
        {BaseTexture::kGrid, {"uvwgen", "line_color", "fill_color", "u_width", "v_width"}},
        {BaseTexture::kCloth, {"uvwgen", "gap_color", "u_color", "v_color", "u_width", "v_width", "tile_u", "tile_v"}},
        {BaseTexture::kBulge, {"uvwgen", "u_width", "v_width"}},
        {BaseTexture::kInvert, {"texture", "invert_alpha"}},
        {BaseTexture::kBlend, {"color_a", "color_b", "blend_amount"}},
        {BaseTexture::kRamp, {"uvwgen", "colors", "positions", "u_wave", "v_wave", "type", "interpolation"}},
        {BaseTexture::kUVW, {"uvwgen"}},
        {BaseTexture::kAColor, {"texture"}},
    };
    for (const auto& [kind, names] : kinds) {
        const TexturePtr t = random.filled(kind, 1);
        const std::string xml = xmlOf(*t, "/m/t");
        // The texture's own asset is the last one; its parameters in order.
        const std::string own = xml.substr(xml.rfind("  <Asset "));
        std::vector<std::string> found;
        for (std::size_t at = own.find(" name=\""); at != std::string::npos; at = own.find(" name=\"", at + 1)) {
            const std::size_t start = at + 7;
            found.push_back(own.substr(start, own.find('"', start) - start));
        }
        found.erase(found.begin()); // the kavorplugin element
        EXPECT_EQ(found, names) << kind;
    }
}

TEST(TextureXml, ClothTileGivesBothFlagsAndInvertNamesItsBase) {
    ClothTexture cloth;
    cloth.tile = false;
    const std::string xml = xmlOf(cloth, "/c");
    EXPECT_NE(xml.find(inlineParameter("bool", "tile_u", "0")), std::string::npos);
    EXPECT_NE(xml.find(inlineParameter("bool", "tile_v", "0")), std::string::npos);
    EXPECT_NE(xml.find(emptyReference("uvwgen")), std::string::npos);

    InvertTexture invert;
    invert.texture = boost::make_shared<AColorTexture>();
    const std::string inverted = xmlOf(invert, "/i");
    EXPECT_EQ(inverted.find("url=\"/i/base_texture\""), inverted.find("url=\""));
    EXPECT_NE(inverted.find(inlineParameter("plugin", "texture", "/i/base_texture/TexAColor")), std::string::npos);
}

// --- colour inversion ---

TEST(Texture, InvertColors) {
    auto checker = boost::make_shared<CheckerTexture>();
    invertColors(checker);
    EXPECT_EQ(static_cast<AColorTexture&>(*checker->white_color).texture, (AColor{0, 0, 0, 1}));
    EXPECT_EQ(static_cast<AColorTexture&>(*checker->black_color).texture, (AColor{1, 1, 1, 1}));

    // Out of range and not-a-number components; alpha is left alone.
    auto color = boost::make_shared<AColorTexture>(AColor{1.5f, -0.5f, NAN, 0.25f});
    invertColors(color);
    EXPECT_EQ(color->texture.r, 0.0f);
    EXPECT_EQ(color->texture.g, 1.5f);
    EXPECT_TRUE(std::isnan(color->texture.b));
    EXPECT_EQ(color->texture.a, 0.25f);

    // Fresnel: its colours and its two colour textures, not its index textures.
    auto fresnel = boost::make_shared<FresnelTexture>();
    for (TexturePtr* member : {&fresnel->black_color_tex, &fresnel->white_color_tex, &fresnel->fresnel_ior_tex,
                               &fresnel->refract_ior_tex})
        *member = boost::make_shared<AColorTexture>(AColor{0.25f, 0.25f, 0.25f, 1});
    invertColors(fresnel);
    EXPECT_EQ(fresnel->white_color, (Color{0, 0, 0}));
    EXPECT_EQ(fresnel->black_color.r, 1.0f - 65.0f / 255.0f);
    EXPECT_EQ(static_cast<AColorTexture&>(*fresnel->black_color_tex).texture.r, 0.75f);
    EXPECT_EQ(static_cast<AColorTexture&>(*fresnel->white_color_tex).texture.r, 0.75f);
    EXPECT_EQ(static_cast<AColorTexture&>(*fresnel->fresnel_ior_tex).texture.r, 0.25f);
    EXPECT_EQ(static_cast<AColorTexture&>(*fresnel->refract_ior_tex).texture.r, 0.25f);

    // Through invert, blend and grid textures down to the colours; cloth colours keep alpha.
    auto cloth = boost::make_shared<ClothTexture>();
    auto grid = boost::make_shared<GridTexture>();
    grid->line_color = cloth;
    grid->fill_color = boost::make_shared<AColorTexture>(AColor{0, 0, 0, 0});
    auto blend = boost::make_shared<BlendTexture>();
    blend->color_b = grid;
    auto invert = boost::make_shared<InvertTexture>();
    invert->texture = blend;
    invertColors(invert);
    EXPECT_EQ(cloth->gap_color, (AColor{0, 0, 0, 1}));
    EXPECT_EQ(cloth->u_color, (AColor{1, 1, 1, 1}));
    EXPECT_EQ(static_cast<AColorTexture&>(*grid->fill_color).texture, (AColor{1, 1, 1, 0}));

    // Noise colours; kinds without colours and an empty pointer are left alone.
    auto noise = boost::make_shared<NoiseTexture>();
    invertColors(noise);
    EXPECT_EQ(noise->color1, (Color{0, 0, 0}));
    EXPECT_EQ(noise->color2, (Color{1, 1, 1}));
    auto ramp = boost::make_shared<RampTexture>();
    ramp->colors = boost::make_shared<AColorTexture>();
    invertColors(ramp);
    EXPECT_EQ(static_cast<AColorTexture&>(*ramp->colors).texture, (AColor{1, 1, 1, 1}));
    invertColors(TexturePtr());
}
