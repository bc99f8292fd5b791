#pragma once
// QuickArchive: the byte container every stored object passes through.
//
// Bytes live in fixed 4096-byte chunks (chunk k holds bytes 4096k..4096k+4095), so
// appending never moves stored bytes. Reading and writing have independent
// positions. Every value is stored little-endian and packed, with no type
// information: the records of the classes give the bytes their meaning.
//
// Reading is defensive. A plain value read past the last chunk leaves its
// destination as it was (the old format's behaviour, relied on by truncated
// records). A count-prefixed value or a list whose count cannot fit in the bytes
// that remain fails at once, without allocating by that count. Nesting is limited
// by Scope. The first failure is kept with its offset and record path so that the
// user can be told why a file did not read.
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/archive/ReadFailure.hpp>
#include <dexmor/platform/SharedBytes.hpp>

#include <boost/array.hpp>
#include <boost/shared_ptr.hpp>

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <iosfwd>
#include <optional>
#include <string>
#include <string_view>
#include <typeinfo>
#include <vector>

namespace OrvexKavorCore {

class QuickArchive;

// Two small numbers packed into one UInt32: the first in the low 16 bits, the
// second in the high 16 bits.
struct VersionWord {
    std::uint32_t raw = 0;

    static constexpr VersionWord make(std::uint16_t first, std::uint16_t second) {
        return VersionWord{static_cast<std::uint32_t>(first) | (static_cast<std::uint32_t>(second) << 16)};
    }
    constexpr std::uint16_t first() const { return static_cast<std::uint16_t>(raw & 0xFFFF); }
    constexpr std::uint16_t second() const { return static_cast<std::uint16_t>(raw >> 16); }
    constexpr bool is(std::uint16_t a, std::uint16_t b) const { return raw == make(a, b).raw; }
    friend constexpr bool operator==(VersionWord, VersionWord) = default;
};

// Watches a reading: every value as the archive delivers it, and the record path
// as readers open and close its levels (QuickArchive::Scope). An archive without
// an observer pays one predictable branch per read for this.
class ReadObserver {
public:
    // How a value is stored.
    enum class Encoding : std::uint8_t {
        Bool,
        UInt8,
        Int32,
        UInt32,
        Float32,
        Float64,
        Vector,
        Color,
        AColor,
        Matrix,
        Transform,
        VersionWord,
        String,  // value: the std::string as read (up to its first NUL)
        WString, // value: the decoded std::string
        Bytes,   // a count-prefixed block; value: the stored count (std::uint32_t)
        Raw,     // bytes copied as they are; value: the bytes
        Skipped, // bytes passed over; value: nullptr
    };

    virtual ~ReadObserver() = default;
    // A value of `size` bytes read at archive position `position`. `value` points
    // to the value as read (see Encoding); bytes past the last chunk leave it as
    // it was. Only valid during the call.
    virtual void value(std::uint64_t position, std::uint64_t size, Encoding encoding, const void* value) = 0;
    // A level of the record path opens: a nested member (`nests`: "texture",
    // "material" 3) or the label of a field of a flat record ("color_tex").
    virtual void enter(const char* what, const char* name, std::int64_t index, bool nests) = 0;
    // The level closes; `level` is how a record path shows it now that its record
    // has been read (`material 3 "Oak"`), empty beyond the nesting limit.
    virtual void leave(std::string_view level) = 0;
    // A member's kind id selected an object of this class.
    virtual void selected(std::int32_t kind, const std::type_info& type) = 0;
    // The level just opened is a row of a record table that only records of
    // versions `since` to `until` (inclusive; 0xFFFF: every later one) hold.
    // Not called for rows that every version holds.
    virtual void held(std::uint16_t since, std::uint16_t until) {
        (void)since;
        (void)until;
    }
};

class QuickArchive {
public:
    using Encoding = ReadObserver::Encoding;

    static constexpr std::size_t kChunkSize = 4096;
    static constexpr unsigned kMaxNesting = 256;
    // Positions are 32-bit in the format: archives of 4 GiB or more are refused.
    static constexpr std::uint64_t kMaxSize = std::uint64_t{1} << 32;

    using Chunk = boost::array<std::uint8_t, kChunkSize>;

