// Folding material trees into the assets of a material library document: golden
// XML for each rule, the searches (through the library, around cycles) and whole
// files of all three generations.
#include "MaterialTestSupport.hpp"

#include <dexmor/dexmor.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/textures/Textures.hpp>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

using namespace materialtest;
using namespace testsupport;
using testsupport::expectGolden;

namespace {

using FoldingTest = LibraryTest;

boost::shared_ptr<MaterialBump> bumpAround(const std::string& name, const MaterialPtr& base, float mult = 1.0f) {
    auto bump = make<MaterialBump>(name);
    bump->baseMtl = base;
    bump->bumpTexMult = mult;
    return bump;
}

} // namespace

// A bump around a layered material folds into one asset; of two stacked bumps only
// the outer one is folded.
TEST_F(FoldingTest, BumpAroundLayered) {
    expectGolden(materialToXml(bumpAround("Bump & co", make<MaterialLayeredBRDF>("Inner"), 2.5f)), "material_bump.xml");
    const auto stacked = bumpAround("Outer", bumpAround("Inner", make<MaterialLayeredBRDF>("L"), 5.0f), 3.0f);
    expectGolden(materialToXml(stacked), "material_stacked_bumps.xml");
}

// The assets of the wrappers' textures and of the layers come before the folded asset.
TEST_F(FoldingTest, TexturesAndLayersComeFirst) {
    auto layered = make<MaterialLayeredBRDF>("Inner");
    const BRDFPtr coat = createBRDF(Base_BRDF::kDiffuse);
    coat->name = "Coat";
    layered->layers.push_back(coat);
    auto bump = bumpAround("Wood", layered);
    bump->bumpTex = boost::make_shared<AColorTexture>();
    expectGolden(materialToXml(bump), "material_bump_texture_and_layer.xml");
}

// Alpha around exclusion around environment around displaced around bump: one
// asset, each wrapper's parameters in that order (the object names not written).
TEST_F(FoldingTest, EveryWrapperFoldsInItsOrder) {
    auto alpha = make<MaterialAlphaContribution>("All");
    auto exclusion = make<MaterialObjectExclusion>("x");
    auto environment = make<MaterialOverrideEnvironment>("e");
    auto displaced = make<MaterialDisplaced>("d");
    alpha->baseMtl = exclusion;
    exclusion->baseMtl = environment;
    exclusion->mode = 2;
    exclusion->objects = {"not", "written"};
    environment->baseMtl = displaced;
    environment->giColor = Color{0.5f, 0.25f, 1};
    displaced->baseMtl = bumpAround("b", make<MaterialLayeredBRDF>("L"));
    expectGolden(materialToXml(alpha), "material_every_wrapper.xml");
}

TEST_F(FoldingTest, DisplacedAroundTwoSidedFoldsOnTheFront) {
    auto front = make<MaterialLayeredBRDF>("Front");
    front->doubleSided = 0;
    auto twoSided = make<Material2Sided>("Two");
    twoSided->front = front;
    twoSided->back = make<MaterialLayeredBRDF>("Back");
    auto displaced = make<MaterialDisplaced>("Disp");
    displaced->baseMtl = twoSided;
    displaced->displaceTexMult = 2.0f;
    displaced->displaceShift = 0.5f;
    expectGolden(materialToXml(displaced), "material_displaced_two_sided.xml");
}

TEST_F(FoldingTest, TwoSidedWritesOnlyReferenceableSides) {
    // An absent back, or a reference without a target identifier, gives no "back".
    auto twoSided = make<Material2Sided>("Two");
    twoSided->front = make<MaterialLayeredBRDF>("Front");
    twoSided->translucency = Color{0.25f, 0.5f, 1.0f};
    const std::string frontOnly = materialToXml(twoSided);
    expectGolden(frontOnly, "material_two_sided_front_only.xml");
    twoSided->back = make<MaterialReference>("NoTarget");
    EXPECT_EQ(materialToXml(twoSided), frontOnly);
    auto host = make<MaterialSkp2Sided>("Host");
    host->back = twoSided->front;
    host->front = twoSided->back;
    expectGolden(materialToXml(host), "material_host_two_sided_back_only.xml");
}

// The toon's textures follow the asset of its base material.
TEST_F(FoldingTest, AngleBlendAndToon) {
    auto blend = make<MaterialAngleBlend>("Blend");
    blend->mtlOne = make<MaterialLayeredBRDF>("One");
    blend->mtlTwo = bumpAround("Two", make<MaterialLayeredBRDF>("L2"));
    expectGolden(materialToXml(blend), "material_angle_blend.xml");

    auto toon = make<MaterialToon>("Toon");
    toon->baseMtl = make<MaterialLayeredBRDF>("Ink");
    toon->lineColorTex = boost::make_shared<AColorTexture>();
    toon->opacityTex = boost::make_shared<AColorTexture>();
    expectGolden(materialToXml(toon), "material_toon.xml");
}

