// The wrapped form of the document: the plain document in one root, the same
// streamed or whole, with what XML 1.0 cannot carry replaced (and named by the
// lint), held to the output budget like the plain form.
#include "../../fuzz/HostileShapes.hpp"
#include "TestSupport.hpp"

#include "files/SinkWriter.hpp"
#include "xml/XmlCharacters.hpp"

#include <dexmor/dexmor.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

ConversionOptions wrapped(std::optional<std::uint64_t> budget = std::nullopt) {
    ConversionOptions options;
    options.wrap = true;
    options.maxOutput = budget;
    return options;
}

std::string inRoot(std::string_view kind, const std::string& document) {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<AssetDocument kind=\"" + std::string(kind) + "\">\n" +
           document + "</AssetDocument>\n";
}

// The conversion into a string and into pieces: both diagnoses, and the pieces.
struct BothWays {
    Diagnosis whole, streamed;
    std::string text;
    std::vector<std::string> pieces;
};
BothWays convertBothWays(FileKind kind, std::string_view bytes, const ConversionOptions& options) {
    BothWays both;
    StringSink sink(both.text);
    both.whole = convert(kind, Input::ofBytes(bytes), sink, options);
    CallbackSink pieces([&both](std::string_view piece) { both.pieces.emplace_back(piece); });
    both.streamed = convert(kind, Input::ofBytes(bytes), pieces, options);
    return both;
}

} // namespace

TEST(WrappedForm, IsThePlainDocumentInOneRootStreamedOrWhole) {
    for (const auto& [name, kind, word] : {std::tuple("sample.zelmat", FileKind::MaterialLibrary, "zelmat"),
                                           std::tuple("sample.zelopt", FileKind::RenderOptions, "zelopt")}) {
        const std::string bytes = sample(name);
        const std::string expected = inRoot(word, convertBytesToXml(kind, bytes));
        const BothWays both = convertBothWays(kind, bytes, wrapped());
        EXPECT_EQ(both.text, expected) << name;
        std::string joined;
        for (const std::string& piece : both.pieces) {
            // Nothing is held back: every piece stays near the streaming size.
            EXPECT_LE(piece.size(), SinkWriter::kPieceSize + 4096) << name;
            joined += piece;
        }
        EXPECT_EQ(joined, expected) << name;
        if (kind == FileKind::MaterialLibrary) {
            EXPECT_GT(both.pieces.size(), 1u); // the library spans pieces
        }
    }
}

TEST(WrappedForm, TheBudgetCountsTheWholeWrappedDocument) {
    const std::string bytes = sample("sample.zelmat");
    const std::size_t size = convertBytesToXml(FileKind::MaterialLibrary, bytes, wrapped()).size();
    const BothWays fits = convertBothWays(FileKind::MaterialLibrary, bytes, wrapped(size));
    EXPECT_TRUE(fits.whole.complete() && fits.streamed.complete());
    const BothWays over = convertBothWays(FileKind::MaterialLibrary, bytes, wrapped(size - 1));
    EXPECT_EQ(over.whole.exceededBudget, size - 1);
    EXPECT_EQ(over.streamed.exceededBudget, size - 1);
    EXPECT_EQ(over.text, "");
}

TEST(WrappedForm, ReplacesWhatXmlCannotCarryAndTheLintNamesIt) {
    const ConversionContext context;
    const std::string bytes = hostile::libraryOf(hostile::hostileNameLibrary());
    ConversionOptions options = wrapped();
    options.survey = true;
    const BothWays both = convertBothWays(FileKind::MaterialLibrary, bytes, options);
    ASSERT_TRUE(both.whole.readsAsBinary);
    const std::string& text = both.text;
    std::string joined;
    for (const std::string& piece : both.pieces) joined += piece;
    EXPECT_EQ(joined, text);
    EXPECT_FALSE(holdsCharacterXmlCannotCarry(text));
    EXPECT_THAT(text, testing::HasSubstr("url=\"/Ctl\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD\""));
    // A line break in a url is a character reference; in a string value it stays.
    EXPECT_THAT(text, testing::HasSubstr("url=\"/Tab&#9;Line&#10;Feed&#13;Return\""));
    EXPECT_THAT(text, testing::HasSubstr("<value>C:\\maps\\Tab\tLine\nFeed&#13;Return.png</value>"));
    // The plain form keeps every character; the lint is the same for both forms.
    const Diagnosis plain = [&] {
        std::string xml;
        StringSink sink(xml);
        ConversionOptions surveyed;
        surveyed.survey = true;
        const Diagnosis result = convert(FileKind::MaterialLibrary, Input::ofBytes(bytes), sink, surveyed);
        EXPECT_THAT(xml, testing::HasSubstr("url=\"/Ctl\x01\x02\x1f\""));
        return result;
    }();
    EXPECT_EQ(plain.warnings, both.whole.warnings);
    EXPECT_EQ(both.streamed.warnings, both.whole.warnings);
    EXPECT_THAT(both.whole.warnings,
                testing::Contains("material 2 \"Ctl\x01\x02\x1f\": the parameter \"file\" of the asset "
                                  "\"/Ctl\\x01\\x02\\x1f/BRDFDiffuse/color_texture/buffer\" holds a character XML "
                                  "1.0 cannot carry"));
    // A name with line breaks is one url to the lint, not a url cut at the break.
    EXPECT_THAT(both.whole.warnings, testing::Not(testing::Contains(testing::HasSubstr("the url \"\""))));
}

TEST(WrappedForm, TextPassedThroughIsEscapedInOneElementWithinTheBudget) {
    const std::string bytes = "<x a=\"1\">\x01 & \r</x>";
    const std::string expected =
        inRoot("zelopt", "<passedThrough>&lt;x a=&quot;1&quot;&gt;\xEF\xBF\xBD &amp; &#13;&lt;/x&gt;</passedThrough>\n");
    const BothWays both = convertBothWays(FileKind::RenderOptions, bytes, wrapped(expected.size()));
    EXPECT_FALSE(both.whole.readsAsBinary);
    EXPECT_EQ(both.text, expected);
    const BothWays over = convertBothWays(FileKind::RenderOptions, bytes, wrapped(expected.size() - 1));
    EXPECT_TRUE(over.streamed.exceededBudget);
    EXPECT_THAT(over.pieces, testing::IsEmpty());
}

TEST(XmlCarrier, GivesTheSameTextWhereverAPieceEnds) {
    const std::string_view text = "<a u=\"x\ty\nz\r\">t\tu\nv\rw\x01 \xEF\xBF\xBE \xF0\x9F\x98\x80 \xE2\x82 \xFF\xC0</a>\n";
    const std::string_view expected = "<a u=\"x&#9;y&#10;z&#13;\">t\tu\nv&#13;w\xEF\xBF\xBD \xEF\xBF\xBD "
                                      "\xF0\x9F\x98\x80 \xEF\xBF\xBD \xEF\xBF\xBD\xEF\xBF\xBD</a>\n";
    for (std::size_t split = 0; split <= text.size(); ++split) {
        XmlCarrier carrier;
        std::string out;
        const std::size_t cut = carrier.append(out, text.substr(0, split), false);
        carrier.append(out, text.substr(split - cut), true);
        EXPECT_EQ(out, expected) << split;
    }
}
