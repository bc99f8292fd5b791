// Material records: the factory, round trips of every kind with random content,
// the current layouts and every older version, resets, copies, comparison, and
// the walks that must stop (cycles through the library, very deep trees).
#include "MaterialTestSupport.hpp"

#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/textures/BitmapBuffer.hpp>
#include <dexmor/textures/Textures.hpp>

using namespace materialtest;
using namespace testsupport;

namespace {

using MaterialRecordsTest = LibraryTest;

// Materials of every kind with random content.
struct Random {
    std::mt19937 rng;
    explicit Random(std::uint32_t seed) : rng(seed) {}

    bool coin() { return rng() % 2 == 0; }
    std::string text() { return "n\xC3\xA9 " + std::to_string(rng() % 100000); }
    void set(float& v) { v = std::uniform_real_distribution<float>(-100.0f, 100.0f)(rng); }
    void set(std::int32_t& v) { v = std::uniform_int_distribution<std::int32_t>(INT_MIN, INT_MAX)(rng); }
    void set(bool& v) { v = coin(); }
    void set(Color& v) { fill(v.r, v.g, v.b); }
    void set(std::vector<std::string>& v) { v.assign(rng() % 3, text()); }
    void set(TexturePtr& v) {
        auto t = boost::make_shared<AColorTexture>();
        fill(t->texture.r, t->texture.g, t->texture.b, t->texture.a);
        v = coin() ? TexturePtr(t) : TexturePtr();
    }
    template <class... T>
    void fill(T&... fields) {
        (set(fields), ...);
    }

    BRDFPtr layer() {
        BRDFPtr b = createBRDF(1 << (rng() % 6));
        b->name = text();
        if (auto* d = dynamic_cast<Diffuse_BRDF*>(b.get())) set(d->color);
        return b;
    }
    // Instances are never equal to anything, so they stay out of compared trees.
    MaterialPtr sub(int depth) {
        const auto kind = static_cast<std::int32_t>(rng() % BaseMaterial::kKindCount);
        return material(depth <= 0 || kind == BaseMaterial::kInstance ? BaseMaterial::kLayeredBRDF : kind, depth - 1);
    }
    MaterialPtr maybe(int depth) { return coin() ? sub(depth) : MaterialPtr(); }

