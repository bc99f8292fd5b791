#pragma once
// Flat records described once.
//
// Many records are long lists of fields, each stored with a primitive encoding and
// present from some record version on. Such a record is described by one table of
// Field entries; reading, writing and comparing are derived from that table:
//
//   static constexpr std::array kFields = {
//       record::field<&OmniLight::color>("color"),
//       record::field<&OmniLight::shadowColor>("shadowColor", record::since(3)),
//       record::field<&AllOptions::params, &KavorParams::gi, &Gi::on>("gi.on"),  // nested
//       record::fieldAs<PlainAtTimeZero, &SunLight::transform>("transform", ...),  // another encoding
//   };
//   record::readFields(ar, *this, kFields, version);
//
// The stored encoding follows from the field's C++ type (Codec<T>: bool as Bool,
// int32_t as Int32, uint32_t as UInt32, float as Float32, double as Float64, the
// vector and colour types, std::string as WString). Model types with records of
// their own specialise Codec; fieldAs picks another encoding for one field.
#include <dexmor/archive/QuickArchive.hpp>

#include <cstdint>
#include <string>
#include <type_traits>

namespace OrvexKavorCore::record {

// The record versions that hold a field: since..until, inclusive.
struct Versions {
    std::uint16_t since = 0;
    std::uint16_t until = 0xFFFF;
    constexpr bool holds(unsigned version) const { return version >= since && version <= until; }
};
constexpr Versions since(std::uint16_t first) { return Versions{first, 0xFFFF}; }
constexpr Versions between(std::uint16_t first, std::uint16_t last) { return Versions{first, last}; }
constexpr Versions always() { return Versions{}; }

// How a value of type T is stored. Plain values use the archive's primitives.
template <class T>
struct Codec {
    static bool read(QuickArchive& ar, T& value) {
        ar.read(value);
        return true;
    }
    static bool write(QuickArchive& ar, const T& value) {
        ar.write(value);
        return true;
    }
    static bool equal(const T& a, const T& b) { return a == b; }
};

// Text fields are WStrings.
template <>
struct Codec<std::string> {
    static bool read(QuickArchive& ar, std::string& value) { return ar.readWString(value); }
    static bool write(QuickArchive& ar, const std::string& value) {
        ar.writeWString(value);
        return true;
    }
    static bool equal(const std::string& a, const std::string& b) { return a == b; }
};

template <class Obj>
struct Field {
    const char* name;
    Versions versions;
    bool (*read)(QuickArchive&, Obj&);
    bool (*write)(QuickArchive&, Obj&);
    bool (*equal)(const Obj&, const Obj&);
};

// The class and the type of a member pointer.
template <class M>
struct MemberTraits;
template <class C, class T>
struct MemberTraits<T C::*> {
    using Class = C;
    using Type = T;
};

namespace detail {

template <auto First, auto... Rest>
struct Path {
    using Obj = typename MemberTraits<decltype(First)>::Class;
    template <class Self>
    static auto& get(Self& object) {
        return ((object.*First) .* ... .* Rest);
    }
    using Type = std::remove_reference_t<decltype(get(std::declval<Obj&>()))>;
};

} // namespace detail

// A field reached through one member pointer or a chain of them, stored with
// `Encoding` (by default the codec of its type).
template <class Encoding, auto... Members>
constexpr auto fieldAs(const char* name, Versions versions = always()) {
    using P = detail::Path<Members...>;
    using Obj = typename P::Obj;
    return Field<Obj>{
        name,
        versions,
        [](QuickArchive& ar, Obj& o) { return Encoding::read(ar, P::get(o)); },
        [](QuickArchive& ar, Obj& o) { return Encoding::write(ar, P::get(o)); },
        [](const Obj& a, const Obj& b) { return Encoding::equal(P::get(a), P::get(b)); },
    };
}

template <auto... Members>
constexpr auto field(const char* name, Versions versions = always()) {
    using P = detail::Path<Members...>;
    return fieldAs<Codec<typename P::Type>, Members...>(name, versions);
}

// A stored value of type T that old versions hold and the object does not keep:
// read and dropped; written as T{} (writers never write such versions).
template <class Obj, class T>
constexpr Field<Obj> discarded(const char* name, Versions versions) {
    return Field<Obj>{
        name,
        versions,
        [](QuickArchive& ar, Obj&) {
            T value{};
            return Codec<T>::read(ar, value);
        },
        [](QuickArchive& ar, Obj&) { return Codec<T>::write(ar, T{}); },
        [](const Obj&, const Obj&) { return true; },
    };
}

// Reads the fields that `version` holds, in table order. False when a field's
// read fails (a count beyond the data, a failing sub-record).
template <class Obj, class Fields>
bool readFields(QuickArchive& ar, Obj& object, const Fields& fields, unsigned version) {
    for (const Field<Obj>& f : fields) {
        if (!f.versions.holds(version)) continue;
        auto scope = QuickArchive::Scope::row(ar, f.name, f.versions.since, f.versions.until);
        if (!f.read(ar, object)) return false;
    }
    return true;
}

template <class Obj, class Fields>
bool writeFields(QuickArchive& ar, Obj& object, const Fields& fields, unsigned version) {
    for (const Field<Obj>& f : fields)
        if (f.versions.holds(version) && !f.write(ar, object)) return false;
    return true;
}

// Every field of the table equal.
template <class Obj, class Fields>
bool fieldsEqual(const Obj& a, const Obj& b, const Fields& fields) {
    for (const Field<Obj>& f : fields)
        if (!f.equal(a, b)) return false;
    return true;
}

// The name of the first unequal field, or nullptr (for tests and diagnostics).
template <class Obj, class Fields>
const char* firstDifference(const Obj& a, const Obj& b, const Fields& fields) {
    for (const Field<Obj>& f : fields)
        if (!f.equal(a, b)) return f.name;
    return nullptr;
}

} // namespace OrvexKavorCore::record
