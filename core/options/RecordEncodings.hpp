#pragma once
// Stored encodings named explicitly in record tables.
//
// A table row such as
//   record::fieldAs<enc::Float32, &KavorFrameData::fov>("fov")
// states the encoding the way a record layout reads ("fov, Float32"), and the
// compiler checks it against the member: a float member cannot be declared Int32.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <string>
#include <type_traits>
#include <utility>

namespace OrvexKavorCore::record::enc {

// The archive primitive for exactly the C++ type T.
template <class T>
struct Exactly {
    template <class U>
    static bool read(QuickArchive& ar, U& value) {
        static_assert(std::is_same_v<U, T>, "the member's type does not match its stored encoding");
        ar.read(value);
        return true;
    }
    template <class U>
    static bool write(QuickArchive& ar, const U& value) {
        static_assert(std::is_same_v<U, T>, "the member's type does not match its stored encoding");
        ar.write(value);
        return true;
    }
    template <class U>
    static bool equal(const U& a, const U& b) {
        static_assert(std::is_same_v<U, T>, "the member's type does not match its stored encoding");
        return a == b;
    }
};

using Int32 = Exactly<std::int32_t>;
using UInt32 = Exactly<std::uint32_t>;
using Float32 = Exactly<float>;
using Float64 = Exactly<double>;
using Color = Exactly<KavorUtils::Color>;
using Transform = Exactly<KavorUtils::Transform>;

// A WString whose stored empty text means "nothing stored": reading it leaves the
// field as it was. The field holds UTF-8; the empty string is "no text", which is
// written as the empty WString.
struct TextOrKeep {
    static bool read(QuickArchive& ar, std::string& value) {
        std::string stored;
        if (!ar.readWString(stored)) return false;
        if (!stored.empty()) value = std::move(stored);
        return true;
    }
    static bool write(QuickArchive& ar, const std::string& value) {
        ar.writeWString(value);
        return true;
    }
    static bool equal(const std::string& a, const std::string& b) { return a == b; }
};

// Counts the rows of a table that a record of `version` holds.
template <class Fields>
constexpr unsigned countHeld(const Fields& fields, unsigned version) {
    unsigned n = 0;
    for (const auto& f : fields)
        if (f.versions.holds(version)) ++n;
    return n;
}

} // namespace OrvexKavorCore::record::enc
