// dexmor explain: the tree of a file as its readers read it.
//
// A TreeBuilder watches the archive (ReadObserver): every value becomes a leaf,
// every level of the record path a node. The container's own bytes (the header,
// the chunk count) come from the framing, whose offsets are fixed. A last pass
// walks the leaves in file order and adds what no reader says: the ranges no
// record reads, where each chunk begins, and which values and records cross a
// chunk's end.
#include "files/Explainer.hpp"

#include <dexmor/archive/Record.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/platform/Text.hpp>
#include "xml/NumberFormat.hpp"

#include <cxxabi.h>

#include <algorithm>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <memory>

namespace OrvexKavorCore {

namespace {

using Encoding = ReadObserver::Encoding;

constexpr std::size_t kShownBytes = 16;
constexpr std::size_t kShownText = 256;

const char* encodingName(Encoding encoding) {
    switch (encoding) {
    case Encoding::Bool: return "Bool";
    case Encoding::UInt8: return "UInt8";
    case Encoding::Int32: return "Int32";
    case Encoding::UInt32: return "UInt32";
    case Encoding::Float32: return "Float32";
    case Encoding::Float64: return "Float64";
    case Encoding::Vector: return "Vector";
    case Encoding::Color: return "Color";
    case Encoding::AColor: return "AColor";
    case Encoding::Matrix: return "Matrix";
    case Encoding::Transform: return "Transform";
    case Encoding::VersionWord: return "VersionWord";
    case Encoding::String: return "String";
    case Encoding::WString: return "WString";
    case Encoding::Bytes: return "Bytes";
    case Encoding::Raw: return "Raw";
    case Encoding::Skipped: return "Skipped";
    }
    return "";
}

std::string hexOf(std::string_view bytes) {
    constexpr char kDigits[] = "0123456789abcdef";
    std::string hex;
    const std::size_t shown = std::min(bytes.size(), kShownBytes);
    for (std::size_t i = 0; i < shown; ++i) {
        if (i) hex += ' ';
        const auto byte = static_cast<unsigned char>(bytes[i]);
        hex += kDigits[byte >> 4];
        hex += kDigits[byte & 0xF];
    }
    if (shown < bytes.size()) hex += " ... (" + std::to_string(bytes.size()) + " bytes)";
    return hex;
}

// Text as a value shows it: valid UTF-8, cut after 256 bytes at a character's
// start, with its full length after the cut.
std::string shownText(std::string_view utf8) {
    if (utf8.size() <= kShownText) return std::string(utf8);
    std::size_t shown = kShownText;
    while (shown > 0 && (static_cast<unsigned char>(utf8[shown]) & 0xC0) == 0x80) --shown;
    return std::string(utf8.substr(0, shown)) + "... (" + std::to_string(utf8.size()) + " bytes)";
}

void appendFloats(std::string& out, const float* values, std::size_t count, std::size_t group = 0) {
    for (std::size_t i = 0; i < count; ++i) {
        if (i) out += group && i % group == 0 ? "; " : " ";
        appendFloat(out, values[i]);
    }
}

std::string valueText(Encoding encoding, const void* value) {
    std::string text;
    switch (encoding) {
    case Encoding::Bool: return *static_cast<const bool*>(value) ? "true" : "false";
    case Encoding::UInt8: return std::to_string(*static_cast<const std::uint8_t*>(value));
    case Encoding::Int32: return std::to_string(*static_cast<const std::int32_t*>(value));
    case Encoding::UInt32:
    case Encoding::Bytes: return std::to_string(*static_cast<const std::uint32_t*>(value));
    case Encoding::Float32: return formatFloat(*static_cast<const float*>(value));
    case Encoding::Float64: {
        char buffer[32];
        const auto end = std::to_chars(buffer, buffer + sizeof buffer, *static_cast<const double*>(value),
                                       std::chars_format::general, 6);
        return std::string(buffer, end.ptr);
    }
    case Encoding::Vector: {
        const auto& v = *static_cast<const Vector*>(value);
        const float parts[] = {v.x, v.y, v.z};
        appendFloats(text, parts, 3);
        return text;
    }
    case Encoding::Color: {
        const auto& v = *static_cast<const Color*>(value);
        const float parts[] = {v.r, v.g, v.b};
        appendFloats(text, parts, 3);
        return text;
    }
    case Encoding::AColor: {
        const auto& v = *static_cast<const AColor*>(value);
        const float parts[] = {v.r, v.g, v.b, v.a};
        appendFloats(text, parts, 4);
        return text;
    }
    case Encoding::Matrix:
    case Encoding::Transform: {
        // Column by column, the offset last.
        float parts[12] = {};
        const auto* m = encoding == Encoding::Matrix ? static_cast<const Matrix*>(value)
                                                     : &static_cast<const Transform*>(value)->m;
        for (std::size_t c = 0; c < 3; ++c) {
            parts[c * 3] = m->m[c].x;
            parts[c * 3 + 1] = m->m[c].y;
            parts[c * 3 + 2] = m->m[c].z;
        }
        std::size_t count = 9;
        if (encoding == Encoding::Transform) {
            const Vector& offs = static_cast<const Transform*>(value)->offs;
            parts[9] = offs.x;
            parts[10] = offs.y;
            parts[11] = offs.z;
            count = 12;
        }
        appendFloats(text, parts, count, 3);
        return text;
    }
    case Encoding::VersionWord: {
        const auto& v = *static_cast<const VersionWord*>(value);
        return "(" + std::to_string(v.first()) + ", " + std::to_string(v.second()) + ")";
    }
    case Encoding::String: return shownText(text::decodeStoredText(*static_cast<const std::string*>(value)));
    case Encoding::WString: return shownText(*static_cast<const std::string*>(value));
    case Encoding::Raw:
    case Encoding::Skipped: return {};
    }
    return text;
}

std::string classNameOf(const std::type_info& type) {
    int status = 0;
    std::unique_ptr<char, void (*)(void*)> demangled(abi::__cxa_demangle(type.name(), nullptr, nullptr, &status),
                                                     std::free);
    std::string name = status == 0 && demangled ? demangled.get() : type.name();
    constexpr std::string_view kNamespace = "OrvexKavorCore::";
    if (name.starts_with(kNamespace)) name.erase(0, kNamespace.size());
    return name;
}

} // namespace

std::uint64_t FileLayout::fileOffsetOf(std::uint64_t position) const {
    // A kept byte lies after every carriage return with fewer kept bytes before it.
    const auto dropped = std::upper_bound(keptBeforeReturn.begin(), keptBeforeReturn.end(), position) -
                         keptBeforeReturn.begin();
    return archiveStart + position + static_cast<std::uint64_t>(dropped);
}

TreeBuilder::TreeBuilder(std::string_view file, const FileLayout& layout, ExplainedNode& container,
                         std::size_t nodeLimit)
    : file_(file), layout_(layout), container_(container), nodeLimit_(nodeLimit) {}

ExplainedNode& TreeBuilder::top() { return open_.empty() ? container_ : *open_.back().node; }

bool TreeBuilder::makeRoom() {
    if (cut_) return false;
    if (nodes_ < nodeLimit_) {
        ++nodes_;
        return true;
    }
    cut_ = true;
    cutAt_ = readEnd_;
    return false;
}

void TreeBuilder::addLeaf(ExplainedNode& parent, std::uint64_t start, std::uint64_t end, std::uint64_t size,
                          Encoding encoding, const void* value, std::string name) {
    ExplainedNode leaf;
    leaf.kind = "field";
    leaf.offset = start;
    leaf.size = end - start;
    leaf.name = std::move(name);
    leaf.encoding = encodingName(encoding);
    leaf.hex = hexOf(file_.substr(start, end - start));
    if (value) leaf.value = valueText(encoding, value);
    if (end - start < size)
        leaf.note = "past the end of the file: " + std::to_string(size - (end - start)) + " of its " +
                    std::to_string(size) + " bytes are missing";
    if (encoding == Encoding::Skipped) leaf.note = "passed over";
    readEnd_ = std::max(readEnd_, end);
    parent.children.push_back(std::move(leaf));
}

void TreeBuilder::leafAt(ExplainedNode& parent, std::uint64_t offset, std::uint64_t size, Encoding encoding,
                         const void* value, std::string name) {
    if (!makeRoom()) return;
    const std::uint64_t start = std::min<std::uint64_t>(offset, file_.size());
    const std::uint64_t end = std::min<std::uint64_t>(offset + size, file_.size());
    addLeaf(parent, start, end, size, encoding, value, std::move(name));
}

void TreeBuilder::value(std::uint64_t position, std::uint64_t size, Encoding encoding, const void* value) {
    if (!makeRoom()) return;
    const std::uint64_t fileSize = file_.size();
    const std::uint64_t start = std::min(layout_.fileOffsetOf(position), fileSize);
    const std::uint64_t end = size == 0 ? start : std::min(layout_.fileOffsetOf(position + size - 1) + 1, fileSize);
    ExplainedNode& parent = top();
    std::string name;
    if (!open_.empty() && open_.back().label) {
        name = open_.back().label;
    } else if (parent.kind == "record" && parent.children.empty() && encoding == Encoding::Int32 &&
               !open_.empty() && open_.back().member) {
        name = "kind id";
    } else if (parent.kind == "record" && encoding == Encoding::VersionWord && parent.version.empty()) {
        name = "version";
        parent.version = valueText(encoding, value);
    }
    addLeaf(parent, start, std::max(start, end), size, encoding, value, std::move(name));
}

void TreeBuilder::enter(const char* what, const char* name, std::int64_t index, bool nests) {
    if (!makeRoom()) {
        open_.push_back(Open{nullptr, nullptr, false});
        return;
    }
    ExplainedNode node;
    node.kind = nests ? "record" : "group";
    if (what) node.name = what;
    if (!what && !nests && name) node.name = name;
    if (index >= 0) node.name += (node.name.empty() ? "" : " ") + std::to_string(index);
    ExplainedNode& parent = top();
    parent.children.push_back(std::move(node));
    open_.push_back(Open{&parent.children.back(), nests || what ? nullptr : name, nests && what});
}

void TreeBuilder::leave(std::string_view level) {
    const Open closing = open_.back();
    open_.pop_back();
    if (!closing.node) return;
    ExplainedNode& parent = top();
    ExplainedNode& node = *closing.node;
    if (!level.empty()) node.name = std::string(level);
    if (node.children.empty()) {
        parent.children.pop_back(); // a level that read nothing
        return;
    }
    node.offset = node.children.front().offset;
    std::uint64_t end = node.offset;
    for (const ExplainedNode& child : node.children) end = std::max(end, child.end());
    node.size = end - node.offset;
    if (node.kind != "group") return;
    // A field that is one value is that value, under the field's name.
    if (node.children.size() == 1 && node.children.front().isLeaf()) {
        ExplainedNode leaf = std::move(node.children.front());
        leaf.name = std::move(node.name);
        leaf.heldSince = node.heldSince;
        leaf.heldUntil = node.heldUntil;
        node = std::move(leaf);
        return;
    }
    // A field of several values: its own record (a version word first), a list (a
    // count first) or a member behind its presence flag. The values after the
    // first have no names of their own in the table.
    for (ExplainedNode& child : node.children)
        if (child.isLeaf() && child.name == node.name) child.name.clear();
    ExplainedNode& first = node.children.front();
    if (!first.isLeaf()) return;
    if (first.encoding == "VersionWord") {
        first.name = "version";
        node.version = first.value;
    } else if (first.encoding == "UInt32") {
        first.name = "count";
        node.value = first.value + (first.value == "1" ? " item" : " items");
        // The items of a list of plain values are named by their place.
        std::size_t item = 0;
        for (ExplainedNode& child : node.children)
            if (child.isLeaf() && child.name.empty()) child.name = "item " + std::to_string(item++);
    } else if (first.encoding == "Bool" && node.children.size() == 2 && node.children.back().kind == "record") {
        first.name = "present";
    }
}

void TreeBuilder::held(std::uint16_t since, std::uint16_t until) {
    if (open_.empty() || !open_.back().node) return;
    ExplainedNode& row = *open_.back().node;
    row.heldSince = since;
    if (until != record::always().until) row.heldUntil = until;
}

void TreeBuilder::selected(std::int32_t kind, const std::type_info& type) {
    if (open_.empty() || !open_.back().node) return;
    ExplainedNode& record = *open_.back().node;
    record.kindId = kind;
    record.className = classNameOf(type);
}

// --- the last pass: unread ranges, chunks, crossings ---

namespace {

class Filler {
public:
    Filler(const FileLayout& layout, std::uint64_t fileSize, std::optional<std::uint64_t> failedFrom,
           std::optional<std::uint64_t> cutFrom, std::size_t nodeLimit)
        : layout_(layout), fileSize_(fileSize), failedFrom_(failedFrom), cutFrom_(cutFrom), nodeLimit_(nodeLimit) {}

