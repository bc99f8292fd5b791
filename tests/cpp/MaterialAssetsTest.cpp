// Folding material trees into the assets of a material library document: golden
// XML for each rule, the searches (through the library, around cycles), and the
// unfolded assets of every kind. (Whole files of the three generations: the
// framing in FileContainerTest, the conversion in ConversionTest.)
#include "MaterialTestSupport.hpp"

#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/textures/Textures.hpp>

using namespace materialtest;
using namespace testsupport;

namespace {

using FoldingTest = LibraryTest;

boost::shared_ptr<MaterialBump> bumpAround(const std::string& name, const MaterialPtr& base, float mult = 1.0f) {
    auto bump = make<MaterialBump>(name);
    bump->baseMtl = base;
    bump->bumpTexMult = mult;
    return bump;
}

} // namespace

// The golden document of each folding rule.
TEST_F(FoldingTest, GoldenDocumentsOfEachRule) {
    const auto layered = [](const char* name) { return make<MaterialLayeredBRDF>(name); };
    const TexturePtr color = boost::make_shared<AColorTexture>();
    // A bump around a layered material folds into one asset; of two stacked bumps
    // only the outer one is folded.
    expectGolden(materialToXml(bumpAround("Bump & co", layered("Inner"), 2.5f)), "material_bump.xml");
    expectGolden(materialToXml(bumpAround("Outer", bumpAround("Inner", layered("L"), 5.0f), 3.0f)),
                 "material_stacked_bumps.xml");
    // The assets of the wrappers' textures and of the layers come before the folded asset.
    auto coated = make<MaterialLayeredBRDF>("Inner", [](auto& m) { m.layers = {createBRDF(Base_BRDF::kDiffuse)}; });
    coated->layers[0]->name = "Coat";
    auto wood = bumpAround("Wood", coated);
    wood->bumpTex = color;
    expectGolden(materialToXml(wood), "material_bump_texture_and_layer.xml");

    // Alpha around exclusion around environment around displaced around bump: one
    // asset, each wrapper's parameters in that order (the object names not written).
    auto displaced = make<MaterialDisplaced>("d", [&](auto& m) { m.baseMtl = bumpAround("b", layered("L")); });
    auto environment = make<MaterialOverrideEnvironment>("e", [&](auto& m) {
        m.baseMtl = displaced, m.giColor = Color{0.5f, 0.25f, 1};
    });
    auto exclusion = make<MaterialObjectExclusion>("x", [&](auto& m) {
        m.baseMtl = environment, m.mode = 2, m.objects = {"not", "written"};
    });
    auto alpha = make<MaterialAlphaContribution>("All", [&](auto& m) { m.baseMtl = exclusion; });
    expectGolden(materialToXml(alpha), "material_every_wrapper.xml");

    // A displaced material around a two-sided one folds on the front.
    auto twoSided = make<Material2Sided>("Two", [&](auto& m) {
        m.front = make<MaterialLayeredBRDF>("Front", [](auto& f) { f.doubleSided = 0; }), m.back = layered("Back");
    });
    expectGolden(materialToXml(make<MaterialDisplaced>("Disp", [&](auto& m) {
                     m.baseMtl = twoSided, m.displaceTexMult = 2.0f, m.displaceShift = 0.5f;
                 })),
                 "material_displaced_two_sided.xml");

    // An absent back, or a reference without a target identifier, gives no "back".
    auto frontOnly = make<Material2Sided>("Two", [&](auto& m) {
        m.front = layered("Front"), m.translucency = Color{0.25f, 0.5f, 1.0f};
    });
    const std::string frontOnlyXml = materialToXml(frontOnly);
    expectGolden(frontOnlyXml, "material_two_sided_front_only.xml");
    frontOnly->back = make<MaterialReference>("NoTarget");
    EXPECT_EQ(materialToXml(frontOnly), frontOnlyXml);
    expectGolden(materialToXml(make<MaterialSkp2Sided>("Host", [&](auto& m) {
                     m.back = frontOnly->front, m.front = frontOnly->back;
                 })),
                 "material_host_two_sided_back_only.xml");

    // The toon's textures follow the asset of its base material.
    expectGolden(materialToXml(make<MaterialAngleBlend>("Blend", [&](auto& m) {
                     m.mtlOne = layered("One"), m.mtlTwo = bumpAround("Two", layered("L2"));
                 })),
                 "material_angle_blend.xml");
    expectGolden(materialToXml(make<MaterialToon>("Toon", [&](auto& m) {
                     m.baseMtl = layered("Ink"), m.lineColorTex = color, m.opacityTex = color;
                 })),
                 "material_toon.xml");
}