    // An empty archive with `initialChunks` zeroed chunks.
    explicit QuickArchive(std::size_t initialChunks = 1);
    // An archive holding exactly these bytes, read position 0, write position at
    // the end. Buffers of 4 GiB or more give an empty archive marked as failed.
    QuickArchive(const void* data, std::size_t length);
    // An archive over `length` bytes of `owner` from `offset`, without copying them:
    // every whole chunk is a view into the bytes, whose owner the archive keeps alive; a
    // trailing partial chunk is copied and zero-padded. For reading only: a write
    // would change the owner's bytes. Out-of-range spans give a failed, empty archive.
    static QuickArchive viewOf(const SharedBytes& bytes, std::size_t offset, std::size_t length);
    virtual ~QuickArchive();

    QuickArchive(const QuickArchive&) = default; // shares the chunks
    QuickArchive& operator=(const QuickArchive&) = default;

    // Drops every chunk and both positions; the failure record too.
    void reset();

    // --- positions and size ---
    std::uint64_t readPosition() const { return readPos_; }
    std::uint64_t writePosition() const { return writePos_; }
    std::size_t chunkCount() const { return chunks_.size(); }
    // Bytes that can still be read: every byte of every existing chunk counts.
    std::uint64_t remaining() const;
    // Whether `count` items of at least `itemSize` bytes each can still be read.
    bool canHold(std::uint64_t count, std::uint64_t itemSize) const;
    // Advances the read position without reading.
    void skip(std::uint64_t bytes);
    // Reads on from `position` (one the reading has passed before).
    void seekRead(std::uint64_t position) { readPos_ = position; }

    // --- bytes ---
    void putByte(std::uint8_t b);
    bool getByte(std::uint8_t& b) {
        if (observer_) [[unlikely]]
            return observedCopy(&b, 1, Encoding::UInt8);
        return takeByte(b);
    }
    void putRaw(const void* data, std::size_t length);
    // Reads `length` bytes; bytes past the last chunk leave the destination as it was.
    // True when every byte was delivered.
    bool getRaw(void* data, std::size_t length) {
        if (observer_) [[unlikely]]
            return observedCopy(data, length, Encoding::Raw);
        return copyOut(data, length);
    }

    // --- primitives (little-endian, packed) ---
    void write(bool v) { putByte(v ? 1 : 0); }
    void write(std::uint8_t v) { putByte(v); }
    void write(std::int32_t v) { putRaw(&v, sizeof v); }
    void write(std::uint32_t v) { putRaw(&v, sizeof v); }
    void write(float v) { putRaw(&v, sizeof v); }
    void write(double v) { putRaw(&v, sizeof v); }
    void write(const Vector& v);
    void write(const Color& v);
    void write(const AColor& v);
    void write(const Matrix& v);
    void write(const Transform& v);
    void write(VersionWord v) { write(v.raw); }

    // A stored Bool byte other than 0 reads as true.
    void read(bool& v) {
        if (observer_) [[unlikely]]
            return observedCompound(v, Encoding::Bool);
        std::uint8_t b = v ? 1 : 0;
        takeByte(b);
        v = b != 0;
    }
    void read(std::uint8_t& v) { getByte(v); }
    void read(std::int32_t& v) { readPlain(v, Encoding::Int32); }
    void read(std::uint32_t& v) { readPlain(v, Encoding::UInt32); }
    void read(float& v) { readPlain(v, Encoding::Float32); }
    void read(double& v) { readPlain(v, Encoding::Float64); }
    // The compound values assemble into a zeroed temporary: missing bytes read as 0.
    void read(Vector& v);
    void read(Color& v);
    void read(AColor& v);
    void read(Matrix& v);
    void read(Transform& v);
    void read(VersionWord& v) { readPlain(v.raw, Encoding::VersionWord); }

    // Reads a value into a fresh zero-initialised local and returns it.
    template <class T>
    T get() {
        T v{};
        read(v);
        return v;
    }

