// Textures: the factory and kind names, round trips of every kind, the old record
// versions, member checks, the XML assets, colour inversion and deep trees.
#include "TrimSupport.hpp"

#include <dexmor/textures/BitmapBuffer.hpp>
#include <dexmor/textures/Textures.hpp>
#include <dexmor/textures/UVWGenerators.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

// Textures, generators and bitmaps with random content.
struct Random {
    std::mt19937 rng;
    explicit Random(std::uint32_t seed) : rng(seed) {}

    float real() { return std::uniform_real_distribution<float>(-100.0f, 100.0f)(rng); }
    std::int32_t integer() { return std::uniform_int_distribution<std::int32_t>(INT_MIN, INT_MAX)(rng); }
    bool coin() { return std::bernoulli_distribution(0.5)(rng); }
    void set(float& v) { v = real(); }
    void set(std::int32_t& v) { v = integer(); }
    void set(bool& v) { v = coin(); }
    void set(Vector& v) { v = Vector{real(), real(), real()}; }
    void set(Color& v) { v = Color{real(), real(), real()}; }
    void set(AColor& v) { v = AColor{real(), real(), real(), real()}; }
    void set(UVWPtr& v) {
        const std::int32_t kinds[] = {0, 1, 3, 4};
        v = createUVW(kinds[rng() % 4]);
        if (auto* p = dynamic_cast<GenProjectionUVW*>(v.get())) set(p->uvwComponents.z_rotation);
        if (auto* e = dynamic_cast<GenEnvironmentUVW*>(v.get())) set(e->mappingType);
        if (auto* c = dynamic_cast<GenChannelUVW*>(v.get())) set(c->uvw_channel);
    }
    void set(BitmapPtr& v) {
        auto b = boost::make_shared<BitmapBuffer>();
        b->file = "maps/ch\xC3\xAAne " + std::to_string(rng()) + ".png";
        fill(b->filter_type, b->filter_blur, b->gamma);
        v = b;
    }
    template <class... T>
    void fill(T&... fields) {
        (set(fields), ...);
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
            fill(b->uvwgen, b->bitmap, b->tile);
        } else if (auto* f = dynamic_cast<FresnelTexture*>(t)) {
            for (TexturePtr* m : {&f->black_color_tex, &f->white_color_tex, &f->fresnel_ior_tex, &f->refract_ior_tex})
                *m = maybe(depth);
            fill(f->white_color, f->black_color, f->fresnel_ior, f->refract_ior, f->black_color_tex_mult,
                 f->white_color_tex_mult, f->fresnel_ior_tex_mult, f->refract_ior_tex_mult);
        } else if (auto* u = dynamic_cast<UVWTexture*>(t)) {
            fill(u->uvwgen);
        } else if (auto* n = dynamic_cast<NoiseTexture*>(t)) {
            n->color1_tex = maybe(depth);
            n->color2_tex = maybe(depth);
            fill(n->uvwgen, n->color1, n->color2, n->persistence, n->amplitude_ratio, n->frequency_ratio, n->frequency1,
                 n->amplitude1, n->size, n->mix_ratio, n->bias, n->color1_tex_mult, n->color2_tex_mult, n->octaves,
                 n->noiseType, n->inflection);
        } else if (auto* c = dynamic_cast<CheckerTexture*>(t)) {
            c->white_color = texture(depth);
            c->black_color = texture(depth);
            fill(c->uvwgen, c->whiteFactor, c->blackFactor, c->tile_u, c->tile_v);
        } else if (auto* a = dynamic_cast<AColorTexture*>(t)) {
            fill(a->texture);
        } else if (auto* g = dynamic_cast<GridTexture*>(t)) {
            g->line_color = texture(depth);
            g->fill_color = texture(depth);
            fill(g->uvwgen, g->lineFactor, g->fillFactor, g->u_width, g->v_width);
        } else if (auto* cl = dynamic_cast<ClothTexture*>(t)) {
            fill(cl->uvwgen, cl->gap_color, cl->u_color, cl->v_color, cl->u_width, cl->v_width, cl->tile);
        } else if (auto* bu = dynamic_cast<BulgeTexture*>(t)) {
            fill(bu->uvwgen, bu->u_width, bu->v_width);
        } else if (auto* i = dynamic_cast<InvertTexture*>(t)) {
            i->texture = texture(depth);
            fill(i->invert_alpha);
        } else if (auto* bl = dynamic_cast<BlendTexture*>(t)) {
            // A factor is stored only with its texture.
            bl->color_a = maybe(depth);
            bl->color_b = maybe(depth);
            if (bl->color_a) set(bl->colorAFactor);
            if (bl->color_b) set(bl->colorBFactor);
            set(bl->blend_amount);
        } else if (auto* r = dynamic_cast<RampTexture*>(t)) {
            r->colors = texture(depth);
            fill(r->uvwgen, r->positions, r->u_wave, r->v_wave, r->type, r->interpolation);
        } else if (auto* s = dynamic_cast<SkyTexture*>(t)) {
            auto sun = boost::make_shared<SunLight>("sun " + std::to_string(rng()), newUuidText());
            set(sun->turbidity);
            sun->transform.setValue(Transform{Matrix::identity(), Vector{real(), real(), real()}}, 2.0);
            s->sun = sun;
            s->transform.setValue(Transform{Matrix::identity(), Vector{real(), 0, 0}}, 1.5);
            fill(s->up_vector, s->shadowBias, s->turbidity, s->water_vapour, s->intensity_multiplier,
                 s->size_multiplier, s->photon_radius, s->photon_emit_distance, s->ozone, s->photonSubdivs,
                 s->causticSubdivs, s->shadow_subdivs, s->flag1, s->flag2);
        }
        return made;
    }
};

