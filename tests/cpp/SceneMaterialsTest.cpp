// The scene material library: naming rules, entries and identifiers, the default
// material, its record, and use from several threads.
#include "MaterialTestSupport.hpp"

#include <dexmor/brdfs/BRDFs.hpp>

#include <atomic>
#include <thread>

using namespace materialtest;

namespace {

using SceneMaterialsTest = LibraryTest;

void addLayered(SceneMaterials& lib, std::initializer_list<const char*> names) {
    for (const char* n : names) ASSERT_TRUE(lib.add(make<MaterialLayeredBRDF>(n))) << n;
}

// A library record of version 2 with one layered material per name and the given
// identifier entries.
ByteVector libraryRecord(std::initializer_list<const char*> names,
                         std::initializer_list<std::pair<const char*, const char*>> ids) {
    Image image;
    image.version(0, 2).u32(static_cast<std::uint32_t>(names.size()));
    for (const char* n : names) image.append(storedForm(make<MaterialLayeredBRDF>(n)));
    image.u32(static_cast<std::uint32_t>(ids.size()));
    for (const auto& [key, value] : ids) image.text(key).text(value);
    return image.bytes;
}

bool readLibrary(SceneMaterials& lib, const ByteVector& bytes, std::string* why = nullptr) {
    QuickArchive ar(bytes.data(), bytes.size());
    const bool ok = lib.readFromArchive(ar);
    if (why) *why = testsupport::failureOf(ar);
    return ok;
}

} // namespace

TEST_F(SceneMaterialsTest, UniqueNames) {
    addLayered(library(), {"Wood", "Wood1", "my_mat"});
    const std::pair<const char*, const char*> cases[] = {
        {"Wood12", "Wood2"},              // trailing digits stripped, first free counter form
        {"Oak 7", "Oak_"},                // a free name is made legal
        {"3d mat", "a3d_mat"},            // a leading digit gets an "a"
        {"my mat", "my_mat1"},            // the legal form must be free as well
        {"42", "a1"},                     // an all-digit name never gives an empty one
        {"Wood\xD9\xA3", "Wood\xD9\xA3"}, // only ASCII digits count
    };
    for (const auto& [in, out] : cases) EXPECT_EQ(library().uniqueName(in), out) << in;

    // New materials are named after "DefaultMaterial" by the library's content only:
    // nothing is reserved.
    EXPECT_EQ(MaterialLayeredBRDF().name, "DefaultMaterial");
    addLayered(library(), {"DefaultMaterial"});
    EXPECT_EQ(MaterialToon().name + MaterialToon().name, "DefaultMaterial1DefaultMaterial1");
}

TEST_F(SceneMaterialsTest, LegalNamesAndValidation) {
    EXPECT_EQ(SceneMaterials::legalName("1st coat  x"), "a1st_coat__x");
    EXPECT_EQ(SceneMaterials::legalName("tab\there"), "tab\there");
    EXPECT_EQ(SceneMaterials::legalName(""), "");

    addLayered(library(), {"Oak"});
    std::string message = "stale";
    EXPECT_TRUE(library().validateName("oak", message) && message.empty());
    EXPECT_FALSE(library().validateName("Oak", message));
    EXPECT_EQ(message, "The name, \"Oak\", is already in use");
    EXPECT_FALSE(library().validateName("", message));
    EXPECT_EQ(message, "A name must have at least one character");
}

