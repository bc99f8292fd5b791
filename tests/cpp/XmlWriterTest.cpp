// The asset document writer: the exact text of documents, of every value type,
// of references between assets and of lists, and the escaping rules.
#include <dexmor/xml/AssetXmlWriter.hpp>

#include "TestSupport.hpp"

#include <dexmor/lights/BaseLight.hpp>
#include <dexmor/materials/BaseMaterial.hpp>
#include <dexmor/options/BaseCamera.hpp>
#include <dexmor/params/TransformComponents.hpp>
#include <dexmor/textures/BaseBitmap.hpp>
#include <dexmor/textures/BaseTexture.hpp>
#include <dexmor/textures/BaseUVW.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

using namespace OrvexKavorCore;

namespace {

// Members of each family that only carry a plugin type: all a reference needs.
template <class Base>
class Fake : public Base {
public:
    explicit Fake(std::string type) : type_(std::move(type)) {}
    bool writeToArchive(QuickArchive&) override { return true; }
    bool readFromArchive(QuickArchive&) override { return true; }
    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return type_; }
    std::string assetType() const override { return "test"; }
    std::int32_t kindId() const override { return 0; }
    void resetToDefaults() override {}
    boost::shared_ptr<Base> clone() const override { return {}; }

private:
    std::string type_;
};
template <class Base>
struct Comparable : Fake<Base> {
    using Fake<Base>::Fake;
    bool isEqual(const boost::shared_ptr<Base>&) const override { return false; }
};
struct FakeUVW : Comparable<BaseUVW> {
    using Comparable::Comparable;
    void updateTransforms() override {}
};
struct FakeMaterial : Comparable<BaseMaterial> {
    explicit FakeMaterial(std::string materialName) : Comparable("MtlSingleBRDF") { name = std::move(materialName); }
    MaterialPtr cloneRenamed() const override { return {}; }
};

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