ByteVector planarWorldRecord() {
    GenPlanarWorldUVW uvw;
    return recordOf(uvw);
}

ByteVector colorRecord(AColor c) { return Image{}.version(0, 1).f32({c.r, c.g, c.b, c.a}).bytes; }

// A mandatory texture member holding a colour texture.
Image& colorMember(Image& image, AColor c) { return image.i32(BaseTexture::kAColor).append(colorRecord(c)); }

} // namespace

// Kinds outside the factory's range make nothing and have no name; a bitmap
// texture needs a path. (Each kind's plugin type: TextureXml.)
TEST(Texture, FactoryRefusesUnknownKinds) {
    for (std::int32_t kind : {-1, 13, INT_MIN, INT_MAX}) {
        EXPECT_FALSE(createTexture(kind)) << kind;
        EXPECT_EQ(textureKindName(kind), "") << kind;
    }
    EXPECT_FALSE(makeBitmapTexture(""));
}

// Random textures of every kind write, read back and copy to equal ones with the
// same bytes, and every stored byte takes part in comparison.
TEST(Texture, RandomRoundTripsOfEveryKind) {
    Random random(20240612);
    for (std::int32_t kind = 0; kind < BaseTexture::kKindCount; ++kind) {
        EXPECT_EQ(createTexture(kind)->kindId(), kind);
        for (int round = 0; round < 12; ++round) {
            const TexturePtr original = random.filled(kind, 2);
            // A sky's copy has an identifier of its own; with the original's it is the same sky.
            const auto sameSky = [&](BaseTexture& copy) {
                if (auto* sky = dynamic_cast<SkyTexture*>(&copy))
                    sky->identifier = static_cast<SkyTexture&>(*original).identifier;
            };
            const ByteVector bytes = expectRoundTrip(original, [&] { return createTexture(kind); }, sameSky);
            // Not the sky, whose record also stores the shared default sun.
            if (round < 2 && kind != BaseTexture::kSky) {
                EXPECT_GE(3 * expectEveryStoredByteCompared(original, bytes, [&] { return createTexture(kind); }),
                          bytes.size());
            }
        }
    }
    // A set optional member against an empty one, either way round, and another kind.
    auto fresnel = boost::make_shared<FresnelTexture>(), withTexture = boost::make_shared<FresnelTexture>();
    withTexture->refract_ior_tex = boost::make_shared<AColorTexture>();
    EXPECT_FALSE(fresnel->isEqual(withTexture));
    EXPECT_FALSE(withTexture->isEqual(fresnel));
    EXPECT_FALSE(boost::make_shared<CheckerTexture>()->isEqual(boost::make_shared<GridTexture>()));
    EXPECT_FALSE(fresnel->isEqual(TexturePtr()));
}

