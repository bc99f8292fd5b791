// Lists of members too long to hold while a library is converted: the document
// is the one the held objects give, and the items are not kept.
#include "TestSupport.hpp"

#include "../../fuzz/HostileShapes.hpp"

#include <dexmor/materials/MaterialAssets.hpp>

#include <gtest/gtest.h>

#include <functional>

using namespace OrvexKavorCore;

namespace {

// A layered material of `count` layers of several kinds (some with a sky texture,
// whose record writes into the conversion's default sun), inside a two-sided
// material whose later fields are read after the layers.
MaterialPtr manyLayers(std::size_t count) {
    auto layered = boost::make_shared<MaterialLayeredBRDF>();
    layered->name = "Stack";
    for (std::size_t i = 0; i < count; ++i) {
        BRDFPtr layer = createBRDF(i % 3 == 0 ? Base_BRDF::kDiffuse : i % 3 == 1 ? Base_BRDF::kPhong : Base_BRDF::kGlass);
        layer->name = "L" + std::to_string(i);
        if (i % 500 == 7)
            if (auto* diffuse = dynamic_cast<Diffuse_BRDF*>(layer.get())) diffuse->colorTex = boost::make_shared<SkyTexture>();
        layered->layers.push_back(layer);
    }
    auto sheet = boost::make_shared<Material2Sided>();
    sheet->name = "Sheet";
    sheet->front = layered;
    sheet->back = hostile::diffuseMaterial();
    sheet->translucencyTex = boost::make_shared<SkyTexture>();
    return sheet;
}

} // namespace

TEST(LongLists, ConvertToTheDocumentOfTheHeldObjects) {
    constexpr std::size_t kHeld = ListReplay::kHeldItems;
    for (const std::size_t count : {kHeld - 1, kHeld, 2 * kHeld}) {
        std::string bytes;
        {
            const ConversionContext context;
            bytes = hostile::libraryOf(manyLayers(count));
        }
        ASSERT_FALSE(bytes.empty());
        // Read outside a conversion, every layer is held.
        std::string held;
        {
            const ConversionContext context;
            ZelMatFile file;
            ASSERT_TRUE(file.readFromBytes(bytes));
            const auto& front = dynamic_cast<Material2Sided&>(*file.materials.at(0)).front;
            ASSERT_EQ(dynamic_cast<MaterialLayeredBRDF&>(*front).layers.size(), count);
            held = materialToXml(file.materials.at(0));
        }
        // Converted, the long list is read again as it is written, whole or streamed.
        EXPECT_EQ(testsupport::convertBytesToXml(FileKind::MaterialLibrary, bytes), held) << count;
        EXPECT_EQ(testsupport::streamedXml(FileKind::MaterialLibrary, bytes), held) << count;
    }
}

namespace {

boost::shared_ptr<MaterialMulti> multiOf(std::size_t count, const std::function<MaterialPtr()>& item) {
    auto multi = boost::make_shared<MaterialMulti>();
    multi->name = "Set";
    for (std::size_t i = 0; i < count; ++i) multi->subMaterials.push_back(item());
    return multi;
}

// The sub-materials a multi material holds, at every depth.
std::size_t heldBelow(const MaterialPtr& material) {
    const auto* multi = dynamic_cast<const MaterialMulti*>(material.get());
    std::size_t held = multi ? multi->subMaterials.size() : 0;
    if (multi)
        for (const MaterialPtr& item : multi->subMaterials) held += heldBelow(item);
    return held;
}

// The first material of `bytes` (a library) read as a conversion reads it.
MaterialPtr readAsConverted(const std::string& bytes) {
    ListReplay replaying{.enabled = true};
    PerConversion<ListReplay>::Use use(replaying);
    QuickArchive ar;
    ar.putRaw(bytes.data() + 8, bytes.size() - 8);
    MaterialPtr material;
    EXPECT_TRUE(readMember(ar, material)) << testsupport::failureOf(ar);
    return material;
}

} // namespace

TEST(LongLists, AreNotHeldWhileALibraryIsConverted) {
    // A multi material's sub-materials show in no asset; beyond the items a
    // material may hold they are checked and dropped, at any depth, and a
    // failing item still fails the file.
    const ConversionContext context;
    const std::size_t count = ListReplay::kHeldItems + 1000;
    const auto empty = [] { return boost::make_shared<MaterialMulti>(); };
    const std::string bytes = hostile::libraryOf(std::vector<MaterialPtr>{multiOf(count, empty), hostile::diffuseMaterial()});
    const Diagnosis read = testsupport::diagnoseBytes(FileKind::MaterialLibrary, bytes);
    EXPECT_TRUE(read.readsAsBinary) << read.reason();

    const MaterialPtr material = readAsConverted(bytes);
    const auto& multi = dynamic_cast<const MaterialMulti&>(*material);
    EXPECT_EQ(multi.subMaterials.size(), 0u);
    EXPECT_EQ(multi.replayedSubMaterials.count, count);
    EXPECT_EQ(multi.name, "Set"); // the fields after the list read on

    // 80 lists of 80: the first ones are held, the rest checked and dropped.
    const MaterialPtr nested =
        readAsConverted(hostile::libraryOf(MaterialPtr(multiOf(80, [&] { return multiOf(80, empty); }))));
    EXPECT_GT(heldBelow(nested), ListReplay::kHeldItems / 2);
    EXPECT_LE(heldBelow(nested), ListReplay::kHeldItems);

    // The object exclusion's names show in no asset either.
    auto exclusion = boost::make_shared<MaterialObjectExclusion>();
    exclusion->baseMtl = hostile::diffuseMaterial();
    exclusion->objects.assign(ListReplay::kHeldItems + 1, "Chair");
    const std::string excluding = hostile::libraryOf(MaterialPtr(exclusion));
    EXPECT_TRUE(dynamic_cast<const MaterialObjectExclusion&>(*readAsConverted(excluding)).objects.empty());
    EXPECT_EQ(testsupport::convertBytesToXml(FileKind::MaterialLibrary, excluding), materialToXml(exclusion));

    // An unknown kind id in the list, first or last: the file fails there.
    const std::size_t itemSize = hostile::libraryOf(MaterialPtr(empty())).size() - 8;
    const std::size_t firstItem = 8 + 4 + 4 + 4; // header, the multi's kind id, version word, count
    for (const std::size_t item : {std::size_t{0}, count - 1}) {
        std::string broken = bytes;
        broken[firstItem + item * itemSize] = 99;
        const Diagnosis failed = testsupport::diagnoseBytes(FileKind::MaterialLibrary, broken);
        EXPECT_FALSE(failed.readsAsBinary);
        ASSERT_TRUE(failed.failure);
        EXPECT_EQ(failed.failure->recordPathText(), "material 0 / material " + std::to_string(item)) << item;
    }
}