    MaterialPtr material(std::int32_t kind, int depth) {
        const MaterialPtr made = createMaterial(kind);
        made->name = text();
        made->identifier = coin() ? text() : std::string();
        BaseMaterial* m = made.get();
        if (auto* l = dynamic_cast<MaterialLayeredBRDF*>(m)) {
            for (unsigned i = rng() % 3; i > 0; --i) l->layers.push_back(layer());
            fill(l->doubleSided, l->option1, l->option2, l->option3, l->option4);
        } else if (auto* s = dynamic_cast<MaterialSingleBRDF*>(m)) {
            s->brdf = layer();
            fill(s->option1, s->option2);
        } else if (auto* mu = dynamic_cast<MaterialMulti*>(m)) {
            for (unsigned i = rng() % 3; i > 0; --i) mu->subMaterials.push_back(sub(depth));
        } else if (auto* b = dynamic_cast<MaterialBump*>(m)) {
            b->baseMtl = sub(depth);
            fill(b->bumpTex, b->bumpTexMult);
        } else if (auto* d = dynamic_cast<MaterialDisplaced*>(m)) {
            d->baseMtl = maybe(depth);
            fill(d->displaceTex, d->displaceTexMult, d->displaceShift, d->displaceEdgeLength, d->displaceMaxSubdivs,
                 d->displaceContinuity, d->displaceViewDependent, d->displaceUseGlobals);
        } else if (auto* e = dynamic_cast<MaterialOverrideEnvironment*>(m)) {
            e->baseMtl = maybe(depth);
            fill(e->giTex, e->bgTex, e->reflectTex, e->refractTex, e->giColor, e->bgColor, e->reflectColor,
                 e->refractColor, e->bgTexMult, e->giTexMult, e->reflectTexMult, e->refractTexMult, e->overrideBg,
                 e->overrideGi, e->overrideReflect, e->overrideRefract);
        } else if (auto* x = dynamic_cast<MaterialObjectExclusion*>(m)) {
            x->baseMtl = maybe(depth);
            fill(x->mode, x->objects, x->shortCircuit);
        } else if (auto* a = dynamic_cast<MaterialAlphaContribution*>(m)) {
            a->baseMtl = maybe(depth);
            fill(a->alphaTex, a->alphaTexMult, a->alpha);
        } else if (auto* t = dynamic_cast<MaterialToon*>(m)) {
            t->baseMtl = maybe(depth);
            fill(t->lineColor, t->lineColorTex, t->distortTex, t->opacityTex, t->lineWidthTex, t->lineColorTexMult,
                 t->distort, t->distortTexMult, t->opacity, t->opacityTexMult, t->lineWidth, t->lineWidthTexMult,
                 t->zThreshold, t->traceBias, t->normalThreshold, t->lineUnits, t->silhouetteMult, t->doSecondary,
                 t->divideByDist, t->doSilhouetteMult);
        } else if (auto* two = dynamic_cast<Material2Sided*>(m)) {
            two->front = maybe(depth);
            two->back = maybe(depth);
            fill(two->translucencyTex, two->transparencyTex, two->translucency, two->transparency,
                 two->translucencyTexMult, two->transparencyTexMult, two->force1Sided);
        } else if (auto* h = dynamic_cast<MaterialSkp2Sided*>(m)) {
            h->front = maybe(depth);
            h->back = maybe(depth);
            fill(h->force1Sided);
        } else if (auto* ab = dynamic_cast<MaterialAngleBlend*>(m)) {
            ab->mtlOne = maybe(depth);
            ab->mtlTwo = maybe(depth);
            fill(ab->startAngle, ab->stopAngle);
        } else if (auto* li = dynamic_cast<MaterialLinked*>(m)) {
            li->linkedMaterial = sub(depth);
            std::int32_t id = 0;
            fill(id);
            coin() ? li->idData.setText(text(), id & 1) : li->idData.setInteger(id);
        } else if (auto* r = dynamic_cast<MaterialReference*>(m)) {
            r->targetId = text(); // not in the library: the held material is dropped on writing
            r->heldMaterial = maybe(depth);
        }
        return made;
    }
};

ByteVector baseRecord(const std::string& name, const std::string& id) {
    return Image().version(0, 2).text(name).text(id).bytes;
}

template <class Kind>
boost::shared_ptr<Kind> as(const MaterialPtr& m) {
    auto k = boost::dynamic_pointer_cast<Kind>(m);
    EXPECT_TRUE(k) << "not of the expected kind";
    return k;
}

// A check of a material that must be of `Kind`.
template <class Kind, class Check>
std::function<void(const MaterialPtr&)> on(Check check) {
    return [check](const MaterialPtr& m) {
        if (auto k = as<Kind>(m)) check(*k);
    };
}

} // namespace

TEST_F(MaterialRecordsTest, RandomRoundTripsOfEveryKind) {
    // (A stored unknown kind, with its place: FileContainerTest.)
    EXPECT_FALSE(createMaterial(BaseMaterial::kKindCount) || createMaterial(-1));
    for (std::uint32_t seed = 1; seed <= 12; ++seed) {
        Random rnd(seed);
        for (std::int32_t kind = 0; kind < BaseMaterial::kKindCount; ++kind) {
            SCOPED_TRACE("seed " + std::to_string(seed) + " kind " + std::to_string(kind));
            const MaterialPtr m = rnd.material(kind, 2);
            const ByteVector bytes = storedForm(m);
            const MaterialPtr back = readStored(bytes);
            ASSERT_TRUE(back);
            EXPECT_TRUE(back->kindId() == kind && back->name == m->name && back->identifier == m->identifier);
            EXPECT_EQ(storedForm(back), bytes);
            if (kind == BaseMaterial::kInstance) continue; // never equal, by definition
            EXPECT_TRUE(m->isEqual(back) && back->isEqual(m));
            EXPECT_TRUE(m->clone()->isEqual(m) && m->cloneRenamed()->isEqual(m));
        }
    }
}

