// The asset document writer: the exact text of documents, of the values the golden
// documents do not show, of references between assets and of lists, and escaping.
#include <dexmor/xml/AssetXmlWriter.hpp>

#include "TestSupport.hpp"

#include <dexmor/textures/ColorTextures.hpp>

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <utility>
#include <vector>

using namespace OrvexKavorCore;

namespace {

using Write = std::function<void(AssetXmlWriter&)>;

// The text one call writes, starting and ending at depth 0.
std::string written(const Write& write) {
    std::string out;
    AssetXmlWriter writer(out);
    write(writer);
    EXPECT_EQ(writer.depth(), 0u) << out;
    return out;
}

std::string startTag(const std::string& type, const std::string& name) {
    return "<parameter type=\"" + type + "\" name=\"" + name + "\" listType=\"none\" label=\"" + name + "\">\n";
}
std::string inlineParameter(const std::string& type, const std::string& name, const std::string& value) {
    return startTag(type, name) + "  <value>" + value + "</value>\n</parameter>\n";
}

} // namespace

TEST(XmlWriter, DocumentsOfMaterialsAndSections) {
    const auto material = [](AssetXmlWriter& w) {
        w.beginDocument();
        w.beginAsset("/Oak", "material", "defkvmat");
        w.beginPlugin("MtlSingleBRDF", "material");
        w.beginParameters();
        w.writeInteger("double_sided", 1);
        w.endParameters();
        w.endPlugin();
        w.endAsset();
        w.endDocument();
    };
    // Two materials give two documents, one after the other.
    testsupport::expectGolden(written([&](AssetXmlWriter& w) {
                                  material(w);
                                  material(w);
                              }),
                              "xml_writer_two_documents.xml");

    // A section's "Assets" element is never indented; its assets stand one level deeper.
    EXPECT_EQ(written([](AssetXmlWriter& w) {
                  w.beginElement("Assets");
                  w.beginAsset("/Output", "settings", "defkvsettings");
                  w.endAsset();
                  w.endElement("Assets");
              }),
              "<Assets>\n"
              "    <Asset layout=\"defkvsettings\" renderer=\"kavor\" type=\"settings\" url=\"/Output\" >\n"
              "    </Asset>\n"
              "</Assets>\n");
}

// The value types the golden documents show no case of, or not at their edges.
TEST(XmlWriter, ValuesOfTheRarerTypes) {
    const auto vector = [](const std::string& x, const std::string& y, const std::string& z) {
        const std::string pad = "      ";
        return pad + "<vector>\n" + pad + "  <x>" + x + "</x>\n" + pad + "  <y>" + y + "</y>\n" + pad + "  <z>" + z +
               "</z>\n" + pad + "</vector>\n";
    };
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeFloat("p", 2.5e-7f); }), inlineParameter("float", "p", "2.5e-007"));
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeInteger("p", -2147483647 - 1); }),
              inlineParameter("integer", "p", "-2147483648"));
    // A matrix begins with an empty line.
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeMatrix("p", Matrix::identity()); }),
              startTag("matrix", "p") + "  <value>\n\n    <matrix>\n" + vector("1", "0", "0") + vector("0", "1", "0") +
                  vector("0", "0", "1") + "    </matrix>\n  </value>\n</parameter>\n");
}