    void walk(ExplainedNode& node) {
        // Chunk markers belong to the archive: they are shown inside its node.
        const bool wasInArchive = inArchive_;
        inArchive_ = inArchive_ || node.kind == "archive";
        std::vector<ExplainedNode> children;
        children.reserve(node.children.size());
        for (ExplainedNode& child : node.children) {
            if (child.size == 0 && !child.isLeaf()) { // a failure: where it is
                fillTo(children, std::max(cursor_, child.offset));
                children.push_back(std::move(child));
                continue;
            }
            fillTo(children, child.offset);
            noteCrossing(child);
            if (child.isLeaf()) {
                if (child.offset < cursor_) child.note += (child.note.empty() ? "" : "; ") + std::string("overlaps");
                cursor_ = std::max(cursor_, child.end());
            } else {
                walk(child);
            }
            children.push_back(std::move(child));
        }
        if (node.kind == "archive" || node.kind == "file") fillTo(children, node.end());
        node.children = std::move(children);
        inArchive_ = wasInArchive;
    }

private:
    std::uint64_t chunkStart(std::uint64_t k) const {
        return layout_.fileOffsetOf(k * QuickArchive::kChunkSize);
    }

    // The chunk boundaries in (start, end).
    void noteCrossing(ExplainedNode& node) const {
        if (node.size == 0 || layout_.chunks == 0 || node.offset < layout_.archiveStart) return;
        std::uint64_t first = 0;
        std::uint64_t count = 0;
        for (std::uint64_t k = (node.offset - layout_.archiveStart) / QuickArchive::kChunkSize + 1;
             k < layout_.chunks && chunkStart(k) < node.end(); ++k) {
            if (count == 0) first = chunkStart(k);
            ++count;
        }
        if (count == 0) return;
        std::string note = count == 1 ? "crosses into the next chunk at " + std::to_string(first)
                                      : "crosses " + std::to_string(count) + " chunk boundaries from " +
                                            std::to_string(first);
        node.note += (node.note.empty() ? "" : "; ") + note;
    }

