// dexmor explain: every byte of a file accounted for, named from the tables that
// read it, with values as the document shows them.
#include "MaterialTestSupport.hpp"

#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/options/AllOptions.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace {

using namespace OrvexKavorCore;
using testsupport::ByteVector;
using testsupport::Image;

std::string fileBytes(const std::filesystem::path& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

Explanation explainBytes(FileKind kind, std::string_view bytes) { return explain(kind, Input::ofBytes(bytes)); }

// The leaves in tree order, which must be file order.
void leavesOf(const ExplainedNode& node, std::vector<const ExplainedNode*>& out) {
    for (const ExplainedNode& child : node.children) {
        if (child.isLeaf())
            out.push_back(&child);
        else
            leavesOf(child, out);
    }
}

// Every byte of the file lies in exactly one leaf, and the leaves come in order.
// Returns the first fault, or "".
std::string coverageFault(const Explanation& explanation, std::uint64_t fileSize) {
    std::vector<const ExplainedNode*> leaves;
    leavesOf(explanation.root, leaves);
    std::uint64_t cursor = 0;
    for (const ExplainedNode* leaf : leaves) {
        if (leaf->size == 0) continue; // a value read past the end of the file covers none of it
        if (leaf->offset != cursor)
            return (leaf->offset > cursor ? "gap before " : "overlap at ") + std::to_string(leaf->offset) + " (" +
                   leaf->name + "), expected " + std::to_string(cursor);
        cursor = leaf->end();
    }
    if (cursor != fileSize) return "the leaves end at " + std::to_string(cursor) + " of " + std::to_string(fileSize);
    return {};
}

TEST(Explain, LeavesCoverEveryByteOfTheSamplesAndTheFuzzCorpora) {
    const std::filesystem::path source = DEXMOR_SOURCE_DIR;
    std::vector<std::filesystem::path> files = {source / "examples/sample.zelmat", source / "examples/sample.zelopt"};
    for (const char* folder : {"fuzz/corpus", "fuzz/regressions"})
        for (const auto& entry : std::filesystem::recursive_directory_iterator(source / folder))
            if (entry.is_regular_file()) files.push_back(entry.path());
    ASSERT_GT(files.size(), 100u);

    std::map<FileKind, std::size_t> binary;
    for (const std::filesystem::path& path : files) {
        const std::string bytes = fileBytes(path);
        // A corpus file may be meant for either reader: explain it as both. A file
        // that does not read still accounts for every byte (the rest as one range).
        for (const FileKind kind : {FileKind::MaterialLibrary, FileKind::RenderOptions}) {
            const Explanation explanation = explainBytes(kind, bytes);
            ASSERT_TRUE(explanation.opened);
            EXPECT_EQ(explanation.readsAsBinary, diagnose(kind, Input::ofBytes(bytes)).readsAsBinary) << path;
            EXPECT_EQ(coverageFault(explanation, bytes.size()), "") << path << " as " << extensionOf(kind);
            if (explanation.readsAsBinary) ++binary[kind];
        }
    }
    // The corpora hold files that read as each kind.
    EXPECT_GT(binary[FileKind::MaterialLibrary], 10u);
    EXPECT_GT(binary[FileKind::RenderOptions], 10u);
}

// A small library assembled by hand: a lamp material, then a material whose kind
// id no reader knows, in a third-generation image of one chunk, then three bytes
// after the archive.
ByteVector damagedLibrary() {
    const MaterialPtr lamp = materialtest::make<MaterialSingleBRDF>(
        "Lamp", [](MaterialSingleBRDF& m) { m.brdf = boost::make_shared<Light_BRDF>(); });
    Image records;
    records.append(materialtest::storedForm(lamp)).i32(77).version(0, 1);
    ByteVector chunk = records.bytes;
    chunk.resize(QuickArchive::kChunkSize, 0);
    Image file;
    file.version(0, 3).u32(2).u32(1).append(chunk);
    file.u8('x').u8('y').u8('z');
    return file.bytes;
}

TEST(Explain, AHandAssembledLibraryWithAFailureInTheMiddle) {
    const ByteVector bytes = damagedLibrary();
    const std::string_view view(reinterpret_cast<const char*>(bytes.data()), bytes.size());
    const Explanation explanation = explainBytes(FileKind::MaterialLibrary, view);
    EXPECT_FALSE(explanation.readsAsBinary);
    ASSERT_TRUE(explanation.failure);
    EXPECT_EQ(coverageFault(explanation, bytes.size()), "");
    testsupport::expectGolden(explanationText(explanation.root), "explain_damaged_library.txt");

    // The failure is the one check reports, at the same offset.
    const Diagnosis diagnosis = diagnose(FileKind::MaterialLibrary, Input::ofBytes(view));
    ASSERT_TRUE(diagnosis.failure);
    EXPECT_EQ(explanation.failure->describe(), diagnosis.failure->describe());

    // What is at the offset of the failing kind id: the path of nodes down to it.
    const ExplainedNode at = viewOf(explanation.root, {explanation.failure->offset - 4, std::nullopt});
    const std::string path = explanationText(at);
    EXPECT_NE(path.find("kind id: Int32 [4d 00 00 00] = 77"), std::string::npos) << path;
    EXPECT_EQ(path.find("Lamp"), std::string::npos) << path;
    // --depth 1: the file, its header, the archive and the bytes after it, nothing inside them.
    EXPECT_EQ(testsupport::occurrences(explanationText(viewOf(explanation.root, {std::nullopt, 1u})), "\n"), 4u);
}

TEST(Explain, AHandAssembledOptionsFileCutInsideItsParameterBlock) {
    // The options set's version word, then the parameter block's version word and
    // its first three fields; the file ends there.
    Image file;
    file.version(AllOptions::kVersionFirstHalf, AllOptions::kVersion).version(0, 5).i32(1).i32(2).i32(4);
    const std::string_view view(reinterpret_cast<const char*>(file.bytes.data()), file.bytes.size());
    const Explanation explanation = explainBytes(FileKind::RenderOptions, view);
    EXPECT_EQ(coverageFault(explanation, file.bytes.size()), "");
    std::string text = explanationText(explanation.root);
    // Past the end of the file the remaining fields read as zero bytes: the first
    // of them shows it, the rest are cut from the golden text.
    const std::size_t pastEnd = text.find("past the end of the file");
    ASSERT_NE(pastEnd, std::string::npos);
    text.resize(text.find('\n', pastEnd) + 1);
    testsupport::expectGolden(text, "explain_short_options.txt");
}

// type="float|integer|bool" name="..." values of the parameters of an XML document.
std::map<std::string, std::string> plainParameters(const std::string& xml) {
    std::map<std::string, std::string> values;
    for (std::size_t at = xml.find("<parameter type=\""); at != std::string::npos;
         at = xml.find("<parameter type=\"", at + 1)) {
        const std::size_t typeStart = at + 17;
        const std::string type = xml.substr(typeStart, xml.find('"', typeStart) - typeStart);
        if (type != "float" && type != "integer" && type != "bool") continue;
        const std::size_t nameStart = xml.find("name=\"", typeStart) + 6;
        const std::string name = xml.substr(nameStart, xml.find('"', nameStart) - nameStart);
        const std::size_t valueStart = xml.find("<value>", nameStart) + 7;
        values.emplace(name, xml.substr(valueStart, xml.find("</value>", valueStart) - valueStart));
    }
    return values;
}

// The values of the fields by name anywhere in the tree; a field of a settings
// section ("imageSampler.fixed_subdivs") also by its name in the section.
void fieldValues(const ExplainedNode& node, std::multimap<std::string, std::string>& out) {
    if (node.kind == "field") {
        out.emplace(node.name, node.value);
        if (const auto dot = node.name.rfind('.'); dot != std::string::npos)
            out.emplace(node.name.substr(dot + 1), node.value);
    }
    for (const ExplainedNode& child : node.children) fieldValues(child, out);
}

TEST(Explain, ValuesAgreeWithTheDocumentOverTheSamples) {
    // Each float, integer and bool parameter of the document whose name is a field
    // of the explanation has its value among that field's explained values.
    std::size_t compared = 0;
    for (const auto& [name, kind] : {std::pair{"sample.zelmat", FileKind::MaterialLibrary},
                                     std::pair{"sample.zelopt", FileKind::RenderOptions}}) {
        const std::filesystem::path path = std::filesystem::path(DEXMOR_SOURCE_DIR) / "examples" / name;
        const std::string xml = testsupport::convertToXml(kind, path);
        const Explanation explanation = explain(kind, path);
        ASSERT_TRUE(explanation.readsAsBinary) << name;
        // A row says which versions of its record hold it: the newest channel list
        // replaced two older ones.
        if (kind == FileKind::RenderOptions) {
            EXPECT_NE(explanationText(explanation.root).find(" channels (from version 21) = 4 items"),
                      std::string::npos);
        }
        std::multimap<std::string, std::string> explained;
        fieldValues(explanation.root, explained);
        for (const auto& [parameter, value] : plainParameters(xml)) {
            // The environment's multipliers show the texture's multiplier when a
            // texture is present: a value the document computes.
            static const std::set<std::string> computed = {"bg_mult", "gi_mult", "reflect_mult", "refract_mult"};
            const auto [first, last] = explained.equal_range(parameter);
            if (first == last || computed.count(parameter)) continue; // shown under another name, or computed
            bool found = false;
            for (auto it = first; it != last && !found; ++it)
                found = it->second == value || (value == "1" && it->second == "true") ||
                        (value == "0" && it->second == "false");
            EXPECT_TRUE(found) << name << ": " << parameter << " = " << value;
            ++compared;
        }
    }
    EXPECT_GT(compared, 40u);
}

TEST(Explain, WhatIsNotReadIsOneRange) {
    // A million zero bytes as options: the version word is refused, and the rest
    // is one range, not a node per chunk or byte.
    const std::string zeros(1'000'000, '\0');
    const Explanation explanation = explainBytes(FileKind::RenderOptions, zeros);
    EXPECT_EQ(coverageFault(explanation, zeros.size()), "");
    std::vector<const ExplainedNode*> leaves;
    leavesOf(explanation.root, leaves);
    EXPECT_LT(leaves.size(), 2000u);
}

TEST(Explain, AFileThatCannotBeOpenedSaysSo) {
    const Explanation explanation = explain(FileKind::MaterialLibrary, "/nonexistent/dir/x.zelmat");
    EXPECT_FALSE(explanation.opened);
    ASSERT_TRUE(explanation.failure);
    EXPECT_NE(explanation.openError, 0);
}

} // namespace