TEST_F(MaterialRecordsTest, CurrentLayouts) {
    auto layered = make<MaterialLayeredBRDF>("L");
    const ByteVector base = baseRecord("L", "");
    EXPECT_EQ(recordOf(*layered), Image().version(0, 4).u32(0).i32(1).i32(0).i32(1).i32(1).append(base).i32(0).bytes);

    // The bump's multiplier comes first, its base material has no present flag.
    auto bump = make<MaterialBump>("B", [&](auto& m) { m.baseMtl = layered; });
    EXPECT_EQ(recordOf(*bump),
              Image().version(0, 3).f32({1}).flag(false).append(storedForm(layered)).append(baseRecord("B", "")).bytes);
    // The displaced record starts with the base record.
    auto displaced = make<MaterialDisplaced>("D");
    EXPECT_EQ(recordOf(*displaced), Image().version(0, 2).append(baseRecord("D", "")).flag(false).flag(false)
                                        .f32({1, 0, 4}).i32(256).i32(1).i32(1).i32(1).bytes);
    // The object names stand before the base record, shortCircuit after it.
    auto exclusion = make<MaterialObjectExclusion>("X", [](auto& m) { m.objects = {"a", "b", "c"}; });
    EXPECT_EQ(recordOf(*exclusion), Image().version(0, 3).i32(0).flag(false).u32(3).text("a").text("b").text("c")
                                        .append(baseRecord("X", "")).flag(true).bytes);

    auto linked = make<MaterialLinked>("K", [&](auto& m) {
        m.linkedMaterial = layered, m.idData.setText("C:\\lib\\wood.zelmat");
    });
    const ByteVector linkedBytes = Image().version(0, 1).version(0, 1).u32(1).text("C:\\lib\\wood.zelmat")
                                       .append(storedForm(layered)).append(baseRecord("K", "")).bytes;
    EXPECT_EQ(recordOf(*linked), linkedBytes);
    EXPECT_TRUE(readStored(Image().i32(BaseMaterial::kLinked).append(linkedBytes).bytes)->isEqual(linked));
}