// The assets of the wrappers' textures and of the layers come before the folded asset.
TEST_F(FoldingTest, KindsWithoutLayeredMaterialGiveEmptyBlocks) {
    auto multi = make<MaterialMulti>("M");
    multi->subMaterials.push_back(make<MaterialLayeredBRDF>("L"));
    auto single = make<MaterialSingleBRDF>("S");
    single->brdf = createBRDF(Base_BRDF::kDiffuse);
    auto instance = make<MaterialInstance>("I");
    instance->instancedMaterial = make<MaterialLayeredBRDF>("L");
    for (const MaterialPtr& m : {MaterialPtr(multi), MaterialPtr(single), MaterialPtr(instance), MaterialPtr()})
        EXPECT_EQ(materialToXml(m), "<Assets>\n</Assets>\n");
    std::string out;
    AssetXmlWriter writer(out);
    writeFoldedAsset(writer, MaterialPtr());
    EXPECT_EQ(out, "");
}

TEST_F(FoldingTest, SearchesLookThroughLinksAndReferences) {
    auto target = make<MaterialLayeredBRDF>("Target");
    target->identifier = "id-t";
    ASSERT_TRUE(library().add(target));
    auto reference = make<MaterialReference>("Ref");
    reference->targetId = "id-t";
    reference->heldMaterial = make<MaterialLayeredBRDF>("Held");
    auto linked = make<MaterialLinked>("Link");
    linked->linkedMaterial = reference;
    auto twoSided = make<Material2Sided>("Two");
    twoSided->front = bumpAround("B", make<MaterialLayeredBRDF>("F"));
    twoSided->back = linked;

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
    auto twoSided = make<Material2Sided>("Two");
    twoSided->identifier = "id-two";
    auto back = make<MaterialReference>("Back");
    back->targetId = "id-two";
    twoSided->front = bumpAround("B", make<MaterialLayeredBRDF>("F"));
    twoSided->back = back;
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

// A library file in each generation converts to one "<Assets>" block per material.
TEST_F(FoldingTest, WholeFilesInAllThreeGenerations) {
    auto twoSided = make<Material2Sided>("TenLetters"); // a count of 10 stores a 0x0A byte
    twoSided->front = make<MaterialLayeredBRDF>("Front");
    const MaterialPtr materials[] = {bumpAround("Bump", make<MaterialLayeredBRDF>("Inner"), 2.0f), twoSided};
    const std::string expected = materialToXml(materials[0]) + materialToXml(materials[1]);

    ZelMatFile file;
    std::string payload;
    for (const MaterialPtr& m : materials) {
        file.add(m);
        const ByteVector stored = storedForm(m);
        payload.append(stored.begin(), stored.end());
    }
    ASSERT_EQ(payload.find('\x0D'), std::string::npos);
    ASSERT_NE(payload.find('\x0A'), std::string::npos);
    std::string generation1;
    for (char c : payload) generation1 += c == '\x0A' ? std::string("\x0D\x0A") : std::string(1, c);
    std::ostringstream generation3;
    ASSERT_TRUE(file.writeToStream(generation3));

    const auto header = [](std::uint16_t generation) {
        std::string h(8, '\0');
        const std::uint32_t words[] = {VersionWord::make(0, generation).raw, 2};
        std::memcpy(h.data(), words, 8);
        return h;
    };
    const std::filesystem::path dir = std::filesystem::temp_directory_path();
    const std::pair<std::string, std::string> files[] = {
        {"gen1", header(1) + generation1}, {"gen2", header(2) + payload}, {"gen3", generation3.str()}};
    for (const auto& [label, content] : files) {
        const auto path = dir / ("dexmor-folding-" + label + "-" + std::to_string(::getpid()) + ".zelmat");
        std::ofstream(path, std::ios::binary) << content;
        EXPECT_EQ(convertToXml(FileKind::MaterialLibrary, path), expected) << label;
        std::filesystem::remove(path);
    }
}

// --- the unfolded assets (a material's own writeXml) ---

namespace {

// The values of `attribute` in every `tag` of the document, in order.
std::vector<std::string> allOf(const std::string& xml, const std::string& tag, const std::string& attribute) {
    std::vector<std::string> found;
    const std::string key = " " + attribute + "=\"";
    for (std::size_t at = xml.find(tag); at != std::string::npos; at = xml.find(tag, at + 1)) {
        const std::size_t value = xml.find(key, at);
        if (value == std::string::npos || value > xml.find('>', at)) continue;
        const std::size_t begin = value + key.size();
        found.push_back(xml.substr(begin, xml.find('"', begin) - begin));
    }
    return found;
}

// The urls of the assets written, and the parameter names of the last one.
std::pair<std::vector<std::string>, std::vector<std::string>> unfolded(BaseMaterial& m) {
    std::string xml;
    AssetXmlWriter writer(xml);
    m.writeXml(writer, "/Lib");
    const std::size_t last = xml.rfind("<Asset ");
    return {allOf(xml, "<Asset ", "url"),
            last == std::string::npos ? std::vector<std::string>{} : allOf(xml.substr(last), "<parameter ", "name")};
}

using Names = std::vector<std::string>;

} // namespace

// Each kind's own asset comes after the assets it refers to, in parameter order:
// a sub-material's under the material's url, a texture's under its child name.
// The wrappers without an asset of their own write only their base material's;
// the kinds that stand for other materials write nothing.
TEST_F(FoldingTest, UnfoldedAssetsOfEveryKind) {
    const auto inner = [] { return make<MaterialLayeredBRDF>("Inner"); };
    const TexturePtr texture = boost::make_shared<AColorTexture>();

    auto bump = bumpAround("M", inner());
    bump->bumpTex = texture;
    EXPECT_EQ(unfolded(*bump), std::pair(Names{"/Lib/M/Inner", "/Lib/M/bump_tex", "/Lib/M"},
                                         Names{"bump_tex_mult", "base_mtl", "bump_tex"}));
    std::string xml;
    AssetXmlWriter writer(xml);
    bump->writeXml(writer, "/Lib");
    EXPECT_NE(xml.find("<value>/Lib/M/Inner</value>"), std::string::npos) << xml;
    EXPECT_NE(xml.find("<value>/Lib/M/bump_tex/TexAColor</value>"), std::string::npos) << xml;

    auto exclusion = make<MaterialObjectExclusion>("M");
    exclusion->baseMtl = inner();
    exclusion->objects = {"a", "b"};
    EXPECT_EQ(unfolded(*exclusion),
              std::pair(Names{"/Lib/M/Inner", "/Lib/M"}, Names{"base_mtl", "mode", "short_circuit", "objects"}));

    auto alpha = make<MaterialAlphaContribution>("M");
    alpha->alphaTex = texture;
    EXPECT_EQ(unfolded(*alpha), std::pair(Names{"/Lib/M/alpha_tex", "/Lib/M"},
                                          Names{"alpha", "alpha_tex_mult", "base_mtl", "alpha_tex"}));

    auto toon = make<MaterialToon>("M");
    toon->baseMtl = inner();
    toon->opacityTex = texture;
    EXPECT_EQ(unfolded(*toon),
              std::pair(Names{"/Lib/M/Inner", "/Lib/M/opacity_tex", "/Lib/M"},
                        Names{"base_mtl", "color_tex", "distort_tex", "opacity_tex", "width_tex", "color",
                              "color_tex_mult", "distort", "distort_tex_mult", "opacity", "opacity_tex_mult",
                              "width", "width_tex_mult", "z_threshold", "trace_bias", "normal_threshold",
                              "line_units", "silhouette_mult", "do_secondary", "divide_by_distance",
                              "do_silhouette_mult"}));

    auto twoSided = make<Material2Sided>("M");
    twoSided->back = inner();
    twoSided->transparencyTex = texture;
    EXPECT_EQ(unfolded(*twoSided),
              std::pair(Names{"/Lib/M/Inner", "/Lib/M/transparency_tex", "/Lib/M"},
                        Names{"front", "back", "translucency_tex", "transparency_tex", "translucency", "transparency",
                              "translucency_tex_mult", "transparency_tex_mult", "force_1sided"}));

    auto host = make<MaterialSkp2Sided>("M");
    host->front = inner();
    EXPECT_EQ(unfolded(*host), std::pair(Names{"/Lib/M/Inner", "/Lib/M"}, Names{"front", "back", "force_1sided"}));

    auto blend = make<MaterialAngleBlend>("M");
    blend->mtlOne = inner();
    blend->mtlTwo = inner();
    EXPECT_EQ(unfolded(*blend), std::pair(Names{"/Lib/M/Inner", "/Lib/M/Inner", "/Lib/M"},
                                          Names{"mtl_one", "mtl_two", "start_angle", "stop_angle"}));

    auto displaced = make<MaterialDisplaced>("M");
    displaced->baseMtl = inner();
    displaced->displaceTex = texture;
    EXPECT_EQ(unfolded(*displaced).first, Names{"/Lib/M/Inner"});
    auto environment = make<MaterialOverrideEnvironment>("M");
    environment->giTex = texture;
    EXPECT_TRUE(unfolded(*environment).first.empty());

    auto reference = make<MaterialReference>("M");
    reference->heldMaterial = inner();
    EXPECT_TRUE(unfolded(*reference).first.empty());
}
