// The survey of a document: the materials a library lists with their assets, and
// each finding of the lint on a library that has it.
#include "../../fuzz/HostileShapes.hpp"
#include "TestSupport.hpp"

#include <dexmor/dexmor.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace OrvexKavorCore;
using namespace testsupport;
using testing::ElementsAre;

namespace {

Diagnosis surveyed(const std::vector<MaterialPtr>& materials) {
    QuickArchive ar;
    for (const MaterialPtr& material : materials) EXPECT_TRUE(writeMember(ar, material));
    std::string bytes(8 + ar.writePosition(), '\0');
    const std::uint32_t header[2] = {VersionWord::make(0, 2).raw, static_cast<std::uint32_t>(materials.size())};
    std::memcpy(bytes.data(), header, sizeof header);
    ar.getRaw(bytes.data() + 8, ar.writePosition());
    std::string xml;
    StringSink sink(xml);
    ConversionOptions options;
    options.survey = true;
    return convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink, options);
}

MaterialPtr named(MaterialPtr material, std::string name) {
    material->name = std::move(name);
    return material;
}

} // namespace

TEST(DocumentSurvey, ListsEachMaterialWithItsAssetOrNone) {
    auto multi = named(boost::make_shared<MaterialMulti>(), "Set");
    const Diagnosis result = surveyed({hostile::diffuseMaterial(), multi, named(hostile::bumpChain(1), "Bumped")});
    ASSERT_TRUE(result.readsAsBinary);
    ASSERT_EQ(result.materials.size(), 3u);
    EXPECT_EQ(result.materials[0].kind, "layered material");
    EXPECT_EQ(result.materials[0].assetUrl, "/Leaf");
    EXPECT_EQ(result.materials[1].name, "Set");
    EXPECT_EQ(result.materials[1].assetUrl, std::nullopt); // a multi material folds into no asset
    EXPECT_EQ(result.materials[2].assetUrl, "/Bumped");
    EXPECT_THAT(result.warnings, ElementsAre());
}

TEST(DocumentSurvey, WarnsOfEachThingAConsumerMayTripOver) {
    // Two layers of one name give one url twice.
    auto twoLayers = named(hostile::diffuseMaterial(), "Twin");
    auto layered = boost::dynamic_pointer_cast<MaterialLayeredBRDF>(twoLayers);
    layered->layers.push_back(layered->layers.front()->clone());
    // A side that is a multi material has no asset to refer to.
    auto twoSided = boost::make_shared<Material2Sided>();
    twoSided->name = "Sheet";
    twoSided->front = hostile::diffuseMaterial();
    twoSided->back = named(boost::make_shared<MaterialMulti>(), "Set");
    // A control character in a name reaches every url beneath it.
    auto control = named(hostile::diffuseMaterial(), "Bad\x01Name");

    const Diagnosis result = surveyed({twoLayers, twoSided, control});
    ASSERT_TRUE(result.readsAsBinary);
    EXPECT_THAT(result.warnings,
                testing::UnorderedElementsAre(
                    "material 0 \"Twin\": the url \"/Twin/BRDFDiffuse\" is given to 2 assets",
                    "material 1 \"Sheet\": the reference \"/Set\" names no asset of the document",
                    "material 2 \"Bad\x01Name\": the url \"/Bad\\x01Name/BRDFDiffuse\" holds a character XML 1.0 cannot carry",
                    "material 2 \"Bad\x01Name\": the url \"/Bad\\x01Name\" holds a character XML 1.0 cannot carry"));
}

TEST(DocumentSurvey, SeesTheSameDocumentStreamedOrWhole) {
    const std::string sample = sampleFile("sample.zelmat");
    ConversionOptions options;
    options.survey = true;
    std::string xml;
    StringSink whole(xml);
    CallbackSink streamed([](std::string_view) {});
    const Diagnosis once = convert(FileKind::MaterialLibrary, Input::ofBytes(sample), whole, options);
    const Diagnosis twice = convert(FileKind::MaterialLibrary, Input::ofBytes(sample), streamed, options);
    EXPECT_EQ(once.warnings, twice.warnings);
    ASSERT_EQ(once.materials.size(), 20u);
    ASSERT_EQ(twice.materials.size(), 20u);
    for (std::size_t i = 0; i < 20; ++i) EXPECT_EQ(once.materials[i].assetUrl, twice.materials[i].assetUrl) << i;
}