TEST_F(MaterialRecordsTest, OlderVersions) {
    ASSERT_TRUE(library().add(make<MaterialLayeredBRDF>("Oak")));
    const ByteVector inner = storedForm(make<MaterialLayeredBRDF>("inner"));
    const ByteVector diffuse = Image().i32(Base_BRDF::kDiffuse).append(recordOf(*createBRDF(2))).bytes;
    const auto kind = [](std::int32_t k, std::uint16_t version) { return Image().i32(k).version(0, version); };

    const struct Case {
        const char* label;
        ByteVector bytes;
        std::function<void(const MaterialPtr&)> check;
    } cases[] = {
        {"layered 1: the name goes through the unique-name rule",
         kind(1, 1).u32(1).append(diffuse).i32(0).i32(7).text("Oak").bytes, on<MaterialLayeredBRDF>([](auto& l) {
             EXPECT_TRUE(l.name == "Oak1" && l.layers.size() == 1 && !l.doubleSided);
             EXPECT_TRUE(l.option1 == 7 && l.option2 == 1);
         })},
        {"layered 1: an empty name is DefaultMaterial", kind(1, 1).u32(0).i32(1).i32(0).text("").bytes,
         on<MaterialLayeredBRDF>([](auto& l) { EXPECT_EQ(l.name, "DefaultMaterial"); })},
        {"layered 2: a taken name is kept", kind(1, 2).u32(0).i32(0).i32(5).append(baseRecord("Oak", "i")).bytes,
         on<MaterialLayeredBRDF>([](auto& l) { EXPECT_TRUE(l.name + l.identifier == "Oaki" && l.option3 == 1); })},
        {"layered 3", kind(1, 3).u32(0).i32(0).i32(0).i32(8).i32(9).version(0, 1).text("V1").bytes,
         on<MaterialLayeredBRDF>([](auto& l) {
             EXPECT_TRUE(l.option2 == 8 && l.option3 == 9 && l.option4 == 0 && l.name == "V1");
         })},
        {"single 1", kind(0, 1).i32(3).i32(4).text("Oak").append(diffuse).bytes, on<MaterialSingleBRDF>([](auto& s) {
             EXPECT_TRUE(s.name == "Oak1" && s.option2 == 4 && s.brdf && s.brdf->kindId() == Base_BRDF::kDiffuse);
         })},
        {"bump 1: a bitmap path", kind(3, 1).text("").text("maps/b.png").f32({2}).append(inner).bytes,
         on<MaterialBump>([](auto& b) {
             EXPECT_TRUE(b.name == "DefaultMaterial" && b.bumpTexMult == 2.0f && b.baseMtl->name == "inner");
             EXPECT_TRUE(b.bumpTex && b.bumpTex->isEqual(makeBitmapTexture("maps/b.png")));
         })},
        {"bump 1: no path, no texture", kind(3, 1).text("Oak").text("").f32({1}).append(inner).bytes,
         on<MaterialBump>([](auto& b) { EXPECT_TRUE(b.name == "Oak1" && !b.bumpTex); })},
        {"bump 2: the name as stored", kind(3, 2).text("Oak").f32({3}).flag(false).append(inner).bytes,
         on<MaterialBump>([](auto& b) { EXPECT_TRUE(b.name == "Oak" && b.bumpTexMult == 3.0f); })},
        {"displaced 1", kind(9, 1).append(baseRecord("D", "")).flag(true).append(inner).flag(false).f32({3}).bytes,
         on<MaterialDisplaced>([](auto& d) {
             EXPECT_TRUE(d.displaceTexMult == 3.0f && d.displaceEdgeLength == 4.0f && d.displaceMaxSubdivs == 256);
         })},
        {"object exclusion 1", kind(10, 1).i32(1).flag(false).u32(2).text("a").text("b").bytes,
         on<MaterialObjectExclusion>([](auto& x) {
             EXPECT_TRUE(x.objects.size() == 2 && x.shortCircuit && x.name == "DefaultMaterial");
         })},
        {"object exclusion 2", kind(10, 2).i32(0).flag(false).u32(0).append(baseRecord("X", "")).bytes,
         on<MaterialObjectExclusion>([](auto& x) { EXPECT_TRUE(x.name == "X" && x.shortCircuit); })},
        {"toon 1",
         kind(14, 1).flag(false).f32({2, 1}).flag(false).f32({0.5f, 1}).flag(false).f32({0.1f, 1}).flag(false)
             .f32({0.2f, 0.3f, 0.4f, 1}).flag(false).f32({0.9f, 0.01f, 0.6f, 2}).flag(false).flag(true)
             .append(baseRecord("T", "")).bytes,
         on<MaterialToon>([](auto& t) {
             EXPECT_TRUE(t.lineColor == (Color{0.2f, 0.3f, 0.4f}) && t.lineWidth == 2.0f && t.lineUnits == 2.0f);
             EXPECT_TRUE(t.divideByDist && !t.doSilhouetteMult && t.silhouetteMult == 1.5f);
         })},
        {"multi 1", kind(2, 1).u32(1).append(inner).text("Oak").bytes,
         on<MaterialMulti>([](auto& m) { EXPECT_TRUE(m.name == "Oak1" && m.subMaterials.size() == 1); })},
        {"two-sided 1",
         kind(5, 1).flag(true).append(inner).flag(false).flag(false).f32({0.5f, 0.5f, 0.5f, 2}).flag(true).bytes,
         on<Material2Sided>([](auto& t) {
             EXPECT_TRUE(t.front->name == "inner" && t.translucency.g == 0.5f && t.force1Sided);
             EXPECT_TRUE(t.transparency == Color{} && t.transparencyTexMult == 1.0f);
         })},
        {"two-sided 2",
         kind(5, 2).flag(false).flag(false).flag(false).f32({0, 0, 0, 1}).flag(false).flag(false).f32({1, 1, 1, 3})
             .bytes,
         on<Material2Sided>([](auto& t) {
             EXPECT_TRUE(t.transparency == (Color{1, 1, 1}) && t.transparencyTexMult == 3.0f);
         })},
        {"reference 1", kind(13, 1).append(baseRecord("R", "")).text("id-x").bytes,
         on<MaterialReference>([](auto& r) { EXPECT_TRUE(r.targetId == "id-x" && !r.heldMaterial); })},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.label);
        std::string why;
        const MaterialPtr m = readStored(c.bytes, &why);
        ASSERT_TRUE(m) << why;
        c.check(m);
    }
}