    // --- count-prefixed values ---
    // String: UInt32 N, then N bytes, no terminator. Read back up to the first NUL.
    void writeString(std::string_view narrow);
    [[nodiscard]] bool readString(std::string& out);
    // WString: text stored as the String of its UTF-8 form (up to its first NUL;
    // text that is not valid UTF-8 is stored empty). Reading decodes strict UTF-8,
    // falling back to Windows-1252.
    void writeWString(std::string_view utf8);
    [[nodiscard]] bool readWString(std::string& out);
    // Bytes: UInt32 N, then N raw bytes.
    void writeBytes(const void* data, std::uint32_t length);
    // Reads a Bytes block into a buffer of `capacity` bytes and returns the stored
    // count N (see the .cpp for the strictness rule). A count that cannot fit in
    // the remaining bytes fails and returns nullopt.
    [[nodiscard]] std::optional<std::uint32_t> readBytes(void* buffer, std::uint32_t capacity, bool strict);

    // --- whole archive ---
    // Chunk count (UInt32) then every chunk in full.
    bool save(std::ostream& out) const;
    // Replaces the content with a chunk image read from the stream; both positions 0.
    // False when the stream ends before the count or inside a chunk.
    bool load(std::istream& in);
    bool saveToFile(const std::filesystem::path& path) const;
    bool loadFromFile(const std::filesystem::path& path);
    // Every chunk, in full, in order (the options file stores just these).
    const std::vector<boost::shared_ptr<Chunk>>& chunks() const { return chunks_; }

    // --- failures ---
    // Records `reason` as the failure if none is recorded yet; returns false so that
    // readers can write `return ar.fail("...")`.
    bool fail(std::string_view reason);
    bool failed() const { return failure_.has_value(); }
    const std::optional<ReadFailure>& failure() const { return failure_; }
    // For readers that deliberately ignore a member's failure.
    void clearFailure() { failure_.reset(); }

    // --- watching a reading ---
    // Every read value and every level of the record path is reported to
    // `observer` (nullptr: none) until it is replaced. It must outlive the reading.
    void observe(ReadObserver* observer) { observer_ = observer; }
    ReadObserver* observer() const { return observer_; }

    // --- record versions ---
    // Every record begins with a version word (0, n). A record reads versions
    // (0, 1) to (0, latest): checkVersion fails the record with "unknown WHAT
    // version (a, b)" for any other and returns whether it accepts `version`;
    // readVersion reads the word and checks it (nullopt once refused).
    bool checkVersion(VersionWord version, std::uint16_t latest, std::string_view what) {
        if (version.first() == 0 && version.second() >= 1 && version.second() <= latest) [[likely]]
            return true;
        return refuseVersion(version, what);
    }
    std::optional<VersionWord> readVersion(std::uint16_t latest, std::string_view what) {
        const auto version = get<VersionWord>();
        if (!checkVersion(version, latest, what)) return std::nullopt;
        return version;
    }

    // A value read under a field's name, as record tables name theirs: for
    // failure reports and explanations of hand-written records.
    template <class T>
    [[gnu::always_inline]] void readAs(const char* name, T& value) {
        // A plain value cannot fail: only an explanation needs its name.
        if (observer_) [[unlikely]]
            return observedAs(name, value);
        read(value);
    }
    template <class T>
    [[gnu::always_inline]] T getAs(const char* name) {
        T value{};
        readAs(name, value);
        return value;
    }
    bool readWStringAs(const char* name, std::string& value);

    // One level of the record path, and the nesting guard. A reader opens a Scope
    // before reading a nested member; when the nesting is too deep the scope is
    // false and the failure is recorded.
    class Scope {
    public:
        // A nested member: counts towards the nesting limit.
        Scope(QuickArchive& ar, const char* what, const char* name = nullptr, std::int64_t index = -1)
            : Scope(ar, what, name, index, true) {}
        // A label only (a field of a flat record): does not count as nesting.
        [[gnu::always_inline]] static Scope label(QuickArchive& ar, const char* name) {
            return Scope(ar, nullptr, name, -1, false);
        }
        // The label of a record table's row that only record versions `since` to
        // `until` hold (an observer is told which).
        [[gnu::always_inline]] static Scope row(QuickArchive& ar, const char* name, std::uint16_t since,
                                                std::uint16_t until) {
            return Scope(ar, nullptr, name, -1, false, since, until);
        }
        // Scopes open and close for every field of a record: they stay inline, the
        // reports to an observer out of line.
        [[gnu::always_inline]] ~Scope() {
            if (ar_.observer_) [[unlikely]]
                reportLeave();
            if (nests_) --ar_.nesting_;
            if (pushed_) --ar_.depth_;
        }
        Scope(const Scope&) = delete;
        Scope& operator=(const Scope&) = delete;
        explicit operator bool() const { return ok_; }
        // Shows `name` on this level of the record path as it reads at the time of a
        // failure (a material's name is read after its scope opens), unless it still
        // equals `unread`, the value it had before its record was read. Both must
        // outlive the scope.
        void showName(const std::string& name, const std::string& unread) {
            if (pushed_) ar_.frames_[ar_.depth_ - 1].liveName = LiveName{&name, &unread};
        }

