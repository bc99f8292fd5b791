// Folding material trees into the assets of a material library document: golden
// XML for each rule, the searches (through the library, around cycles) and whole
// files of all three generations.
#include "MaterialTestSupport.hpp"

#include "archive/Conversion.hpp"
#include "archive/ZelMatFile.hpp"
#include "brdfs/BRDFs.hpp"
#include "textures/Textures.hpp"

#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

using namespace materialtest;

namespace {

using FoldingTest = LibraryTest;

// The document in short: one line per asset ("asset url layout plugin") and one
// per parameter ("  name=value"; colours and list entries joined by commas, an
// empty reference or list as nothing).
std::string summary(const std::string& xml) {
    const auto attr = [](const std::string& l, const std::string& key) {
        const auto p = l.find(key + "=\"");
        if (p == std::string::npos) return std::string();
        const auto start = p + key.size() + 2;
        return l.substr(start, l.find('"', start) - start);
    };
    const auto inner = [](const std::string& l) {
        const auto open = l.find('>') + 1;
        return l.substr(open, l.rfind('<') - open);
    };
    std::istringstream in(xml);
    std::string line, out, parameter, value;
    while (std::getline(in, line)) {
        line.erase(0, line.find_first_not_of(' '));
        if (line.rfind("<Asset ", 0) == 0) {
            out += "asset " + attr(line, "url") + " " + attr(line, "layout");
        } else if (line.rfind("<kavorplugin ", 0) == 0) {
            out += " " + attr(line, "name") + "\n";
        } else if (line.rfind("<parameter ", 0) == 0) {
            parameter = attr(line, "name");
            value.clear();
        } else if (line == "</parameter>") {
            out += "  " + parameter + "=" + value + "\n";
        } else if (line.rfind("<value>", 0) == 0 && line.size() > 7) {
            value = inner(line);
        } else if (line.size() > 3 && line[0] == '<' && line[1] != '/' &&
                   (line[2] == '>' || line.rfind("<entry>", 0) == 0)) {
            value += (value.empty() ? "" : ",") + inner(line);
        }
    }
    return out;
}

std::string foldedSummary(const MaterialPtr& m) { return summary(materialToXml(m)); }

boost::shared_ptr<MaterialBump> bumpAround(const std::string& name, const MaterialPtr& base, float mult = 1.0f) {
    auto bump = make<MaterialBump>(name);
    bump->baseMtl = base;
    bump->bumpTexMult = mult;
    return bump;
}

} // namespace

TEST_F(FoldingTest, BumpAroundLayered) {
    const std::string expected = R"(<Assets>
  <Asset layout="defkvmat" renderer="kavor" type="material" url="/Bump &amp; co" >
    <plugin>
      <kavorplugin name="MtlORVEX" type="material">
        <parameters>
          <parameter type="integer" name="double_sided" listType="none" label="double_sided">
            <value>1</value>
          </parameter>
          <parameter type="list" name="brdfs" listType="plugin" label="brdfs">
            <value>
            <list>
            </list>
            </value>
          </parameter>
          <parameter type="bool" name="bump_on" listType="none" label="bump_on">
            <value>1</value>
          </parameter>
          <parameter type="float" name="bump_tex_mult" listType="none" label="bump_tex_mult">
            <value>2.5</value>
          </parameter>
          <parameter type="plugin" name="bump_tex" listType="none" label="bump_tex">
          </parameter>
        </parameters>
      </kavorplugin>
    </plugin>
  </Asset>
</Assets>
)";
    EXPECT_EQ(materialToXml(bumpAround("Bump & co", make<MaterialLayeredBRDF>("Inner"), 2.5f)), expected);

    // Two stacked bumps: only the outer one is folded.
    const auto stacked = bumpAround("Outer", bumpAround("Inner", make<MaterialLayeredBRDF>("L"), 5.0f), 3.0f);
    EXPECT_EQ(foldedSummary(stacked), "asset /Outer defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n  bump_on=1\n"
                                      "  bump_tex_mult=3\n  bump_tex=\n");
}

// The assets of the wrappers' textures and of the layers come before the folded asset.
TEST_F(FoldingTest, TexturesAndLayersComeFirst) {
    auto layered = make<MaterialLayeredBRDF>("Inner");
    const BRDFPtr coat = createBRDF(Base_BRDF::kDiffuse);
    coat->name = "Coat";
    layered->layers.push_back(coat);
    auto bump = bumpAround("Wood", layered);
    bump->bumpTex = boost::make_shared<AColorTexture>();
    const std::string xml = materialToXml(bump);
    const std::string before =
        "<Assets>\n" + texturetest::xmlOf(*bump->bumpTex, "/Wood/bump_tex") + texturetest::xmlOf(*coat, "/Wood");
    EXPECT_EQ(xml.substr(0, before.size()), before);
    EXPECT_EQ(summary(xml.substr(before.size())),
              "asset /Wood defkvmat MtlORVEX\n  double_sided=1\n  brdfs=/Wood/Coat\n  bump_on=1\n"
              "  bump_tex_mult=1\n  bump_tex=/Wood/bump_tex/TexAColor\n");
}

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
    const std::string folded = foldedSummary(alpha);
    EXPECT_EQ(folded.substr(0, folded.find('\n')), "asset /All defkvmat MtlORVEX");
    EXPECT_NE(folded.find("  gi_color=0.5,0.25,1\n"), std::string::npos);
    EXPECT_NE(folded.find("  ignore_objects=1\n"), std::string::npos);
    std::string names;
    std::istringstream in(folded);
    for (std::string line; std::getline(in, line);)
        if (line.rfind("  ", 0) == 0) names += line.substr(2, line.find('=') - 2) + " ";
    EXPECT_EQ(names,
              "double_sided brdfs bump_on bump_tex_mult bump_tex displace_on displace_shift displace_edge_length "
              "displace_tex_mult displace_max_subdivs displace_continuity displace_view_dependent "
              "displace_use_globals displace_tex gi_tex bg_tex reflect_tex refract_tex gi_color bg_color "
              "reflect_color refract_color bg_tex_mult gi_tex_mult reflect_tex_mult refract_tex_mult override_bg "
              "override_gi override_reflect override_refract ignore_objects short_circuit alpha alpha_tex_mult "
              "alpha_tex ");
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
    EXPECT_EQ(foldedSummary(displaced),
              "asset /Disp defkvmat MtlORVEX\n  double_sided=0\n  brdfs=\n  displace_on=1\n  displace_shift=0.5\n"
              "  displace_edge_length=4\n  displace_tex_mult=2\n  displace_max_subdivs=256\n"
              "  displace_continuity=1\n  displace_view_dependent=1\n  displace_use_globals=1\n  displace_tex=\n");
}

