#include <dexmor/archive/QuickArchive.hpp>

#include <dexmor/platform/Text.hpp>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <istream>
#include <ostream>

namespace OrvexKavorCore {

namespace {

std::uint64_t chunkIndex(std::uint64_t position) { return position >> 12; }
std::size_t chunkOffset(std::uint64_t position) { return static_cast<std::size_t>(position & 0xFFF); }

boost::shared_ptr<QuickArchive::Chunk> newChunk() {
    auto chunk = boost::shared_ptr<QuickArchive::Chunk>(new QuickArchive::Chunk);
    chunk->fill(0);
    return chunk;
}

} // namespace

std::string ReadFailure::recordPathText() const {
    std::string text;
    for (const std::string& level : recordPath) {
        if (!text.empty()) text += " / ";
        text += level;
    }
    return text;
}

std::string ReadFailure::describe() const {
    std::string text = recordPath.empty() ? reason : recordPathText() + ": " + reason;
    text += " at offset " + std::to_string(offset);
    return text;
}

QuickArchive::QuickArchive(std::size_t initialChunks) {
    chunks_.reserve(initialChunks);
    for (std::size_t i = 0; i < initialChunks; ++i) chunks_.push_back(newChunk());
}

QuickArchive::QuickArchive(const void* data, std::size_t length) {
    if (length >= kMaxSize) {
        fail("the data is 4 GiB or larger");
        return;
    }
    const std::size_t count = (length + kChunkSize - 1) / kChunkSize;
    chunks_.reserve(count);
    const auto* bytes = static_cast<const std::uint8_t*>(data);
    for (std::size_t k = 0; k < count; ++k) {
        auto chunk = newChunk();
        const std::size_t n = std::min(kChunkSize, length - k * kChunkSize);
        std::memcpy(chunk->data(), bytes + k * kChunkSize, n);
        chunks_.push_back(std::move(chunk));
    }
    writePos_ = length;
}

QuickArchive QuickArchive::viewOf(const SharedBytes& bytes, std::size_t offset, std::size_t length) {
    QuickArchive ar(0);
    if (offset > bytes.size() || length > bytes.size() - offset) {
        ar.fail("the archive lies outside the data");
        return ar;
    }
    if (length >= kMaxSize) {
        ar.fail("the data is 4 GiB or larger");
        return ar;
    }
    const std::size_t whole = length / kChunkSize;
    ar.chunks_.reserve(whole + 1);
    // The bytes stay where they are. A Chunk is an array of bytes with alignment 1,
    // so any position in the buffer can be seen as one.
    auto* base = reinterpret_cast<std::uint8_t*>(const_cast<char*>(bytes.data() + offset));
    for (std::size_t k = 0; k < whole; ++k)
        ar.chunks_.emplace_back(bytes.owner(), reinterpret_cast<Chunk*>(base + k * kChunkSize));
    if (const std::size_t tail = length % kChunkSize) {
        auto chunk = newChunk();
        std::memcpy(chunk->data(), base + whole * kChunkSize, tail);
        ar.chunks_.push_back(std::move(chunk));
    }
    ar.writePos_ = length;
    return ar;
}

QuickArchive::~QuickArchive() = default;

void QuickArchive::reset() {
    chunks_.clear();
    readPos_ = 0;
    writePos_ = 0;
    depth_ = 0;
    failure_.reset();
}

std::uint64_t QuickArchive::remaining() const {
    const std::uint64_t capacity = static_cast<std::uint64_t>(chunks_.size()) * kChunkSize;
    return readPos_ < capacity ? capacity - readPos_ : 0;
}

bool QuickArchive::canHold(std::uint64_t count, std::uint64_t itemSize) const {
    if (itemSize == 0) return true;
    return count <= remaining() / itemSize;
}

void QuickArchive::skip(std::uint64_t bytes) {
    if (observer_) [[unlikely]]
        observer_->value(readPos_, bytes, Encoding::Skipped, nullptr);
    readPos_ += bytes;
}

QuickArchive::Chunk& QuickArchive::chunkFor(std::uint64_t position) {
    // Positions only ever advance by whole values, so at most one chunk is missing.
    while (chunks_.size() <= chunkIndex(position)) chunks_.push_back(newChunk());
    return *chunks_[chunkIndex(position)];
}

void QuickArchive::putByte(std::uint8_t b) {
    chunkFor(writePos_)[chunkOffset(writePos_)] = b;
    ++writePos_;
}

void QuickArchive::putRaw(const void* data, std::size_t length) {
    const auto* bytes = static_cast<const std::uint8_t*>(data);
    while (length > 0) {
        Chunk& chunk = chunkFor(writePos_);
        const std::size_t offset = chunkOffset(writePos_);
        const std::size_t n = std::min(length, kChunkSize - offset);
        std::memcpy(chunk.data() + offset, bytes, n);
        bytes += n;
        length -= n;
        writePos_ += n;
    }
}

bool QuickArchive::getRawAcrossChunks(void* data, std::size_t length) {
    auto* bytes = static_cast<std::uint8_t*>(data);
    bool complete = true;
    while (length > 0) {
        const std::uint64_t index = chunkIndex(readPos_);
        const std::size_t offset = chunkOffset(readPos_);
        const std::size_t n = std::min(length, kChunkSize - offset);
        if (index < chunks_.size())
            std::memcpy(bytes, chunks_[index]->data() + offset, n);
        else
            complete = false; // past the last chunk: the destination keeps its bytes
        bytes += n;
        length -= n;
        readPos_ += n;
    }
    return complete;
}

void QuickArchive::write(const Vector& v) {
    write(v.x);
    write(v.y);
    write(v.z);
}
void QuickArchive::write(const Color& v) {
    write(v.r);
    write(v.g);
    write(v.b);
}
void QuickArchive::write(const AColor& v) {
    write(v.r);
    write(v.g);
    write(v.b);
    write(v.a);
}
void QuickArchive::write(const Matrix& v) {
    for (const Vector& column : v.m) write(column);
}
void QuickArchive::write(const Transform& v) {
    write(v.m);
    write(v.offs);
}

bool QuickArchive::observedCopy(void* data, std::size_t length, Encoding encoding) {
    const std::uint64_t start = readPos_;
    const bool complete = copyOut(data, length);
    observer_->value(start, length, encoding, data);
    return complete;
}

// The observer set aside while a value's parts are read: they are not values
// of their own, and the whole is reported once read.
class QuickArchive::Unobserved {
public:
    explicit Unobserved(QuickArchive& ar) : ar_(ar), observer_(ar.observer_), start_(ar.readPos_) {
        ar.observer_ = nullptr;
    }
    ~Unobserved() { ar_.observer_ = observer_; }
    Unobserved(const Unobserved&) = delete;
    Unobserved& operator=(const Unobserved&) = delete;
    ReadObserver& observer() const { return *observer_; }
    std::uint64_t start() const { return start_; }
    std::uint64_t size() const { return ar_.readPos_ - start_; }

private:
    QuickArchive& ar_;
    ReadObserver* observer_;
    std::uint64_t start_;
};

template <class T>
void QuickArchive::observedCompound(T& v, Encoding encoding) {
    const Unobserved aside(*this);
    read(v);
    aside.observer().value(aside.start(), aside.size(), encoding, &v);
}
template void QuickArchive::observedCompound(bool&, Encoding); // for read(bool&), inline

void QuickArchive::read(Vector& v) {
    if (observer_) [[unlikely]]
        return observedCompound(v, Encoding::Vector);
    Vector t{};
    read(t.x);
    read(t.y);
    read(t.z);
    v = t;
}
void QuickArchive::read(Color& v) {
    if (observer_) [[unlikely]]
        return observedCompound(v, Encoding::Color);
    Color t{};
    read(t.r);
    read(t.g);
    read(t.b);
    v = t;
}
void QuickArchive::read(AColor& v) {
    if (observer_) [[unlikely]]
        return observedCompound(v, Encoding::AColor);
    AColor t{};
    read(t.r);
    read(t.g);
    read(t.b);
    read(t.a);
    v = t;
}
void QuickArchive::read(Matrix& v) {
    if (observer_) [[unlikely]]
        return observedCompound(v, Encoding::Matrix);
    for (Vector& column : v.m) read(column);
}
void QuickArchive::read(Transform& v) {
    if (observer_) [[unlikely]]
        return observedCompound(v, Encoding::Transform);
    read(v.m);
    read(v.offs);
}

void QuickArchive::writeString(std::string_view narrow) {
    write(static_cast<std::uint32_t>(narrow.size()));
    putRaw(narrow.data(), narrow.size());
}

bool QuickArchive::observedCounted(std::string& out, Encoding encoding) {
    const Unobserved aside(*this);
    const bool read = encoding == Encoding::WString ? readWString(out) : readString(out);
    if (read)
        aside.observer().value(aside.start(), aside.size(), encoding, &out);
    else
        reportRefusedCount(aside);
    return read;
}

void QuickArchive::reportRefusedCount(const Unobserved& aside) {
    // Only the count was read: it is what the user needs to see.
    const std::uint64_t end = readPos_;
    readPos_ = aside.start();
    std::uint32_t count = 0;
    copyOut(&count, sizeof count);
    readPos_ = end;
    aside.observer().value(aside.start(), aside.size(), Encoding::UInt32, &count);
}

bool QuickArchive::readString(std::string& out) {
    if (observer_) [[unlikely]]
        return observedCounted(out, Encoding::String);
    const auto length = get<std::uint32_t>();
    if (length == 0) {
        out.clear();
        return true;
    }
    if (!canHold(length, 1))
        return fail("a string of " + std::to_string(length) + " bytes is longer than the " +
                    std::to_string(remaining()) + " bytes left");
    std::string buffer(length, '\0');
    getRaw(buffer.data(), length);
    buffer.resize(text::upToFirstNul(buffer).size());
    out = std::move(buffer);
    return true;
}

void QuickArchive::writeWString(std::string_view utf8) {
    const std::string_view stored = text::upToFirstNul(utf8);
    writeString(text::isValidUtf8(stored) ? stored : std::string_view{});
}

bool QuickArchive::readWString(std::string& out) {
    if (observer_) [[unlikely]]
        return observedCounted(out, Encoding::WString);
    std::string bytes;
    if (!readString(bytes)) return false;
    out = text::decodeStoredText(bytes);
    return true;
}

void QuickArchive::writeBytes(const void* data, std::uint32_t length) {
    write(length);
    putRaw(data, length);
}

// Reading a Bytes block into a buffer of capacity K: the stored count N is read,
// then min(K, N) bytes. When N differs from K and `strict` is set, the read
// position goes back to the count (the next reader reads it again). Otherwise a
// surplus beyond K is skipped. The stored count is returned; callers compare it
// with the one they expected.
std::optional<std::uint32_t> QuickArchive::readBytes(void* buffer, std::uint32_t capacity, bool strict) {
    if (observer_) [[unlikely]] {
        const Unobserved aside(*this);
        const std::optional<std::uint32_t> stored = readBytes(buffer, capacity, strict);
        if (!stored)
            reportRefusedCount(aside);
        else if (aside.size() != 0) // a strict read that went back reported nothing: the next reader reads it
            aside.observer().value(aside.start(), aside.size(), Encoding::Bytes, &*stored);
        return stored;
    }
    const std::uint64_t start = readPos_;
    const auto length = get<std::uint32_t>();
    if (!canHold(length, 1)) {
        fail("a block of " + std::to_string(length) + " bytes is longer than the " + std::to_string(remaining()) +
             " bytes left");
        return std::nullopt;
    }
    getRaw(buffer, std::min(capacity, length));
    if (length != capacity && strict) {
        readPos_ = start;
        return length;
    }
    if (length > capacity) skip(length - capacity);
    return length;
}

bool QuickArchive::save(std::ostream& out) const {
    const auto count = static_cast<std::uint32_t>(chunks_.size());
    out.write(reinterpret_cast<const char*>(&count), sizeof count);
    for (const auto& chunk : chunks_) out.write(reinterpret_cast<const char*>(chunk->data()), kChunkSize);
    return true;
}

bool QuickArchive::load(std::istream& in) {
    reset();
    std::uint32_t count = 0;
    if (!in.read(reinterpret_cast<char*>(&count), sizeof count)) return fail("the chunk count is missing");
    if (count >= kMaxSize / kChunkSize) return fail("the archive claims 4 GiB or more");
    // Chunks are appended as they arrive, so a false count costs nothing.
    for (std::uint32_t k = 0; k < count; ++k) {
        auto chunk = newChunk();
        if (!in.read(reinterpret_cast<char*>(chunk->data()), kChunkSize))
            return fail("the archive ends inside chunk " + std::to_string(k) + " of " + std::to_string(count));
        chunks_.push_back(std::move(chunk));
    }
    return true;
}

bool QuickArchive::saveToFile(const std::filesystem::path& path) const {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    if (!out) return false;
    save(out);
    out.close();
    return static_cast<bool>(out);
}

bool QuickArchive::loadFromFile(const std::filesystem::path& path) {
    std::error_code ec;
    if (!std::filesystem::is_regular_file(path, ec)) return false;
    std::ifstream in(path, std::ios::binary);
    if (!in) return false;
    return load(in);
}

namespace {

// A name as a record path shows it: quoted, with quotes, backslashes and control
// characters escaped, and cut after 60 bytes (at a character boundary) so that a
// hostile name of megabytes cannot swamp a report.
std::string quotedName(std::string_view name) {
    constexpr std::size_t kShownBytes = 60;
    std::string quoted = "\"";
    std::size_t shown = name.size();
    if (shown > kShownBytes) {
        shown = kShownBytes;
        while (shown > 0 && (static_cast<unsigned char>(name[shown]) & 0xC0) == 0x80) --shown;
    }
    for (const char c : name.substr(0, shown)) {
        const auto byte = static_cast<unsigned char>(c);
        if (c == '"' || c == '\\') {
            quoted += '\\';
            quoted += c;
        } else if (byte < 0x20 || byte == 0x7F) {
            constexpr char kHex[] = "0123456789abcdef";
            quoted += "\\x";
            quoted += kHex[byte >> 4];
            quoted += kHex[byte & 0xF];
        } else {
            quoted += c;
        }
    }
    if (shown < name.size()) quoted += "...";
    quoted += '"';
    return quoted;
}

} // namespace

std::vector<std::string> QuickArchive::recordPath() const {
    // One level per frame, "what index "name"", the words present joined by single
    // spaces. A field's label directly above the member it holds reads as one
    // level: `texture "color_tex"` for the label "color_tex" and the texture inside
    // it; above an indexed or named member ("BRDF layer 2") the index says enough.
    std::vector<std::string> levels;
    std::string level;
    const auto word = [&level](std::string_view text) {
        if (!level.empty()) level += ' ';
        level += text;
    };
    const char* heldLabel = nullptr;
    for (std::size_t i = 0; i < depth_; ++i) {
        const Frame& frame = frames_[i];
        const bool isLabel = !frame.what && frame.index < 0;
        if (isLabel && i + 1 < depth_) {
            const Frame& member = frames_[i + 1];
            const bool memberNamed = member.name || member.liveName.isRead();
            if (member.what && member.index < 0 && !memberNamed) {
                heldLabel = frame.name;
                continue;
            }
            if (member.what && member.index >= 0) continue;
        }
        level.clear();
        if (frame.what) word(frame.what);
        if (frame.index >= 0) word(std::to_string(frame.index));
        const char* name = frame.name ? frame.name : heldLabel;
        if (name) word(frame.what ? quotedName(name) : name);
        if (frame.liveName.isRead()) word(quotedName(*frame.liveName.name));
        heldLabel = nullptr;
        levels.push_back(level);
    }
    return levels;
}

bool QuickArchive::refuseVersion(VersionWord version, std::string_view what) {
    return fail("unknown " + std::string(what) + " version (" + std::to_string(version.first()) + ", " +
                std::to_string(version.second()) + ")");
}

bool QuickArchive::fail(std::string_view reason) {
    if (!failure_) failure_ = ReadFailure{std::string(reason), readPos_, recordPath()};
    return false;
}

void QuickArchive::Scope::reportEnter(const char* what, const char* name, std::int64_t index,
                                      std::uint16_t heldSince, std::uint16_t heldUntil) {
    ar_.observer_->enter(what, name, index, nests_);
    if (heldSince != 0 || heldUntil != 0xFFFF) ar_.observer_->held(heldSince, heldUntil);
}

void QuickArchive::Scope::reportLeave() {
    ar_.observer_->leave(pushed_ ? ar_.recordPath().back() : std::string());
}

void QuickArchive::Scope::tooDeep() {
    ok_ = false;
    ar_.fail("records nested deeper than " + std::to_string(kMaxNesting) + " levels");
}

} // namespace OrvexKavorCore