    private:
        [[gnu::always_inline]] Scope(QuickArchive& ar, const char* what, const char* name, std::int64_t index,
                                     bool nests, std::uint16_t heldSince = 0, std::uint16_t heldUntil = 0xFFFF)
            : ar_(ar), nests_(nests), pushed_(ar.depth_ < kMaxNesting), ok_(true) {
            // The path is kept only up to the limit: deeper frames add nothing a user needs.
            if (pushed_) ar_.frames_[ar_.depth_++] = Frame{what, name, index, {}};
            if (ar_.observer_) [[unlikely]]
                reportEnter(what, name, index, heldSince, heldUntil);
            if (nests_ && ++ar_.nesting_ > kMaxNesting) tooDeep();
        }
        void tooDeep();
        [[gnu::cold]] void reportEnter(const char* what, const char* name, std::int64_t index,
                                       std::uint16_t heldSince, std::uint16_t heldUntil);
        [[gnu::cold]] void reportLeave();
        QuickArchive& ar_;
        bool nests_;
        bool pushed_;
        bool ok_;
    };

private:
    struct LiveName {
        const std::string* name;
        const std::string* unread;
        bool isRead() const { return name && *name != *unread; }
    };
    struct Frame {
        const char* what;
        const char* name;
        std::int64_t index;
        LiveName liveName;
    };

    Chunk& chunkFor(std::uint64_t position);
    bool copyOut(void* data, std::size_t length) {
        // Most values lie inside one chunk: copy them at once.
        const std::uint64_t index = readPos_ / kChunkSize;
        const std::size_t offset = static_cast<std::size_t>(readPos_ % kChunkSize);
        if (index < chunks_.size() && length <= kChunkSize - offset) {
            std::memcpy(data, chunks_[index]->data() + offset, length);
            readPos_ += length;
            return true;
        }
        return getRawAcrossChunks(data, length);
    }
    bool takeByte(std::uint8_t& b) {
        const std::uint64_t position = readPos_++;
        if (position / kChunkSize >= chunks_.size()) return false;
        b = (*chunks_[position / kChunkSize])[position % kChunkSize];
        return true;
    }
    bool getRawAcrossChunks(void* data, std::size_t length);
    std::vector<std::string> recordPath() const;

    template <class T>
    void readPlain(T& v, Encoding encoding) {
        if (observer_) [[unlikely]] {
            observedCopy(&v, sizeof v, encoding);
            return;
        }
        copyOut(&v, sizeof v);
    }
    // The reads while an observer watches, out of the way of the plain ones.
    [[gnu::cold]] bool observedCopy(void* data, std::size_t length, Encoding encoding);
    template <class T>
    void observedCompound(T& v, Encoding encoding);
    bool observedCounted(std::string& out, Encoding encoding);
    template <class T>
    [[gnu::noinline, gnu::cold]] void observedAs(const char* name, T& value);
    [[gnu::cold]] bool refuseVersion(VersionWord version, std::string_view what);
    class Unobserved;
    void reportRefusedCount(const Unobserved& aside);

    std::vector<boost::shared_ptr<Chunk>> chunks_;
    std::uint64_t readPos_ = 0;
    std::uint64_t writePos_ = 0;
    // The open levels are frames_[0, depth_): opening one is a store.
    std::array<Frame, kMaxNesting> frames_;
    unsigned depth_ = 0;
    unsigned nesting_ = 0;
    std::optional<ReadFailure> failure_;
    ReadObserver* observer_ = nullptr;
};

template <class T>
void QuickArchive::observedAs(const char* name, T& value) {
    const auto label = Scope::label(*this, name);
    read(value);
}

inline bool QuickArchive::readWStringAs(const char* name, std::string& value) {
    const auto label = Scope::label(*this, name);
    return readWString(value);
}

} // namespace OrvexKavorCore