    // Chunk markers for every chunk that begins at or before `offset`.
    void markChunks(std::vector<ExplainedNode>& out, std::uint64_t offset) {
        while (inArchive_ && nextChunk_ < layout_.chunks && chunkStart(nextChunk_) <= offset &&
               chunkStart(nextChunk_) < fileSize_) {
            ExplainedNode marker;
            marker.kind = "chunk";
            marker.offset = chunkStart(nextChunk_);
            marker.name = "chunk " + std::to_string(nextChunk_);
            const std::uint64_t end = std::min(chunkStart(nextChunk_ + 1), fileSize_);
            marker.value = std::to_string(end - marker.offset) + " bytes";
            if (end - marker.offset < QuickArchive::kChunkSize)
                marker.note = "the file ends inside it: the archive reads zero bytes past the end";
            out.push_back(std::move(marker));
            ++nextChunk_;
        }
    }

    // Ranges no record reads, from the cursor to `to`, one per region and chunk.
    void fillTo(std::vector<ExplainedNode>& out, std::uint64_t to) {
        to = std::min(to, fileSize_);
        markChunks(out, cursor_);
        while (cursor_ < to) {
            std::uint64_t end = to;
            const auto limit = [&](std::uint64_t at) {
                if (at > cursor_) end = std::min(end, at);
            };
            limit(layout_.archiveStart);
            limit(layout_.archiveEnd);
            if (failedFrom_) limit(*failedFrom_);
            if (cutFrom_) limit(*cutFrom_);
            // What was not read after a failure (or past the node limit) is one
            // range: its chunks are not told apart.
            const bool undecoded = (failedFrom_ && cursor_ >= *failedFrom_) || (cutFrom_ && cursor_ >= *cutFrom_);
            if (nextChunk_ < layout_.chunks && !undecoded) limit(chunkStart(nextChunk_));
            out.push_back(unread(cursor_, end));
            cursor_ = end;
            if (undecoded)
                while (nextChunk_ < layout_.chunks && chunkStart(nextChunk_) < end) ++nextChunk_;
            markChunks(out, cursor_);
        }
    }