TEST(XmlWriter, LabelsUserDataAndEscaping) {
    // User data sits between listType and label and is never written as "0"; an
    // empty label repeats the name. Names and labels are written as they stand,
    // narrow bytes widened one for one (0xE9 is "é").
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeFloat("a<b", 1.0f, "caf\xE9 \"&\"", true); }),
              "<parameter type=\"float\" name=\"a<b\" listType=\"none\" isUserData=\"1\" label=\"caf\xC3\xA9 \"&\"\">\n"
              "  <value>1</value>\n</parameter>\n");
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeString("path", "x", "", true); }),
              "<parameter type=\"string\" name=\"path\" listType=\"none\" isUserData=\"1\" label=\"path\">\n"
              "  <value>x</value>\n</parameter>\n");
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeBool("on", true, "", false); }), inlineParameter("bool", "on", "1"));

    // Urls take all five entities; the asset tag ends in "\" >".
    EXPECT_EQ(written([](AssetXmlWriter& w) {
                  w.beginAsset("/a<b>&\"c'\xC3\xA9", "material", "lay&out");
                  w.endAsset();
              }),
              "  <Asset layout=\"lay&out\" renderer=\"kavor\" type=\"material\" "
              "url=\"/a&lt;b&gt;&amp;&quot;c&apos;\xC3\xA9\" >\n  </Asset>\n");
    // String values escape only & < >: text that was well-formed keeps its quotes.
    EXPECT_EQ(written([](AssetXmlWriter& w) { w.writeString("s", "Tom's \"<map>\" & co"); }),
              inlineParameter("string", "s", "Tom's \"&lt;map&gt;\" &amp; co"));
    EXPECT_EQ(escapeXml("\"&'<>x"), "&quot;&amp;&apos;&lt;&gt;x");
}

// Every family's member goes through one reference writer (a texture stands for
// them); a material is named by its escaped name after the (empty) path.
TEST(XmlWriter, PluginReferences) {
    const TexturePtr texture = boost::make_shared<AColorTexture>();
    const std::string material = "Oak & <Pine>", path = "/Oak/a&b";
    const std::vector<std::pair<Write, std::string>> cases = {
        {[&](AssetXmlWriter& w) { w.writePlugin("p", texture, path); }, "/Oak/a&amp;b/TexAColor"},
        {[&](AssetXmlWriter& w) { w.writePluginByName("p", "", &material); }, "/Oak &amp; &lt;Pine&gt;"},
        {[&](AssetXmlWriter& w) { w.writePluginByName("p", path, &material); }, "/Oak/a&amp;b/Oak &amp; &lt;Pine&gt;"},
        {[&](AssetXmlWriter& w) { w.writePluginUrl("p", true, "/Sky/sun'1"); }, "/Sky/sun&apos;1"},
        {[&](AssetXmlWriter& w) { w.writePluginUrl("p", true, ""); }, ""},
    };
    for (const auto& [write, value] : cases) EXPECT_EQ(written(write), inlineParameter("plugin", "p", value));

    // An absent member gives no value line at all.
    const std::vector<Write> absent = {
        [](AssetXmlWriter& w) { w.writePlugin("p", TexturePtr(), "/x"); },
        [](AssetXmlWriter& w) { w.writePluginByName("p", "", nullptr); },
        [](AssetXmlWriter& w) { w.writePluginUrl("p", false, "/Sky/sun"); },
    };
    for (const Write& write : absent) EXPECT_EQ(written(write), startTag("plugin", "p") + "</parameter>\n");
}

TEST(XmlWriter, Lists) {
    // "<list>" stands at the level of "<value>". Entries take all five entities;
    // string entries are quoted and escape only & < >.
    EXPECT_EQ(written([](AssetXmlWriter& w) {
                  w.beginList("brdfs", "plugin");
                  w.writeEntry("/Oak/layer <1> & 'two'");
                  w.writeStringEntry("a \"b\" & <c> caf\xE9");
                  w.endList();
              }),
              "<parameter type=\"list\" name=\"brdfs\" listType=\"plugin\" label=\"brdfs\">\n"
              "  <value>\n"
              "  <list>\n"
              "    <entry>/Oak/layer &lt;1&gt; &amp; &apos;two&apos;</entry>\n"
              "    <string>\"a \"b\" &amp; &lt;c&gt; caf\xC3\xA9\"</string>\n"
              "  </list>\n"
              "  </value>\n"
              "</parameter>\n");
}

TEST(XmlWriter, UnbalancedEndDoesNotWrapTheDepth) {
    // One end too many leaves the depth at 0 rather than wrapping it to four
    // billion levels (an eight-gigabyte indentation on the next line).
    std::string out;
    AssetXmlWriter writer(out);
    writer.endParameter();
    writer.writeBool("b", true);
    EXPECT_EQ(out, "</parameter>\n" + inlineParameter("bool", "b", "1"));
}