TEST_F(FoldingTest, KindsWithoutLayeredMaterialGiveEmptyBlocks) {
    const MaterialPtr kinds[] = {
        make<MaterialMulti>("M", [](auto& m) { m.subMaterials = {make<MaterialLayeredBRDF>("L")}; }),
        make<MaterialSingleBRDF>("S", [](auto& m) { m.brdf = createBRDF(Base_BRDF::kDiffuse); }),
        make<MaterialInstance>("I", [](auto& m) { m.instancedMaterial = make<MaterialLayeredBRDF>("L"); }),
        MaterialPtr()};
    for (const MaterialPtr& m : kinds) EXPECT_EQ(materialToXml(m), "<Assets>\n</Assets>\n");
    std::string out;
    AssetXmlWriter writer(out);
    writeFoldedAsset(writer, MaterialPtr());
    EXPECT_EQ(out, "");
}

TEST_F(FoldingTest, SearchesLookThroughLinksAndReferences) {
    auto target = make<MaterialLayeredBRDF>("Target", [](auto& m) { m.identifier = "id-t"; });
    ASSERT_TRUE(library().add(target));
    auto reference = make<MaterialReference>("Ref", [](auto& m) {
        m.targetId = "id-t", m.heldMaterial = make<MaterialLayeredBRDF>("Held");
    });
    auto linked = make<MaterialLinked>("Link", [&](auto& m) { m.linkedMaterial = reference; });
    auto twoSided = make<Material2Sided>("Two", [&](auto& m) {
        m.front = bumpAround("B", make<MaterialLayeredBRDF>("F")), m.back = linked;
    });
    const auto found = findMaterialsOfKind(twoSided, BaseMaterial::kLayeredBRDF);
    ASSERT_EQ(found.size(), 2u);
    EXPECT_EQ(found[0]->name, "F");
    EXPECT_EQ(found[1], target);
    EXPECT_EQ(findMaterialsOfKind(twoSided, BaseMaterial::k2Sided).front(), twoSided);
    EXPECT_TRUE(findMaterialsOfKind(twoSided, BaseMaterial::kToon).empty());
    EXPECT_NE(materialToXml(linked).find("<Asset layout=\"defkvmat\" renderer=\"kavor\" type=\"material\" url=\"/Link\""),
              std::string::npos);

    library().clear(); // without the target, the held material stands in
    EXPECT_EQ(findMaterialsOfKind(reference, BaseMaterial::kLayeredBRDF).front()->name, "Held");
    reference->heldMaterial.reset();
    EXPECT_TRUE(findMaterialsOfKind(reference, BaseMaterial::kLayeredBRDF).empty());
    EXPECT_TRUE(isReferenceable(reference));
    EXPECT_FALSE(isReferenceable(make<MaterialReference>("none")));
    EXPECT_FALSE(isReferenceable(MaterialPtr()));
}

