#pragma once
// Nested members of a record. A mandatory member is stored as its Int32 kind id
// followed by its own record; an optional member is a Bool "present" flag, then,
// when present, the kind id and the record. The family of a member (material,
// BRDF, texture, UVW generator, bitmap, light) gives its creation function through
// Family<Base>, which each family header specialises.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

// Specialised by each family base:
//   static constexpr const char* word;                        // "texture"
//   static boost::shared_ptr<Base> create(std::int32_t kind);  // empty for unknown ids
template <class Base>
struct Family;

// Reads a mandatory member: its kind id, a new object of that kind put into
// `member`, then the object's record. `name` and `index` label the member in
// failure reports (`texture "color_tex"`, "BRDF layer 2"); an object with a name
// of its own (a material, a BRDF layer) shows it as far as it has been read.
template <class Base>
bool readMember(QuickArchive& ar, boost::shared_ptr<Base>& member, const char* name = nullptr,
                std::int64_t index = -1) {
    // The name a new object holds until its record's name is read; it outlives the
    // scope, whose level shows the name when it closes (to an observer).
    std::string defaultName;
    QuickArchive::Scope scope(ar, Family<Base>::word, name, index);
    if (!scope) return false;
    const auto kind = ar.get<std::int32_t>();
    boost::shared_ptr<Base> object = Family<Base>::create(kind);
    if (!object) return ar.fail(std::string("unknown ") + Family<Base>::word + " kind " + std::to_string(kind));
    if (ReadObserver* observer = ar.observer()) [[unlikely]]
        observer->selected(kind, typeid(*object));
    member = object;
    if constexpr (requires { object->name; }) {
        defaultName = object->name;
        scope.showName(object->name, defaultName);
        return object->readFromArchive(ar);
    } else {
        return object->readFromArchive(ar);
    }
}

// Reads an optional member: Bool present, then (when present) as readMember.
// An absent member leaves `member` empty.
template <class Base>
bool readOptionalMember(QuickArchive& ar, boost::shared_ptr<Base>& member, const char* name = nullptr) {
    bool present = false;
    ar.readAs("present", present);
    if (!present) {
        member.reset();
        return true;
    }
    return readMember(ar, member, name);
}

// Writes a mandatory member; an empty member cannot be written.
template <class Base>
bool writeMember(QuickArchive& ar, const boost::shared_ptr<Base>& member) {
    if (!member) return false;
    ar.write(static_cast<std::int32_t>(member->kindId()));
    return member->writeToArchive(ar);
}

template <class Base>
bool writeOptionalMember(QuickArchive& ar, const boost::shared_ptr<Base>& member) {
    ar.write(static_cast<bool>(member));
    return !member || writeMember(ar, member);
}

// Both absent, or both present and equal by the family's own comparison.
template <class Base>
bool membersEqual(const boost::shared_ptr<Base>& a, const boost::shared_ptr<Base>& b) {
    if (!a) return !b;
    return a->isEqual(b);
}

// The deep copy of a member, or an empty pointer.
template <class Base>
boost::shared_ptr<Base> cloneMember(const boost::shared_ptr<Base>& member) {
    return member ? member->clone() : boost::shared_ptr<Base>();
}

// A member in a record table (archive/Record.hpp) is optional:
// record::field<&X::texture> stores it as readOptionalMember does. A mandatory
// member is stored with an encoding of its own (record::fieldAs).
template <class Base>
struct record::Codec<boost::shared_ptr<Base>> {
    static bool read(QuickArchive& ar, boost::shared_ptr<Base>& member) { return readOptionalMember(ar, member); }
    static bool write(QuickArchive& ar, const boost::shared_ptr<Base>& member) {
        return writeOptionalMember(ar, member);
    }
    static bool equal(const boost::shared_ptr<Base>& a, const boost::shared_ptr<Base>& b) {
        return membersEqual(a, b);
    }
};

} // namespace OrvexKavorCore