TEST_F(MaterialRecordsTest, BaseRecordAndRefusedVersions) {
    // A version-2 base record with an empty name gets a default name and still
    // reads the identifier.
    MaterialInstance instance;
    instance.name = "before";
    ASSERT_TRUE(readInto(instance, Image().version(0, 1).append(baseRecord("", "id")).bytes));
    EXPECT_EQ(instance.name + " " + instance.identifier, "DefaultMaterial id");
    expectReadFails(instance, Image().version(0, 1).version(0, 3).text("x").bytes,
                    "unknown base material record version (0, 3)");
    // The link identifier inside a linked material's record has versions of its own.
    MaterialLinked linked;
    expectReadFails(linked, Image().version(0, 1).version(0, 2).u32(2).i32(5).bytes,
                    "unknown link identifier version (0, 2)");

    // Every kind refuses versions beyond its own, versions 0 and a first half other than 0.
    Random rnd(7);
    for (std::int32_t kind = 0; kind < BaseMaterial::kKindCount; ++kind) {
        const ByteVector bytes = storedForm(rnd.material(kind, 0));
        const std::uint16_t current = static_cast<std::uint16_t>(bytes[6] | bytes[7] << 8);
        using Word = std::pair<std::uint16_t, std::uint16_t>;
        for (const auto& [first, second] : {Word{0, current + 1}, Word{0, 0}, Word{1, current}}) {
            std::string why;
            EXPECT_FALSE(readStored(withVersion(bytes, first, second, 4), &why)) << kind;
            EXPECT_NE(why.find("version ("), std::string::npos) << why;
        }
    }
}

TEST_F(MaterialRecordsTest, WritersRefuseMissingRequiredMembers) {
    const MaterialPtr refused[] = {
        make<MaterialBump>("B"), make<MaterialSingleBRDF>("S"), make<MaterialLinked>("K"),
        make<MaterialLayeredBRDF>("L", [](auto& m) { m.layers = {createBRDF(Base_BRDF::kDiffuse), BRDFPtr()}; }),
        make<MaterialMulti>("M", [](auto& m) { m.subMaterials = {make<MaterialLayeredBRDF>("a"), MaterialPtr()}; })};
    for (const MaterialPtr& m : refused) {
        QuickArchive ar;
        EXPECT_FALSE(m->writeToArchive(ar)) << m->name;
        EXPECT_EQ(ar.writePosition(), 0u) << m->name;
    }
}