TEST(Texture, CloneSeparatesMembersWhereTheCopyConstructorSharesThem) {
    const TexturePtr original = Random(7).filled(BaseTexture::kChecker, 1);
    const auto& checker = static_cast<CheckerTexture&>(*original);
    EXPECT_EQ(CheckerTexture(checker).white_color, checker.white_color);
    const TexturePtr deep = original->clone();
    const auto& copy = static_cast<CheckerTexture&>(*deep);
    EXPECT_TRUE(copy.uvwgen != checker.uvwgen && copy.black_color != checker.black_color);
    invertColors(copy.white_color); // changing the copy's member leaves the original alone
    EXPECT_FALSE(deep->isEqual(original));
}

// Older records read, over a texture holding other values, with defaults for what
// they lack, and write back as the newest version.
TEST(Texture, OlderVersionsReadWithDefaultsAndWriteBackAsNewest) {
    const auto checkerLike = [](std::uint16_t version, AColor first, AColor second) {
        Image image = Image{}.version(0, version).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord());
        colorMember(image, first);
        return colorMember(image, second);
    };
    const auto blend = [](std::uint16_t version) {
        Image image = Image{}.version(0, version).flag(true);
        colorMember(image, {1, 1, 1, 1});
        if (version == 2) image.f32({1}); // a factor stored with each present texture
        colorMember(image.flag(true), {0, 0, 0, 1});
        return image.f32(version == 2 ? std::initializer_list<float>{1, 0.75f} : std::initializer_list<float>{0.75f});
    };
    const Image cloth = Image{}.i32(BaseUVW::kPlanarWorld).append(planarWorldRecord()).f32({0.5f, 0.5f, 0.5f, 1})
                            .f32({1, 0, 0, 1}).f32({0, 0, 1, 1}).f32({0.2f, 0.3f});
    const Image fresnel = Image{}.f32({1, 0, 0}).f32({0, 1, 0}).f32({1.33f, 2.0f});
    // The fields each old record places, as a reader with two fields exchanged would not.
    const auto checkerFields = [](BaseTexture& t) {
        auto& c = static_cast<CheckerTexture&>(t);
        EXPECT_EQ(static_cast<AColorTexture&>(*c.white_color).texture, (AColor{0.25f, 0.5f, 0.75f, 1}));
        EXPECT_TRUE(!c.tile_u && c.tile_v);
    };
    const auto gridFields = [](BaseTexture& t) {
        EXPECT_TRUE(static_cast<GridTexture&>(t).u_width == 0.25f && static_cast<GridTexture&>(t).v_width == 0.5f);
    };
    const auto clothFields = [](BaseTexture& t) {
        auto& c = static_cast<ClothTexture&>(t);
        EXPECT_TRUE(c.tile && c.u_color == (AColor{1, 0, 0, 1}) && c.u_width == 0.2f && c.v_width == 0.3f);
    };
    const auto blendFields = [](BaseTexture& t) { EXPECT_EQ(static_cast<BlendTexture&>(t).blend_amount, 0.75f); };
    const auto fresnelFields = [](BaseTexture& t) {
        auto& f = static_cast<FresnelTexture&>(t);
        EXPECT_TRUE(f.white_color == (Color{1, 0, 0}) && f.black_color == (Color{0, 1, 0}));
        EXPECT_TRUE(f.fresnel_ior == 1.33f && f.refract_ior == 2.0f && !f.white_color_tex);
    };
    const struct {
        std::int32_t kind;
        ByteVector old, newest;
        std::function<void(BaseTexture&)> check;
    } cases[] = {
        // Checker 1: no factors.
        {BaseTexture::kChecker, checkerLike(1, {0.25f, 0.5f, 0.75f, 1}, {0, 0, 0, 1}).flag(false).flag(true).bytes,
         checkerLike(2, {0.25f, 0.5f, 0.75f, 1}, {0, 0, 0, 1}).flag(false).flag(true).f32({1, 1}).bytes, checkerFields},
        // Grid 1: the widths without the factors in front of them.
        {BaseTexture::kGrid, checkerLike(1, {1, 0, 0, 1}, {0, 1, 0, 1}).f32({0.25f, 0.5f}).bytes,
         checkerLike(2, {1, 0, 0, 1}, {0, 1, 0, 1}).f32({1, 1, 0.25f, 0.5f}).bytes, gridFields},
        // Cloth 1: no tile flag; tile is true.
        {BaseTexture::kCloth, Image{}.version(0, 1).append(cloth.bytes).bytes,
         Image{}.version(0, 2).append(cloth.bytes).flag(true).bytes, clothFields},
        // Blend 1: no factors even when both textures are present.
        {BaseTexture::kBlend, blend(1).bytes, blend(2).bytes, blendFields},
        // Fresnel 1: two colours and two indices; no multipliers, no textures.
        {BaseTexture::kFresnel, Image{}.version(0, 1).append(fresnel.bytes).bytes,
         Image{}.version(0, 2).append(fresnel.bytes).f32({1, 1, 1, 1}).u32(0).bytes, fresnelFields},
    };
    Random random(5);
    for (const auto& c : cases) {
        const TexturePtr read = random.filled(c.kind, 1);
        ASSERT_TRUE(readInto(*read, c.old)) << c.kind;
        c.check(*read);
        EXPECT_EQ(recordOf(*read), c.newest) << c.kind;
    }
}