TEST_F(SceneMaterialsTest, EntriesAndIdentifiers) {
    auto oak = make<MaterialLayeredBRDF>("Oak", [](auto& m) { m.identifier = "id-oak"; });
    auto pine = make<MaterialLayeredBRDF>("Pine");
    ASSERT_TRUE(library().add(oak) && library().add(pine));
    EXPECT_EQ(library().getById("id-oak"), oak);
    const std::string pineId = library().idOf("pine"); // ASCII case is ignored
    EXPECT_EQ(pineId.size(), 36u);                     // a fresh UUID text
    EXPECT_EQ(library().getById(pineId), pine);

    // Refused additions change nothing.
    EXPECT_FALSE(library().add(make<MaterialLayeredBRDF>("Oak")) || library().add(make<MaterialLayeredBRDF>("")) ||
                 library().add(MaterialPtr()));
    std::ostringstream dump;
    library().dump(dump);
    const std::string oakLine = "id-oak Oak\n", pineLine = pineId + " Pine\n";
    EXPECT_EQ(dump.str(), "Oak Oak\nPine Pine\nBeginning UUIDs\n" +
                              (pineId < "id-oak" ? pineLine + oakLine : oakLine + pineLine));

    // An identifier in use is not taken over: the newcomer gets its own.
    auto copycat = make<MaterialLayeredBRDF>("Copycat", [](auto& m) { m.identifier = "id-oak"; });
    ASSERT_TRUE(library().add(copycat));
    EXPECT_EQ(library().getById("id-oak"), oak);
    EXPECT_EQ(library().getById(library().idOf("Copycat")), copycat);

    // Names that differ only in case are distinct entries with their own identifiers.
    ASSERT_TRUE(library().add(make<MaterialLayeredBRDF>("oak")));
    EXPECT_EQ(library().idOf("Oak"), "id-oak");
    EXPECT_TRUE(library().remove("oak"));
    EXPECT_EQ(library().getById("id-oak"), oak);
    EXPECT_FALSE(library().remove("OAK"));
    EXPECT_TRUE(library().remove("Oak"));
    EXPECT_TRUE(library().idOf("Oak").empty() && !library().get("Oak"));

    // An identifier entry whose name differs in ASCII case still goes with its name.
    ASSERT_TRUE(readLibrary(library(), libraryRecord({"Elm"}, {{"id-elm", "ELM"}})));
    EXPECT_EQ(library().idOf("Elm"), "id-elm");
    EXPECT_TRUE(library().remove("Elm"));
    EXPECT_EQ(library().idOf("ELM"), "");
}

TEST_F(SceneMaterialsTest, Rename) {
    auto oak = make<MaterialLayeredBRDF>("Oak", [](auto& m) { m.identifier = "id-oak"; });
    ASSERT_TRUE(library().add(oak));
    addLayered(library(), {"Pine"});

    oak->name = "Pine"; // taken by another entry: refused, nothing lost
    EXPECT_FALSE(library().rename("Oak", oak));
    EXPECT_EQ(library().get("Oak"), oak);
    oak->name = "";
    EXPECT_FALSE(library().rename("Oak", oak) || library().rename("Oak", MaterialPtr()));
    oak->name = "Elm";
    EXPECT_FALSE(library().rename("Ash", oak));
    EXPECT_TRUE(library().rename("Oak", oak));
    EXPECT_TRUE(!library().get("Oak") && library().getById("id-oak") == oak);
    // A change of case only keeps the identifier pointing at the material.
    oak->name = "ELM";
    EXPECT_TRUE(library().rename("Elm", oak));
    EXPECT_EQ(library().getById("id-oak"), oak);
    std::vector<std::string> names;
    library().names(names);
    EXPECT_EQ(names, (std::vector<std::string>{"ELM", "Pine"}));
}

TEST_F(SceneMaterialsTest, NamesFollowUtf16Order) {
    // U+FFFD sorts after U+1F600 in UTF-16 (surrogates come first), and capitals
    // before small letters.
    addLayered(library(), {"b", "\xEF\xBF\xBD", "\xF0\x9F\x98\x80", "B", "a"});
    std::vector<std::string> names;
    library().names(names);
    EXPECT_EQ(names, (std::vector<std::string>{"B", "a", "b", "\xF0\x9F\x98\x80", "\xEF\xBF\xBD"}));
}

TEST_F(SceneMaterialsTest, DefaultMaterialReferencesAndCopies) {
    EXPECT_FALSE(library().getDefault());
    library().ensureDefault();
    const auto def = boost::dynamic_pointer_cast<MaterialLayeredBRDF>(library().getDefault());
    ASSERT_TRUE(def && def->layers.size() == 1u);
    EXPECT_EQ(def->name, "Default_Kavor_Material");
    EXPECT_TRUE(def->layers[0]->kindId() == Base_BRDF::kDiffuse && def->layers[0]->name == "Diffuse");
    library().ensureDefault(); // already there: nothing changes
    EXPECT_TRUE(library().getDefault() == def && library().size() == 1u);

    const auto ref = boost::dynamic_pointer_cast<MaterialReference>(library().makeReference("default_kavor_material"));
    ASSERT_TRUE(ref);
    EXPECT_EQ(library().getById(ref->targetId), def);
    EXPECT_TRUE(boost::dynamic_pointer_cast<MaterialReference>(library().makeReference("none"))->targetId.empty());

    const MaterialPtr copy = library().getOrCopy("Default_Kavor_Material");
    ASSERT_TRUE(copy);
    EXPECT_TRUE(copy->name == "Default_Kavor_Material1" && copy->isEqual(def));
    EXPECT_FALSE(library().getOrCopy("none"));
}