TEST_F(MaterialRecordsTest, ResetsAndReadingOver) {
    // Kinds that reset first lose what the record does not hold ...
    auto displaced = make<MaterialDisplaced>("D", [](auto& m) { m.displaceShift = 9.0f; });
    ASSERT_TRUE(readInto(*displaced,
                         Image().version(0, 1).append(baseRecord("D2", "")).flag(false).flag(false).f32({1}).bytes));
    EXPECT_TRUE(displaced->displaceShift == 0.0f && displaced->name == "D2");
    // ... the others read over their fields, and the multi appends.
    auto twoSided = make<Material2Sided>("T", [](auto& m) { m.transparency = Color{1, 1, 1}; });
    ASSERT_TRUE(readInto(*twoSided, Image().version(0, 1).flag(false).flag(false).flag(false).f32({0, 0, 0, 1})
                                        .flag(false).bytes));
    EXPECT_EQ(twoSided->transparency, (Color{1, 1, 1}));
    auto multi = make<MaterialMulti>("M", [](auto& m) { m.subMaterials = {make<MaterialLayeredBRDF>("a")}; });
    ASSERT_TRUE(readInto(*multi, recordOf(*multi)));
    EXPECT_EQ(multi->subMaterials.size(), 2u);

    // The bump's reset takes a new default name; the toon's keeps the name.
    auto bump = make<MaterialBump>("X", [](auto& m) { m.identifier = "id"; });
    bump->resetToDefaults();
    EXPECT_EQ(bump->name + bump->identifier, "DefaultMaterial");
    auto toon = make<MaterialToon>("Keep", [](auto& m) { m.lineWidth = 7.0f; });
    toon->resetToDefaults();
    EXPECT_TRUE(toon->name == "Keep" && toon->lineWidth == 1.5f);

    // A refused version comes after the reset: the kinds that reset are at their
    // defaults, the others keep their fields.
    toon->lineWidth = 7.0f;
    twoSided->force1Sided = true;
    EXPECT_FALSE(readInto(*toon, Image().version(0, 3).bytes));
    EXPECT_FALSE(readInto(*twoSided, Image().version(0, 4).bytes));
    EXPECT_TRUE(toon->lineWidth == 1.5f && toon->name == "Keep" && twoSided->force1Sided);
}

TEST_F(MaterialRecordsTest, Copies) {
    ASSERT_TRUE(library().add(make<MaterialLayeredBRDF>("Base")));
    auto layered = make<MaterialLayeredBRDF>("Base", [](auto& m) {
        m.identifier = "id", m.layers = {createBRDF(Base_BRDF::kDiffuse)};
    });
    const auto copy = as<MaterialLayeredBRDF>(layered->clone());
    EXPECT_TRUE(copy->name == "Base" && copy->identifier.empty() && copy->layers[0] != layered->layers[0]);
    EXPECT_EQ(layered->cloneRenamed()->name, "Base1"); // the source's name is taken

    // Shared on copying: the single's BRDF, the multi's entries, the two-sided's textures.
    auto single = make<MaterialSingleBRDF>("S", [](auto& m) { m.brdf = createBRDF(Base_BRDF::kGlass); });
    EXPECT_EQ(as<MaterialSingleBRDF>(single->clone())->brdf, single->brdf);
    auto multi = make<MaterialMulti>("M", [&](auto& m) { m.subMaterials = {layered}; });
    EXPECT_EQ(as<MaterialMulti>(multi->cloneRenamed())->subMaterials[0], layered);
    auto twoSided = make<Material2Sided>("T", [&](auto& m) {
        m.front = layered, m.translucencyTex = boost::make_shared<AColorTexture>();
    });
    const auto twoCopy = as<Material2Sided>(twoSided->clone());
    EXPECT_TRUE(twoCopy->front != layered && twoCopy->front->name == "Base");
    EXPECT_EQ(twoCopy->translucencyTex, twoSided->translucencyTex);

    // Even the toon's clone() renames its base material.
    auto toon = make<MaterialToon>("Toon", [&](auto& m) {
        m.baseMtl = layered, m.opacityTex = boost::make_shared<AColorTexture>();
    });
    const auto toonCopy = as<MaterialToon>(toon->clone());
    EXPECT_TRUE(toonCopy->name == "Toon" && toonCopy->baseMtl->name == "Base1");
    EXPECT_NE(toonCopy->opacityTex, toon->opacityTex);

    // The wrappers' textures are copied with them.
    auto bump = make<MaterialBump>("Bump", [&](auto& m) {
        m.baseMtl = layered, m.bumpTex = boost::make_shared<AColorTexture>();
    });
    auto alpha =
        make<MaterialAlphaContribution>("Alpha", [](auto& m) { m.alphaTex = boost::make_shared<AColorTexture>(); });
    const auto bumpCopy = as<MaterialBump>(bump->cloneRenamed());
    const auto alphaCopy = as<MaterialAlphaContribution>(alpha->clone());
    EXPECT_TRUE(bumpCopy->bumpTex && bumpCopy->bumpTex != bump->bumpTex && bumpCopy->baseMtl->name == "Base1");
    EXPECT_TRUE(alphaCopy->alphaTex && alphaCopy->alphaTex != alpha->alphaTex && !alphaCopy->baseMtl);
    EXPECT_TRUE(bumpCopy->isEqual(bump) && alphaCopy->isEqual(alpha));

    auto reference = make<MaterialReference>("Base", [&](auto& m) { m.heldMaterial = layered; });
    const auto refCopy = as<MaterialReference>(reference->cloneRenamed());
    EXPECT_TRUE(refCopy->name == "Base" && refCopy->heldMaterial == layered);
}