TEST(XmlWriter, ValuesOfEveryType) {
    TransformComponents components;
    components.x_rotation = 90.0f;
    components.z_offset = -0.25f;
    components.y_mirror = 1;
    const std::string componentLines =
        "    <x_rotation>90</x_rotation>\n    <y_rotation>0</y_rotation>\n    <z_rotation>0</z_rotation>\n"
        "    <x_scale>1</x_scale>\n    <y_scale>1</y_scale>\n    <z_scale>1</z_scale>\n"
        "    <x_offset>0</x_offset>\n    <y_offset>0</y_offset>\n    <z_offset>-0.25</z_offset>\n"
        "    <x_mirror>0</x_mirror>\n    <y_mirror>1</y_mirror>\n    <z_mirror>0</z_mirror>\n";
    const auto vector = [](const std::string& pad, const std::string& x, const std::string& y, const std::string& z) {
        return pad + "<vector>\n" + pad + "  <x>" + x + "</x>\n" + pad + "  <y>" + y + "</y>\n" + pad + "  <z>" + z +
               "</z>\n" + pad + "</vector>\n";
    };
    const auto block = [](const std::string& type, const std::string& lines) {
        return startTag(type, "p") + "  <value>\n" + lines + "  </value>\n</parameter>\n";
    };
    const std::vector<std::pair<Write, std::string>> cases = {
        {[](AssetXmlWriter& w) { w.writeFloat("p", 2.5e-7f); }, inlineParameter("float", "p", "2.5e-007")},
        {[](AssetXmlWriter& w) { w.writeInteger("p", -2147483647 - 1); }, inlineParameter("integer", "p", "-2147483648")},
        {[](AssetXmlWriter& w) { w.writeBool("p", true); }, inlineParameter("bool", "p", "1")},
        {[](AssetXmlWriter& w) { w.writeBool("p", false); }, inlineParameter("bool", "p", "0")},
        {[](AssetXmlWriter& w) { w.writeString("p", "C:\\maps\\oak.png"); },
         inlineParameter("string", "p", "C:\\maps\\oak.png")},
        {[](AssetXmlWriter& w) { w.writeVector("p", Vector{1.0f, -2.0f, 0.5f}); },
         block("vector", vector("    ", "1", "-2", "0.5"))},
        // A colour's lines stand one level inside "<value>", with no element of their own.
        {[](AssetXmlWriter& w) { w.writeColor("p", Color{1.0f, 0.5f, 0.25f}); },
         block("color", "    <r>1</r>\n    <g>0.5</g>\n    <b>0.25</b>\n")},
        {[](AssetXmlWriter& w) { w.writeAColor("p", AColor{0.0f, 0.1f, 0.2f, 1.0f}); },
         block("acolor", "    <r>0</r>\n    <g>0.1</g>\n    <b>0.2</b>\n    <a>1</a>\n")},
        // A matrix begins with an empty line.
        {[](AssetXmlWriter& w) { w.writeMatrix("p", Matrix::identity()); },
         block("matrix", "\n    <matrix>\n" + vector("      ", "1", "0", "0") + vector("      ", "0", "1", "0") +
                             vector("      ", "0", "0", "1") + "    </matrix>\n")},
        {[](AssetXmlWriter& w) { w.writeTransform("p", Transform{Matrix::identity(), Vector{10.0f, 20.0f, 1e6f}}); },
         block("transform", vector("    ", "1", "0", "0") + vector("    ", "0", "1", "0") +
                                vector("    ", "0", "0", "1") + vector("    ", "10", "20", "1e+006"))},
        {[&](AssetXmlWriter& w) { writeComponentMatrix(w, "p", components); }, block("componentMatrix", componentLines)},
        {[&](AssetXmlWriter& w) { writeComponentTransform(w, "p", components); },
         block("componentTransform", componentLines)},
    };
    for (const auto& [write, expected] : cases) EXPECT_EQ(written(write), expected);
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

TEST(XmlWriter, PluginReferences) {
    const TexturePtr texture(new Comparable<BaseTexture>("TexChecker"));
    const UVWPtr uvw(new FakeUVW("UVWGenEnvironment"));
    const BitmapPtr bitmap(new Comparable<BaseBitmap>("BitmapBuffer"));
    const CameraPtr camera(new Fake<BaseCamera>("CameraPhysical"));
    const LightPtr light(new Comparable<BaseLight>("LightOmni"));
    const MaterialPtr material(new FakeMaterial("Oak & <Pine>"));
    const std::string path = "/Oak/a&b";
    const std::string empty = startTag("plugin", "p") + "</parameter>\n"; // no value line at all
    const std::vector<std::pair<Write, std::string>> cases = {
        {[&](AssetXmlWriter& w) { w.writePlugin("p", texture, path); }, "/Oak/a&amp;b/TexChecker"},
        {[&](AssetXmlWriter& w) { w.writePlugin("p", uvw, path); }, "/Oak/a&amp;b/UVWGenEnvironment"},
        {[&](AssetXmlWriter& w) { w.writePlugin("p", bitmap, path); }, "/Oak/a&amp;b/BitmapBuffer"},
        {[&](AssetXmlWriter& w) { w.writePlugin("p", camera, path); }, "/Oak/a&amp;b/CameraPhysical"},
        {[&](AssetXmlWriter& w) { w.writePlugin("p", light, path); }, "/Oak/a&amp;b/LightOmni"},
        // A material is named by its escaped name after the (empty) path: its asset's url.
        {[&](AssetXmlWriter& w) { w.writePluginByName("p", "", nameOf(material)); }, "/Oak &amp; &lt;Pine&gt;"},
        {[&](AssetXmlWriter& w) { w.writePluginByName("p", path, nameOf(material)); },
         "/Oak/a&amp;b/Oak &amp; &lt;Pine&gt;"},
        {[&](AssetXmlWriter& w) { w.writePluginUrl("p", true, "/Sky/sun'1"); }, "/Sky/sun&apos;1"},
        {[&](AssetXmlWriter& w) { w.writePluginUrl("p", true, ""); }, ""},
    };
    for (const auto& [write, value] : cases) EXPECT_EQ(written(write), inlineParameter("plugin", "p", value));

    const std::vector<Write> absent = {
        [](AssetXmlWriter& w) { w.writePlugin("p", TexturePtr(), "/x"); },
        [](AssetXmlWriter& w) { w.writePlugin("p", UVWPtr(), "/x"); },
        [](AssetXmlWriter& w) { w.writePlugin("p", BitmapPtr(), "/x"); },
        [](AssetXmlWriter& w) { w.writePlugin("p", CameraPtr(), "/x"); },
        [](AssetXmlWriter& w) { w.writePlugin("p", LightPtr(), "/x"); },
        [](AssetXmlWriter& w) { w.writePluginByName("p", "", nameOf(MaterialPtr())); },
        [](AssetXmlWriter& w) { w.writePluginUrl("p", false, "/Sky/sun"); },
    };
    for (const Write& write : absent) EXPECT_EQ(written(write), empty);

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