TEST(Texture, BlendFactorIsStoredOnlyWithItsTexture) {
    BlendTexture blend;
    blend.color_b = boost::make_shared<AColorTexture>();
    blend.colorAFactor = 4, blend.colorBFactor = 5;
    Image expected;
    colorMember(expected.version(0, 2).flag(false).flag(true), {1, 1, 1, 1}).f32({5, 0.5f});
    EXPECT_EQ(recordOf(blend), expected.bytes);
    BlendTexture read;
    ASSERT_TRUE(readInto(read, expected.bytes));
    EXPECT_TRUE(read.colorAFactor == 1.0f && read.colorBFactor == 5.0f);
}

TEST(Texture, RefusedVersionsFailAndLeaveDefaults) {
    Random random(3);
    for (std::int32_t kind = 0; kind < BaseTexture::kKindCount; ++kind) {
        if (kind == BaseTexture::kSky) continue; // its identifier is new at every reset (sky tests)
        const std::uint16_t newest = recordOf(*random.filled(kind, 1))[2];
        const std::pair<std::uint16_t, std::uint16_t> refused[] = {{0, 0}, {0, std::uint16_t(newest + 1)}, {1, 1}};
        for (const auto& [a, b] : refused) {
            const TexturePtr t = random.filled(kind, 1);
            expectReadFails(*t, Image{}.version(a, b).bytes,
                            "version (" + std::to_string(a) + ", " + std::to_string(b) + ")");
            EXPECT_TRUE(t->isEqual(createTexture(kind))) << kind;
        }
    }
}

