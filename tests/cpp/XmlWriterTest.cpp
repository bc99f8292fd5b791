// The asset document writer: the exact text of documents, of the values the golden
// documents of the families do not show, of references between assets and of
// lists, and the escaping rules.
#include <dexmor/xml/AssetXmlWriter.hpp>

#include "TrimSupport.hpp"

#include <dexmor/textures/ColorTextures.hpp>

using namespace OrvexKavorCore;
using testsupport::expectGolden;

TEST(XmlWriter, DocumentsOfMaterialsAndSections) {
    std::string out;
    AssetXmlWriter w(out);
    // Two materials give two documents, one after the other.
    for (int i = 0; i < 2; ++i) {
        w.beginDocument();
        w.beginAsset("/Oak", "material", "defkvmat");
        w.beginPlugin("MtlSingleBRDF", "material");
        w.beginParameters();
        w.writeInteger("double_sided", 1);
        w.endParameters();
        w.endPlugin();
        w.endAsset();
        w.endDocument();
    }
    expectGolden(out, "xml_writer_two_documents.xml");

    // A section's "Assets" element is never indented; its assets stand one level deeper.
    out.clear();
    w.beginElement("Assets");
    w.beginAsset("/Output", "settings", "defkvsettings");
    w.endAsset();
    w.endElement("Assets");
    EXPECT_EQ(out, "<Assets>\n"
                   "    <Asset layout=\"defkvsettings\" renderer=\"kavor\" type=\"settings\" url=\"/Output\" >\n"
                   "    </Asset>\n"
                   "</Assets>\n");
    EXPECT_EQ(w.depth(), 0u);
}

// One golden document of single calls, each starting and ending at depth 0.
TEST(XmlWriter, ValuesLabelsReferencesListsAndEscaping) {
    std::string out;
    AssetXmlWriter w(out);
    // The value types the families' golden documents show no case of, or not at their
    // edges; a matrix begins with an empty line.
    w.writeFloat("p", 2.5e-7f);
    w.writeInteger("p", -2147483647 - 1);
    w.writeMatrix("p", Matrix::identity());
    // User data sits between listType and label and is never written as "0"; an
    // empty label repeats the name. Names and labels are written as they stand,
    // narrow bytes widened one for one (0xE9 is "é").
    w.writeFloat("a<b", 1.0f, "caf\xE9 \"&\"", true);
    w.writeString("path", "x", "", true);
    w.writeBool("on", true, "", false);
    // Urls take all five entities; the asset tag ends in "\" >". String values
    // escape only & < >: text that was well-formed keeps its quotes.
    w.beginAsset("/a<b>&\"c'\xC3\xA9", "material", "lay&out");
    w.endAsset();
    w.writeString("s", "Tom's \"<map>\" & co");
    // Every family's member goes through one reference writer (a texture stands
    // for them); a material is named by its escaped name after the (empty) path;
    // an absent member gives no value line at all.
    const std::string material = "Oak & <Pine>", path = "/Oak/a&b";
    w.writePlugin("p", boost::make_shared<AColorTexture>(), path);
    w.writePluginByName("p", "", &material);
    w.writePluginByName("p", path, &material);
    w.writePluginUrl("p", true, "/Sky/sun'1");
    w.writePluginUrl("p", true, "");
    w.writePlugin("p", TexturePtr(), "/x");
    w.writePluginByName("p", "", nullptr);
    w.writePluginUrl("p", false, "/Sky/sun");
    // "<list>" stands at the level of "<value>". Entries take all five entities;
    // string entries are quoted and escape only & < >.
    w.beginList("brdfs", "plugin");
    w.writeEntry("/Oak/layer <1> & 'two'");
    w.writeStringEntry("a \"b\" & <c> caf\xE9");
    w.endList();
    EXPECT_EQ(w.depth(), 0u);
    expectGolden(out, "xml_writer_calls.xml");
}

TEST(XmlWriter, UnbalancedEndDoesNotWrapTheDepth) {
    // One end too many leaves the depth at 0 rather than wrapping it to four
    // billion levels (an eight-gigabyte indentation on the next line).
    std::string out;
    AssetXmlWriter writer(out);
    writer.endParameter();
    writer.writeBool("b", true);
    EXPECT_EQ(out, "</parameter>\n<parameter type=\"bool\" name=\"b\" listType=\"none\" label=\"b\">\n"
                   "  <value>1</value>\n</parameter>\n");
}