TEST_F(SceneMaterialsTest, LibraryRecord) {
    auto oak = make<MaterialLayeredBRDF>("Oak", [](auto& m) { m.doubleSided = 0; });
    auto bump = make<MaterialBump>("Bumpy", [](auto& m) { m.baseMtl = make<MaterialLayeredBRDF>("inner"); });
    ASSERT_TRUE(library().add(oak) && library().add(bump));
    const std::string oakId = library().idOf("Oak");
    ASSERT_TRUE(readLibrary(library(), testsupport::recordOf(library())));
    EXPECT_EQ(library().size(), 2u);
    EXPECT_TRUE(library().get("Oak") != oak && library().get("Oak")->isEqual(oak));
    EXPECT_TRUE(library().get("Bumpy")->isEqual(bump));
    EXPECT_EQ(library().idOf("Oak"), oakId);

    // Version 1 holds the materials only; each gets a fresh identifier.
    Image v1;
    v1.version(0, 1).u32(2).append(storedForm(oak)).append(storedForm(bump));
    ASSERT_TRUE(readLibrary(library(), v1.bytes));
    EXPECT_TRUE(library().size() == 2u && library().idOf("Oak") != oakId);
    EXPECT_TRUE(library().getById(library().idOf("Bumpy")));

    // Failures say why; what was read before a failure stays.
    std::string why;
    const ByteVector twice = Image().version(0, 1).u32(2).append(storedForm(oak)).append(storedForm(oak)).bytes;
    EXPECT_FALSE(readLibrary(library(), twice, &why));
    EXPECT_NE(why.find("\"Oak\" cannot join the library"), std::string::npos) << why;
    EXPECT_EQ(library().size(), 1u);
    // So in version 2, where the stored names are kept as they are.
    const ByteVector twiceV2 =
        Image().version(0, 2).u32(2).append(storedForm(bump)).append(storedForm(bump)).u32(0).bytes;
    EXPECT_FALSE(readLibrary(library(), twiceV2, &why));
    EXPECT_NE(why.find("\"Bumpy\" cannot join the library"), std::string::npos) << why;
    EXPECT_EQ(library().size(), 1u);
    EXPECT_FALSE(readLibrary(library(), Image().version(0, 3).u32(0).bytes, &why));
    EXPECT_NE(why.find("unknown material library version (0, 3)"), std::string::npos) << why;
    EXPECT_FALSE(readLibrary(library(), Image().version(0, 2).u32(500000000).bytes, &why));
    EXPECT_EQ(library().size(), 0u);

    // The library's XML: every material's own asset, in name order.
    addLayered(library(), {"b", "a"});
    std::string xml;
    AssetXmlWriter writer(xml);
    library().writeXml(writer);
    EXPECT_LT(xml.find("url=\"/a\""), xml.find("url=\"/b\""));
}

// Conversions read the library on several threads while the host changes it.
TEST_F(SceneMaterialsTest, ReadersAndAWriterOnSeveralThreads) {
    ASSERT_TRUE(library().add(make<MaterialLayeredBRDF>("Target", [](auto& m) { m.identifier = "id-target"; })));
    std::atomic<bool> stop{false};
    std::atomic<int> misses{0};
    std::vector<std::thread> readers;
    for (int t = 0; t < 3; ++t)
        readers.emplace_back([&] {
            while (!stop) {
                auto ref = boost::make_shared<MaterialReference>();
                ref->targetId = "id-target";
                if (materialToXml(ref).find("url=\"/DefaultMaterial") == std::string::npos) ++misses;
                (void)library().uniqueName("Churn5");
            }
        });
    for (int i = 0; i < 2000; ++i) {
        const std::string name = "Churn" + std::to_string(i % 7);
        library().add(make<MaterialLayeredBRDF>(name));
        library().remove(name);
    }
    stop = true;
    for (std::thread& t : readers) t.join();
    EXPECT_EQ(misses, 0);
}