TEST(Texture, MandatoryMembersMustBeSetToWrite) {
    auto checker = boost::make_shared<CheckerTexture>();
    checker->black_color.reset();
    // A refused write leaves nothing behind, but the bulge texture has written its version word.
    std::vector<std::pair<TexturePtr, std::size_t>> refused = {{checker, 0}, {createTexture(BaseTexture::kBulge), 4}};
    for (auto kind : {BaseTexture::kBitmap, BaseTexture::kUVW, BaseTexture::kNoise, BaseTexture::kGrid,
                      BaseTexture::kCloth, BaseTexture::kInvert, BaseTexture::kRamp})
        refused.emplace_back(createTexture(kind), 0);
    for (const auto& [texture, written] : refused) {
        QuickArchive ar;
        EXPECT_FALSE(texture->writeToArchive(ar)) << texture->kindId();
        EXPECT_EQ(ar.writePosition(), written) << texture->kindId();
    }
    // (Textures without mandatory members write as they are: the round trips.)
}

// (A failing generator or bitmap inside a texture, with its place: HostileInputTest.)
TEST(Texture, UnknownMembersFailTheOwnerWithTheirPlace) {
    CheckerTexture checker; // its white colour names texture kind 13
    expectReadFails(checker, Image{}.version(0, 2).i32(BaseUVW::kPlanarWorld).append(planarWorldRecord()).i32(13).bytes,
                    R"(texture "white_color": unknown texture kind 13)");
    InvertTexture invert; // its mandatory texture is the stored "no texture"
    expectReadFails(invert, Image{}.version(0, 1).i32(-1).bytes, R"(texture "texture": unknown texture kind -1)");
    FresnelTexture fresnel; // a present optional texture of kind -1
    const Image fresnelHead = Image{}.version(0, 2).f32({1, 1, 1, 0, 0, 0, 1, 1, 1, 1, 1, 1});
    expectReadFails(fresnel, Image(fresnelHead).flag(false).flag(true).i32(-1).bytes,
                    R"(texture "white_color_tex": unknown texture kind -1)");
}

// --- deep trees (a stored tree nested too deep: HostileInputTest) ---

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
    expectRoundTrip(shallow, [] { return boost::make_shared<InvertTexture>(); });
    invertColors(shallow);
    // Beyond it the walks stop instead of overflowing the stack, and the tree
    // is destroyed without recursion.
    TexturePtr deep = chainOf(100000);
    QuickArchive ar;
    EXPECT_FALSE(deep->writeToArchive(ar));
    EXPECT_FALSE(deep->isEqual(deep));
    EXPECT_FALSE(deep->isEqual(deep->clone()));
    invertColors(deep);
    EXPECT_EQ(occurrences(xmlOf(*deep, "/deep"), "<Asset "), 256u);
    deep.reset();
}

// --- XML ---

// The checker's children (generator, two colours) come first, in field order; the
// bitmap texture's generator and buffer likewise; a Fresnel texture always writes
// "old_way", its white texture as the child "refraction_tex".
TEST(TextureXml, CheckerBitmapAndFresnel) {
    CheckerTexture checker;
    checker.tile_v = false;
    expectGolden(xmlOf(checker, "/Oak/diffuse_tex"), "texture_checker.xml");

    const TexturePtr made = makeBitmapTexture("maps/oak <old>.png");
    static_cast<BitmapTexture&>(*made).tile = false;
    expectGolden(xmlOf(*made, "/Oak/diffuse_tex"), "texture_bitmap.xml");

    FresnelTexture fresnel;
    fresnel.white_color_tex = boost::make_shared<AColorTexture>(AColor{0.5f, 0.25f, 0.125f, 1});
    expectGolden(xmlOf(fresnel, "/Glass/reflect"), "texture_fresnel.xml");
    // The reflection texture is the child "reflection_tex".
    fresnel.black_color_tex = boost::make_shared<AColorTexture>();
    EXPECT_NE(xmlOf(fresnel, "/Glass/reflect").find("url=\"/Glass/reflect/reflection_tex\""), std::string::npos);
}

// The kinds without a golden document of their own, at their defaults.
TEST(TextureXml, TheOtherKindsAtTheirDefaults) {
    std::string xml;
    for (std::int32_t kind : {BaseTexture::kNoise, BaseTexture::kGrid, BaseTexture::kBulge, BaseTexture::kBlend,
                              BaseTexture::kRamp, BaseTexture::kUVW, BaseTexture::kAColor})
        xml += xmlOf(*createTexture(kind), "/m/t");
    expectGolden(xml, "texture_other_kinds.xml");
}