    ExplainedNode unread(std::uint64_t start, std::uint64_t end) const {
        ExplainedNode node;
        node.kind = "unread";
        node.offset = start;
        node.size = end - start;
        if (cutFrom_ && start >= *cutFrom_) {
            node.name = "not explained: an explanation keeps at most " + std::to_string(nodeLimit_) + " nodes";
        } else if (start >= layout_.archiveEnd && layout_.archiveEnd > layout_.archiveStart) {
            node.name = "trailing bytes after the archive";
        } else if (failedFrom_ && start >= *failedFrom_) {
            node.name = "undecoded: the reading stopped at the failure";
        } else if (start < layout_.archiveStart) {
            node.name = "bytes no reader reads";
        } else if (layout_.dropsReturns) {
            node.name = "carriage returns, dropped by the first generation's reader";
        } else {
            const std::uint64_t chunk = (start - layout_.archiveStart) / QuickArchive::kChunkSize;
            const bool whole = start == chunkStart(chunk) && end - start == QuickArchive::kChunkSize;
            node.name = whole ? "chunk " + std::to_string(chunk) + ": a chunk no record reads"
                              : "chunk " + std::to_string(chunk) + ": bytes no record reads";
        }
        return node;
    }

    const FileLayout& layout_;
    std::uint64_t fileSize_;
    std::optional<std::uint64_t> failedFrom_;
    std::optional<std::uint64_t> cutFrom_;
    std::size_t nodeLimit_;
    std::uint64_t cursor_ = 0;
    std::uint64_t nextChunk_ = 0;
    bool inArchive_ = false;
};

ExplainedNode failureNode(const ReadFailure& failure) {
    ExplainedNode node;
    node.kind = "failure";
    node.offset = failure.offset;
    node.name = failure.reason;
    node.value = failure.recordPathText();
    return node;
}

std::size_t nodeLimitFor(std::uint64_t fileSize) {
    const std::uint64_t limit = fileSize * 2 + 4096;
    return static_cast<std::size_t>(std::min<std::uint64_t>(limit, Explanation::kMostNodes));
}

void finish(Explanation& result, const FileLayout& layout, const TreeBuilder* builder,
            std::optional<std::uint64_t> failedFrom) {
    std::optional<std::uint64_t> cutFrom;
    if (builder && builder->cut()) {
        result.cut = true;
        cutFrom = builder->cutAt();
    }
    Filler(layout, result.root.size, failedFrom, cutFrom, nodeLimitFor(result.root.size)).walk(result.root);
}

// Puts the archive's node in the file's, with the failure (if any) after what
// was read, and adds what no reader says.
void finishArchive(Explanation& result, const FileLayout& layout, const TreeBuilder& builder, ExplainedNode archive) {
    std::optional<std::uint64_t> failedFrom;
    if (result.failure) {
        archive.children.push_back(failureNode(*result.failure));
        failedFrom = std::max(builder.readEnd(), std::min(result.failure->offset, result.root.size));
    }
    result.root.children.push_back(std::move(archive));
    finish(result, layout, &builder, failedFrom);
}

// A node of the container over [offset, end).
ExplainedNode part(std::string kind, std::string name, std::uint64_t offset, std::uint64_t end) {
    ExplainedNode node;
    node.kind = std::move(kind);
    node.name = std::move(name);
    node.offset = offset;
    node.size = end - offset;
    return node;
}

std::uint32_t word32(std::string_view bytes, std::size_t offset) {
    std::uint32_t v = 0;
    std::memcpy(&v, bytes.data() + offset, sizeof v);
    return v;
}

// An explanation of a file that opened, so far only its node.
Explanation opened(const char* what, std::uint64_t size) {
    Explanation result;
    result.opened = true;
    result.root = part("file", what, 0, size);
    return result;
}

Explanation explainLibrary(const SharedBytes& shared) {
    const std::string_view bytes = shared.view();
    Explanation result = opened("material library", bytes.size());
    FileLayout layout;
    const std::size_t limit = nodeLimitFor(bytes.size());

    // The 8-byte header: the version word (0, generation) and the material count.
    constexpr std::uint64_t kHeaderSize = 8;
    ExplainedNode header = part("header", "header", 0, std::min<std::uint64_t>(kHeaderSize, bytes.size()));
    TreeBuilder headerBuilder(bytes, layout, header, limit);
    if (bytes.size() >= 4) {
        const VersionWord version{word32(bytes, 0)};
        headerBuilder.leafAt(header, 0, 4, Encoding::VersionWord, &version, "version");
        header.version = valueText(Encoding::VersionWord, &version);
    }
    if (bytes.size() >= 8) {
        const std::uint32_t count = word32(bytes, 4);
        headerBuilder.leafAt(header, 4, 4, Encoding::UInt32, &count, "material count");
    }
    if (!header.children.empty()) result.root.children.push_back(std::move(header));

    // The third generation's archive image begins with its chunk count.
    ExplainedNode image = part("archive", "archive image", kHeaderSize, bytes.size());
    if (bytes.size() >= kHeaderSize + 4 && VersionWord{word32(bytes, 0)}.is(0, 3)) {
        const std::uint32_t chunks = word32(bytes, kHeaderSize);
        headerBuilder.leafAt(image, kHeaderSize, 4, Encoding::UInt32, &chunks, "chunk count");
    }

    ReadFailure failure;
    std::optional<ZelMatFile::Framing> framing = ZelMatFile::readFraming(shared, &failure);
    if (!framing) {
        result.failure = failure;
        if (!image.children.empty()) {
            image.children.push_back(failureNode(failure));
            result.root.children.push_back(std::move(image));
        } else {
            result.root.children.push_back(failureNode(failure));
        }
        layout.archiveStart = layout.archiveEnd = std::min<std::uint64_t>(kHeaderSize, bytes.size());
        finish(result, layout, nullptr, headerBuilder.readEnd());
        return result;
    }

    layout.archiveStart = framing->archiveStart;
    layout.chunks = framing->archive.chunkCount();
    std::string name = "archive image: " + std::to_string(layout.chunks) +
                       (layout.chunks == 1 ? " chunk" : " chunks") + " of 4096 bytes";
    if (framing->generation == 1) {
        // The archive holds the body without its carriage returns.
        layout.dropsReturns = true;
        for (std::uint64_t offset = kHeaderSize; offset < bytes.size(); ++offset)
            if (bytes[offset] == '\x0D')
                layout.keptBeforeReturn.push_back(offset - kHeaderSize - layout.keptBeforeReturn.size());
        layout.archiveEnd = bytes.size();
        name += ", made of the bytes after the header without their carriage returns";
    } else if (framing->generation == 2) {
        layout.archiveEnd = bytes.size();
        name += ", the bytes after the header";
    } else {
        layout.archiveEnd = layout.archiveStart + layout.chunks * QuickArchive::kChunkSize;
    }
    ExplainedNode& archive = image;
    archive.name = std::move(name);
    archive.size = layout.archiveEnd - kHeaderSize;
    TreeBuilder builder(bytes, layout, archive, limit);
    framing->archive.observe(&builder);
    const bool read = ZelMatFile::readMaterials(*framing, [](MaterialPtr&&) {}, failure);
    framing->archive.observe(nullptr);
    result.readsAsBinary = read;
    if (!read) result.failure = failure;
    finishArchive(result, layout, builder, std::move(archive));
    return result;
}

Explanation explainOptions(const SharedBytes& shared) {
    const std::string_view bytes = shared.view();
    Explanation result = opened("render options", bytes.size());
    FileLayout layout;
    layout.archiveEnd = bytes.size();
    layout.chunks = (bytes.size() + QuickArchive::kChunkSize - 1) / QuickArchive::kChunkSize;
    ExplainedNode archive = part("archive",
                                 "archive: " + std::to_string(layout.chunks) +
                                     (layout.chunks == 1 ? " chunk" : " chunks") + " of 4096 bytes",
                                 0, bytes.size());
    ExplainedNode options = part("record", "options set", 0, 0);
    options.className = "AllOptions";
    TreeBuilder builder(bytes, layout, options, nodeLimitFor(bytes.size()));
    ZelOptFile file;
    AllOptions set;
    result.readsAsBinary = file.readBytes(set, bytes, &builder);
    if (!options.children.empty()) {
        options.offset = options.children.front().offset;
        options.size = builder.readEnd() - options.offset;
        archive.children.push_back(std::move(options));
    }
    if (!result.readsAsBinary) result.failure = file.lastReadFailure();
    finishArchive(result, layout, builder, std::move(archive));
    return result;
}

} // namespace

Explanation explainBytes(FileKind kind, const SharedBytes& bytes) {
    return kind == FileKind::MaterialLibrary ? explainLibrary(bytes) : explainOptions(bytes);
}

// --- views and text ---

namespace {

bool contains(const ExplainedNode& node, std::uint64_t offset) {
    if (node.size == 0) return node.offset == offset && node.kind != "chunk";
    return offset >= node.offset && offset < node.end();
}

void keep(const ExplainedNode& from, ExplainedNode& to, const ExplainView& view, unsigned depth) {
    for (const ExplainedNode& child : from.children) {
        if (view.offset && !contains(child, *view.offset)) continue;
        ExplainedNode copy = child;
        copy.children.clear();
        if (!view.depth || depth < *view.depth) keep(child, copy, view, depth + 1);
        to.children.push_back(std::move(copy));
    }
}

// Which record versions hold a table row: "from version 5", "versions 1 to 20".
std::string heldText(const ExplainedNode& node) {
    const std::string since = std::to_string(*node.heldSince);
    if (!node.heldUntil) return "from version " + since;
    if (*node.heldUntil == *node.heldSince) return "version " + since + " only";
    return "versions " + since + " to " + std::to_string(*node.heldUntil);
}

void appendLine(std::string& out, const ExplainedNode& node, unsigned depth) {
    out.append(std::size_t{2} * depth, ' ');
    const std::string end = std::to_string(node.end());
    if (node.kind == "chunk") {
        out += "-- " + node.name + " at " + std::to_string(node.offset) + ", " + node.value;
    } else if (node.kind == "failure") {
        out += std::to_string(node.offset) + " FAILURE: " + node.name;
        if (!node.value.empty()) out += " (in " + node.value + ")";
    } else if (node.isLeaf()) {
        out += std::to_string(node.offset) + "+" + std::to_string(node.size);
        if (node.kind == "unread") {
            out += " unread: " + node.name;
        } else {
            out += ' ';
            out += node.name.empty() ? "(value)" : node.name;
            out += ": " + node.encoding;
            if (!node.hex.empty()) out += " [" + node.hex + "]";
            if (!node.value.empty()) out += " = " + node.value;
            if (node.heldSince) out += " (" + heldText(node) + ")";
        }
    } else {
        out += std::to_string(node.offset) + ".." + end + " " + node.name;
        std::string facts;
        const auto fact = [&facts](const std::string& text) { facts += (facts.empty() ? "" : ", ") + text; };
        if (node.kindId) fact("kind " + std::to_string(*node.kindId));
        if (!node.className.empty()) fact(node.className);
        if (!node.version.empty()) fact("version " + node.version);
        if (node.heldSince) fact(heldText(node));
        if (!facts.empty()) out += " (" + facts + ")";
        if (!node.value.empty()) out += " = " + node.value;
    }
    if (!node.note.empty()) out += "  -- " + node.note;
    out += '\n';
}

void appendTree(std::string& out, const ExplainedNode& node, unsigned depth) {
    appendLine(out, node, depth);
    for (const ExplainedNode& child : node.children) appendTree(out, child, depth + 1);
}

} // namespace

ExplainedNode viewOf(const ExplainedNode& root, const ExplainView& view) {
    ExplainedNode shown = root;
    shown.children.clear();
    if (!view.depth || *view.depth > 0) keep(root, shown, view, 1);
    return shown;
}

std::string explanationText(const ExplainedNode& root) {
    std::string out;
    appendTree(out, root, 0);
    return out;
}

} // namespace OrvexKavorCore