// Look-ups by identifier can lead back to where they started: a reference to
// itself, two references naming each other, a reference inside its own target.
// Searches there contribute nothing, comparisons end, and a reference whose
// target is being written is stored without a held material.
TEST_F(FoldingTest, CyclesThroughTheLibrary) {
    auto self = make<MaterialReference>("Self");
    self->identifier = self->targetId = "id-self";
    auto ping = make<MaterialReference>("Ping"), pong = make<MaterialReference>("Pong");
    ping->identifier = pong->targetId = "id-ping";
    pong->identifier = ping->targetId = "id-pong";
    auto back = make<MaterialReference>("Back", [](auto& m) { m.targetId = "id-two"; });
    auto twoSided = make<Material2Sided>("Two", [&](auto& m) {
        m.identifier = "id-two", m.front = bumpAround("B", make<MaterialLayeredBRDF>("F")), m.back = back;
    });
    for (const MaterialPtr& m : {MaterialPtr(self), MaterialPtr(ping), MaterialPtr(pong), MaterialPtr(twoSided)})
        ASSERT_TRUE(library().add(m));

    EXPECT_TRUE(findMaterialsOfKind(self, BaseMaterial::kLayeredBRDF).empty());
    EXPECT_EQ(materialToXml(ping), "<Assets>\n</Assets>\n");
    EXPECT_EQ(findMaterialsOfKind(back, BaseMaterial::kLayeredBRDF).size(), 1u);
    expectGolden(materialToXml(twoSided), "material_two_sided_back_through_itself.xml");
    EXPECT_TRUE(self->isEqual(self->clone()));
    EXPECT_TRUE(ping->isEqual(ping));

    for (const MaterialPtr& m : {MaterialPtr(self), MaterialPtr(ping), MaterialPtr(twoSided)})
        EXPECT_TRUE(readStored(storedForm(m))) << m->name;
    EXPECT_FALSE(self->heldMaterial);
    EXPECT_EQ(ping->heldMaterial, pong);
    EXPECT_FALSE(pong->heldMaterial);
    EXPECT_FALSE(back->heldMaterial);
    QuickArchive ar;
    EXPECT_TRUE(library().writeToArchive(ar));
}

// --- the unfolded assets (a material's own writeXml) ---

// Each kind's own asset comes after the assets it refers to, in parameter order:
// a sub-material's under the material's url, a texture's under its child name.
// The wrappers without an asset of their own write only their base material's;
// the kinds that stand for other materials write nothing.
TEST_F(FoldingTest, UnfoldedAssetsOfEveryKind) {
    const auto inner = [] { return make<MaterialLayeredBRDF>("Inner"); };
    const TexturePtr texture = boost::make_shared<AColorTexture>();
    const MaterialPtr materials[] = {
        make<MaterialBump>("M", [&](auto& m) { m.baseMtl = inner(), m.bumpTex = texture; }),
        make<MaterialObjectExclusion>("M", [&](auto& m) { m.baseMtl = inner(), m.objects = {"a", "b"}; }),
        make<MaterialAlphaContribution>("M", [&](auto& m) { m.alphaTex = texture; }),
        make<MaterialToon>("M", [&](auto& m) { m.baseMtl = inner(), m.opacityTex = texture; }),
        make<Material2Sided>("M", [&](auto& m) { m.back = inner(), m.transparencyTex = texture; }),
        make<MaterialSkp2Sided>("M", [&](auto& m) { m.front = inner(); }),
        make<MaterialAngleBlend>("M", [&](auto& m) { m.mtlOne = inner(), m.mtlTwo = inner(); }),
        make<MaterialDisplaced>("M", [&](auto& m) { m.baseMtl = inner(), m.displaceTex = texture; }),
        make<MaterialOverrideEnvironment>("M", [&](auto& m) { m.giTex = texture; }),
        make<MaterialReference>("M", [&](auto& m) { m.heldMaterial = inner(); }),
    };
    std::string xml;
    for (const MaterialPtr& m : materials)
        xml += "<!-- kind " + std::to_string(m->kindId()) + " -->\n" + xmlOf(*m, "/Lib");
    expectGolden(xml, "material_unfolded_assets.xml");
}