// A cloth's tile flag gives both tile_u and tile_v; an invert texture writes its
// texture as the child "base_texture", first.
TEST(TextureXml, ClothTileGivesBothFlagsAndInvertNamesItsBase) {
    ClothTexture cloth;
    cloth.tile = false;
    expectGolden(xmlOf(cloth, "/c"), "texture_cloth.xml");
    InvertTexture invert;
    invert.texture = boost::make_shared<AColorTexture>();
    expectGolden(xmlOf(invert, "/i"), "texture_invert.xml");
}

// --- colour inversion ---

TEST(Texture, InvertColors) {
    const auto colorOf = [](const TexturePtr& t) { return static_cast<AColorTexture&>(*t).texture; };
    auto checker = boost::make_shared<CheckerTexture>();
    invertColors(checker);
    EXPECT_EQ(colorOf(checker->white_color), (AColor{0, 0, 0, 1}));
    EXPECT_EQ(colorOf(checker->black_color), (AColor{1, 1, 1, 1}));

    // Out of range and not-a-number components; alpha is left alone.
    auto color = boost::make_shared<AColorTexture>(AColor{1.5f, -0.5f, NAN, 0.25f});
    invertColors(color);
    EXPECT_TRUE(color->texture.r == 0.0f && color->texture.g == 1.5f && color->texture.a == 0.25f);
    EXPECT_TRUE(std::isnan(color->texture.b));

    // Fresnel: its colours and its two colour textures, not its index textures.
    auto fresnel = boost::make_shared<FresnelTexture>();
    for (TexturePtr* member : {&fresnel->black_color_tex, &fresnel->white_color_tex, &fresnel->fresnel_ior_tex,
                               &fresnel->refract_ior_tex})
        *member = boost::make_shared<AColorTexture>(AColor{0.25f, 0.25f, 0.25f, 1});
    invertColors(fresnel);
    EXPECT_EQ(fresnel->white_color, (Color{0, 0, 0}));
    EXPECT_EQ(fresnel->black_color.r, 1.0f - 65.0f / 255.0f);
    EXPECT_EQ((std::array{colorOf(fresnel->black_color_tex).r, colorOf(fresnel->white_color_tex).r,
                          colorOf(fresnel->fresnel_ior_tex).r, colorOf(fresnel->refract_ior_tex).r}),
              (std::array{0.75f, 0.75f, 0.25f, 0.25f}));

    // Through invert, blend and grid textures down to the colours; cloth colours keep alpha.
    auto cloth = boost::make_shared<ClothTexture>();
    auto grid = boost::make_shared<GridTexture>();
    grid->line_color = cloth;
    grid->fill_color = boost::make_shared<AColorTexture>(AColor{0, 0, 0, 0});
    auto blend = boost::make_shared<BlendTexture>();
    auto invert = boost::make_shared<InvertTexture>();
    blend->color_b = grid;
    invert->texture = blend;
    invertColors(invert);
    EXPECT_EQ(cloth->gap_color, (AColor{0, 0, 0, 1}));
    EXPECT_EQ(cloth->u_color, (AColor{1, 1, 1, 1}));
    EXPECT_EQ(colorOf(grid->fill_color), (AColor{1, 1, 1, 0}));

    // Noise colours; kinds without colours and an empty pointer are left alone.
    auto noise = boost::make_shared<NoiseTexture>();
    invertColors(noise);
    EXPECT_TRUE(noise->color1 == (Color{0, 0, 0}) && noise->color2 == (Color{1, 1, 1}));
    auto ramp = boost::make_shared<RampTexture>();
    ramp->colors = boost::make_shared<AColorTexture>();
    invertColors(ramp);
    EXPECT_EQ(colorOf(ramp->colors), (AColor{1, 1, 1, 1}));
    invertColors(TexturePtr());
}
