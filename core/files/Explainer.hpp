#pragma once
// The pieces of dexmor explain (files/Explain.cpp): where the archive's bytes lie
// in the file, and the observer that turns a reading into a tree.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/files/Explanation.hpp>
#include <dexmor/platform/SharedBytes.hpp>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

// Where the archive lies in the file.
struct FileLayout {
    std::uint64_t archiveStart = 0; // the file offset of archive position 0
    std::uint64_t archiveEnd = 0;   // the end of the archive's bytes in the file
    std::uint64_t chunks = 0;
    // The first generation's archive is the body without its carriage returns:
    // for each one dropped, in order, the number of kept bytes before it.
    bool dropsReturns = false;
    std::vector<std::uint64_t> keptBeforeReturn;

    std::uint64_t fileOffsetOf(std::uint64_t position) const;
};

// Builds the nodes of a reading under `container`: a leaf per value, a node per
// level of the record path. At most `nodeLimit` nodes; after that it notes where
// it stopped.
class TreeBuilder final : public ReadObserver {
public:
    TreeBuilder(std::string_view file, const FileLayout& layout, ExplainedNode& container, std::size_t nodeLimit);

    void value(std::uint64_t position, std::uint64_t size, Encoding encoding, const void* value) override;
    void enter(const char* what, const char* name, std::int64_t index, bool nests) override;
    void leave(std::string_view level) override;
    void selected(std::int32_t kind, const std::type_info& type) override;
    void held(std::uint16_t since, std::uint16_t until) override;

    // A value the container holds at a file offset.
    void leafAt(ExplainedNode& parent, std::uint64_t offset, std::uint64_t size, Encoding encoding,
                const void* value, std::string name);

    // The end of the last byte read so far (a file offset).
    std::uint64_t readEnd() const { return readEnd_; }
    bool cut() const { return cut_; }
    std::uint64_t cutAt() const { return cutAt_; }

private:
    struct Open {
        ExplainedNode* node;   // nullptr once the node limit is reached
        const char* label;     // a field's label: the name of the values directly in it
        bool member;           // a nested member's record, whose first Int32 is its kind id
    };
    ExplainedNode& top();
    bool makeRoom();
    void addLeaf(ExplainedNode& parent, std::uint64_t start, std::uint64_t end, std::uint64_t size,
                 Encoding encoding, const void* value, std::string name);

    std::string_view file_;
    const FileLayout& layout_;
    ExplainedNode& container_;
    std::size_t nodeLimit_;
    std::size_t nodes_ = 0;
    bool cut_ = false;
    std::uint64_t cutAt_ = 0;
    std::uint64_t readEnd_ = 0;
    std::vector<Open> open_;
};

// The explanation of a file's bytes, read as `kind`.
Explanation explainBytes(FileKind kind, const SharedBytes& bytes);

} // namespace OrvexKavorCore
