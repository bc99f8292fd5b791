#pragma once
// An explanation of a file: every byte, in order, as the readers read it.
//
// The tree comes from the reading itself: the archive reports every value its
// readers take (offset, size, encoding, value) and every level of the record
// path they open, so the names are those of the record tables (the XML's names
// where the XML shows one) and the record levels those of a failure report.
// Offsets are file offsets.
#include <dexmor/dexmor.hpp>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace OrvexKavorCore {

struct ExplainedNode {
    // What the node is:
    //   "file"     the whole file;
    //   "header", "archive"  the parts of the container;
    //   "chunk"    where a chunk of the archive begins (no bytes of its own);
    //   "record"   a nested member's record (kind_id, class, version below);
    //   "group"    a field of a record that holds several values (a list, a member);
    //   "field"    one stored value: a leaf;
    //   "unread"   bytes that no record reads: a leaf;
    //   "failure"  where the reading failed, with its reason (no bytes of its own).
    std::string kind;
    std::uint64_t offset = 0;
    std::uint64_t size = 0;
    std::string name;     // the field's name, the record's level (`material 0 "Oak"`), or what the bytes are
    std::string encoding; // a field's stored encoding: "Float32", "WString", ...
    std::string hex;      // a field's bytes, the first 16 only ("... (N bytes)" after them)
    std::string value;    // decoded: numbers as the XML writes them, text decoded (cut after 256 bytes)
    std::string note;     // what else there is to say ("crosses into chunk 1 at 4108")
    std::optional<std::int32_t> kindId; // a record's kind id
    std::string className;              // the class that kind id selects
    std::string version;                // a record's version word: "(0, 3)"
    // A row of a record table that only some record versions hold: the first
    // and (when there is one) the last of them.
    std::optional<std::uint16_t> heldSince;
    std::optional<std::uint16_t> heldUntil;
    std::vector<ExplainedNode> children;

    bool isLeaf() const { return kind == "field" || kind == "unread"; }
    std::uint64_t end() const { return offset + size; }
};

struct Explanation {
    bool opened = false; // false: the file cannot be opened or read in full (failure says why)
    int openError = 0;
    bool readsAsBinary = false;
    std::optional<ReadFailure> failure; // the first failure, at a file offset
    // Set when the file held more values than an explanation keeps (the limit is
    // twice the file's size plus 4096 nodes, at most `kMostNodes`): the nodes stop
    // there and the rest is one "unread" range that says so.
    bool cut = false;
    ExplainedNode root;

    static constexpr std::size_t kMostNodes = 2'000'000;
};

// Explains `input` read as a file of `kind`. Never throws for any input (only
// std::bad_alloc).
Explanation explain(FileKind kind, const Input& input);

// What of an explanation to show.
struct ExplainView {
    std::optional<std::uint64_t> offset; // only the nodes containing this byte
    std::optional<unsigned> depth;       // only this many levels below the file
};

// The nodes a view keeps (the file's node always).
ExplainedNode viewOf(const ExplainedNode& root, const ExplainView& view);

// The explanation as text: one line per node, indented by nesting.
std::string explanationText(const ExplainedNode& root);

} // namespace OrvexKavorCore