TEST_F(FoldingTest, TwoSidedWritesOnlyReferenceableSides) {
    // An absent back, or a reference without a target identifier, gives no "back".
    auto twoSided = make<Material2Sided>("Two");
    twoSided->front = make<MaterialLayeredBRDF>("Front");
    twoSided->translucency = Color{0.25f, 0.5f, 1.0f};
    const std::string expected = "asset /Front defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n"
                                 "asset /Two TwoSidedMatLayout Mtl2Sided\n  front=/Front\n  translucency=0.25,0.5,1\n"
                                 "  force_1sided=0\n";
    EXPECT_EQ(foldedSummary(twoSided), expected);
    twoSided->back = make<MaterialReference>("NoTarget");
    EXPECT_EQ(foldedSummary(twoSided), expected);
    auto host = make<MaterialSkp2Sided>("Host");
    host->back = twoSided->front;
    host->front = twoSided->back;
    EXPECT_EQ(foldedSummary(host), "asset /Front defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n"
                                   "asset /Host SkpTwoSidedMatLayout MtlSkp2Sided\n  back=/Front\n  force_1sided=0\n");
}

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

TEST_F(FoldingTest, AngleBlendAndToon) {
    auto blend = make<MaterialAngleBlend>("Blend");
    blend->mtlOne = make<MaterialLayeredBRDF>("One");
    blend->mtlTwo = bumpAround("Two", make<MaterialLayeredBRDF>("L2"));
    EXPECT_EQ(foldedSummary(blend), "asset /One defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n"
                                    "asset /Two defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n  bump_on=1\n"
                                    "  bump_tex_mult=1\n  bump_tex=\n"
                                    "asset /Blend AngleBlendMatLayout MtlAngleBlend\n  mtl_one=/One\n  mtl_two=/Two\n"
                                    "  start_angle=75\n  stop_angle=150\n");

    auto toon = make<MaterialToon>("Toon");
    toon->baseMtl = make<MaterialLayeredBRDF>("Ink");
    toon->lineColorTex = boost::make_shared<AColorTexture>();
    toon->opacityTex = boost::make_shared<AColorTexture>();
    const std::string xml = materialToXml(toon);
    const std::string colorXml = texturetest::xmlOf(*toon->lineColorTex, "/Toon/color_tex");
    const std::string opacityXml = texturetest::xmlOf(*toon->opacityTex, "/Toon/opacity_tex");
    const auto folded = xml.find("</Asset>\n") + 9;
    EXPECT_EQ(xml.substr(folded, colorXml.size() + opacityXml.size()), colorXml + opacityXml);
    const std::string s = foldedSummary(toon);
    EXPECT_EQ(s.substr(s.find("asset /Toon ")),
              "asset /Toon ToonMatLayout MtlToon\n  base_mtl=/Ink\n  lineColorTex=/Toon/color_tex/TexAColor\n"
              "  distortTex=\n  opacityTex=/Toon/opacity_tex/TexAColor\n  lineWidthTex=\n  lineColor=0,0,0\n"
              "  lineColorTexMult=1\n  distort=0\n  distortTexMult=1\n  opacity=1\n  opacityTexMult=1\n"
              "  lineWidth=1.5\n  lineWidthTexMult=1\n  zThreshold=0.95\n  traceBias=0.02\n  normalThreshold=0.7\n"
              "  silhouetteMult=1.5\n  doSecondary=1\n  divideByDist=0\n  doSilhouetteMult=0\n");
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
    EXPECT_NE(foldedSummary(linked).find("asset /Link defkvmat"), std::string::npos);

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
    EXPECT_EQ(foldedSummary(twoSided), "asset /B defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n  bump_on=1\n"
                                       "  bump_tex_mult=1\n  bump_tex=\n"
                                       "asset /Back defkvmat MtlORVEX\n  double_sided=1\n  brdfs=\n  bump_on=1\n"
                                       "  bump_tex_mult=1\n  bump_tex=\n"
                                       "asset /Two TwoSidedMatLayout Mtl2Sided\n  front=/B\n  back=/Back\n"
                                       "  translucency=0,0,0\n  force_1sided=0\n");
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