TEST_F(MaterialRecordsTest, Comparison) {
    auto instance = make<MaterialInstance>("I");
    EXPECT_FALSE(instance->isEqual(instance));

    // Names are not compared.
    auto a = make<MaterialLinked>("A", [](auto& m) {
        m.linkedMaterial = make<MaterialLayeredBRDF>("x"), m.idData.setText("C:/Lib/Wood");
    });
    auto b = make<MaterialLinked>("B", [](auto& m) {
        m.linkedMaterial = make<MaterialLayeredBRDF>("y"), m.idData.setText("c:/lib/WOOD");
    });
    EXPECT_TRUE(a->isEqual(b));
    b->idData.setText("c:/lib/WOOD", 0);
    EXPECT_FALSE(a->isEqual(b)); // another tag
    EXPECT_FALSE(a->isEqual(make<MaterialBump>("A")));

    // References compare their targets ignoring case, then what the library finds.
    auto target = make<MaterialLayeredBRDF>("Target", [](auto& m) { m.identifier = "ID-T"; });
    ASSERT_TRUE(library().add(target));
    auto r1 = make<MaterialReference>("r1", [](auto& m) { m.targetId = "id-t"; });
    auto r2 = make<MaterialReference>("r2", [](auto& m) { m.targetId = "ID-T"; });
    EXPECT_FALSE(r1->isEqual(r2)); // only "ID-T" is in the library
    r1->targetId = "ID-T";
    EXPECT_TRUE(r1->isEqual(r2));
    r1->heldMaterial = target;
    EXPECT_FALSE(r1->isEqual(r2));
}

TEST_F(MaterialRecordsTest, ReferencesHoldWhatTheLibraryHas) {
    auto target = make<MaterialLayeredBRDF>("Target", [](auto& m) { m.identifier = "id-t"; });
    ASSERT_TRUE(library().add(target));
    auto reference = make<MaterialReference>("R", [&](auto& m) { m.targetId = "id-missing", m.heldMaterial = target; });
    EXPECT_EQ(recordOf(*reference),
              Image().version(0, 2).append(baseRecord("R", "")).text("id-missing").flag(false).bytes);
    EXPECT_FALSE(reference->heldMaterial);

    reference->targetId = "id-t";
    const ByteVector bytes = storedForm(reference);
    EXPECT_EQ(reference->heldMaterial, target);
    library().clear(); // read back without the library: the held copy stands in
    const auto back = as<MaterialReference>(readStored(bytes));
    ASSERT_TRUE(back && back->heldMaterial);
    EXPECT_TRUE(back->heldMaterial->isEqual(target));
}

TEST_F(MaterialRecordsTest, DeepTreesAreBounded) {
    // Deeper than the nesting limit: no copy, no comparison, no record, and
    // destroying it takes no deep recursion.
    MaterialPtr chain = make<MaterialLayeredBRDF>("bottom");
    for (int i = 0; i < 100000; ++i) {
        auto bump = boost::make_shared<MaterialBump>();
        bump->baseMtl = chain;
        chain = bump;
    }
    EXPECT_FALSE(chain->clone());
    EXPECT_FALSE(chain->isEqual(chain));
    QuickArchive ar;
    EXPECT_FALSE(chain->writeToArchive(ar));
    EXPECT_TRUE(findMaterialsOfKind(chain, BaseMaterial::kLayeredBRDF).empty());
    chain.reset(); // (a stored tree nested too deep: HostileInputTest)
}
