#pragma once
// What the kinds of every family share: the fixed facts of a kind, the rows that
// describe the parameters of its XML asset, the encoding of a field's value by
// its type, and the frame of an asset.
//
// A kind is described by data kept beside its class (its KindInfo, its record
// table of archive/Record.hpp, its parameter rows), and the family's kind
// template derives reading, writing, comparison, copy and XML from that data.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/platform/KavorTypes.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <cstdint>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

// The fixed facts of a kind.
struct KindInfo {
    std::int32_t kind;      // the kind id under which the family's factory creates it
    std::uint16_t version;  // the record version written; readers accept 1 to it
    const char* pluginType; // the renderer plugin ("TexChecker"); empty for a kind without XML
    const char* what;       // the kind in failure reports ("checker texture")
    // Textures: whether the members stand before the plain fields in the record.
    bool membersFirst = true;
    // Textures: whether the version word is written before the check of the
    // mandatory members (a refused write then leaves the version word behind).
    bool versionBeforeCheck = false;
    // BRDFs: whether a read keeps the kind's own fields; it then resets only the
    // name and the flags, and a field that the stored version lacks keeps its value.
    bool keepsFieldsOnRead = false;
    // Materials: whether the reset takes a fresh default name (otherwise it keeps
    // the name). A material that keepsFieldsOnRead resets nothing before a read.
    bool resetTakesName = false;
};

namespace kind {

using record::MemberTraits;
template <auto M>
using ClassOf = typename MemberTraits<decltype(M)>::Class;
template <auto M>
using TypeOf = typename MemberTraits<decltype(M)>::Type;

// The base record of the family (the object's readBaseRecord / writeBaseRecord)
// at its place in a kind's record. Never compared.
template <class Obj>
constexpr record::Field<Obj> baseRecord(record::Versions versions = record::always()) {
    return record::Field<Obj>{
        "base record",
        versions,
        [](QuickArchive& ar, Obj& o) { return o.readBaseRecord(ar); },
        [](QuickArchive& ar, Obj& o) { return o.writeBaseRecord(ar); },
        [](const Obj&, const Obj&) { return true; },
    };
}

// The encoding of a field follows its type: "color", "acolor", "vector",
// "transform", "float", "integer" (an unsigned count shows as its signed 32-bit
// value), "bool", "string".
void writeValue(AssetXmlWriter& writer, const char* name, const Color& value);
void writeValue(AssetXmlWriter& writer, const char* name, const AColor& value);
void writeValue(AssetXmlWriter& writer, const char* name, const Vector& value);
void writeValue(AssetXmlWriter& writer, const char* name, const Transform& value);
void writeValue(AssetXmlWriter& writer, const char* name, float value);
void writeValue(AssetXmlWriter& writer, const char* name, std::int32_t value);
void writeValue(AssetXmlWriter& writer, const char* name, std::uint32_t value);
void writeValue(AssetXmlWriter& writer, const char* name, bool value);
void writeValue(AssetXmlWriter& writer, const char* name, const std::string& value);
// Any other field type has no parameter encoding.
template <class T>
void writeValue(AssetXmlWriter&, const char*, const T&) = delete;

// One parameter of an object's asset, in emission order. A parameter that refers
// to a member object has the name of the member's child asset: the child is
// written first, under the object's url + "/" + child.
template <class Obj>
struct ParameterRow {
    const char* name;
    const char* child = nullptr; // nullptr: a plain value
    bool (*isSet)(const Obj& o) = nullptr;
    void (*writeChild)(AssetXmlWriter& writer, const Obj& o, const std::string& childUrl) = nullptr;
    // `url` is the child url for a reference, the object's own url otherwise.
    void (*write)(AssetXmlWriter& writer, const char* name, const Obj& o, const std::string& url) = nullptr;
    // A reference: replaces the member by its deep copy; false when a present
    // member could not be copied.
    bool (*copyChild)(Obj& o) = nullptr;
};

// The parameter `name` showing the field M.
template <auto M>
constexpr ParameterRow<ClassOf<M>> value(const char* name) {
    using Obj = ClassOf<M>;
    return {name, nullptr, nullptr, nullptr,
            [](AssetXmlWriter& w, const char* n, const Obj& o, const std::string&) { writeValue(w, n, o.*M); }};
}

// An integer field shown as a "bool": true exactly when it is not 0.
template <auto M>
constexpr ParameterRow<ClassOf<M>> flag(const char* name) {
    using Obj = ClassOf<M>;
    return {name, nullptr, nullptr, nullptr,
            [](AssetXmlWriter& w, const char* n, const Obj& o, const std::string&) { w.writeBool(n, o.*M != 0); }};
}

// The "plugin" parameter `name` referring to the member object M, whose asset is
// written under the child name `child` (an absent member gives the parameter
// without a value and no child asset).
template <auto M>
constexpr ParameterRow<ClassOf<M>> reference(const char* name, const char* child) {
    using Obj = ClassOf<M>;
    return {
        name,
        child,
        [](const Obj& o) { return static_cast<bool>(o.*M); },
        [](AssetXmlWriter& w, const Obj& o, const std::string& childUrl) { (o.*M)->writeXml(w, childUrl); },
        [](AssetXmlWriter& w, const char* n, const Obj& o, const std::string& childUrl) {
            w.writePlugin(n, o.*M, childUrl);
        },
        [](Obj& o) {
            const bool present = static_cast<bool>(o.*M);
            o.*M = cloneMember(o.*M);
            return !present || static_cast<bool>(o.*M);
        },
    };
}

// Writes the child assets of the rows that refer to present members, each under
// url + "/" + its child name.
template <class Obj, class Rows>
void writeChildAssets(AssetXmlWriter& writer, const Obj& object, const std::string& url, const Rows& rows) {
    for (const ParameterRow<Obj>& p : rows)
        if (p.child && p.isSet(object)) p.writeChild(writer, object, url + "/" + p.child);
}

// Replaces every member the rows refer to by its deep copy; false when a present
// member could not be copied.
template <class Obj, class Rows>
bool copyChildren(Obj& object, const Rows& rows) {
    for (const ParameterRow<Obj>& p : rows)
        if (p.copyChild && !p.copyChild(object)) return false;
    return true;
}

// Writes every row's parameter.
template <class Obj, class Rows>
void writeParameters(AssetXmlWriter& writer, const Obj& object, const std::string& url, const Rows& rows) {
    for (const ParameterRow<Obj>& p : rows) p.write(writer, p.name, object, p.child ? url + "/" + p.child : url);
}

// Opens an asset of the family `assetType` ("texture", "BRDF", "light",
// "material"), its plugin and its parameter list / closes them again.
void beginAsset(AssetXmlWriter& writer, std::string_view url, std::string_view assetType, std::string_view pluginType,
                std::string_view layout = {});
void endAsset(AssetXmlWriter& writer);

// The family base `Base` with what follows from the kind's KindInfo alone: its kind
// id, its plugin type, and the reset to the defaults of its class.
template <class Derived, class Base>
class Basics : public Base {
public:
    std::int32_t kindId() const override { return Derived::kInfo.kind; }
    std::string pluginType() const override { return Derived::kInfo.pluginType; }
    void resetToDefaults() override { static_cast<Derived&>(*this) = Derived(); }
};

} // namespace kind

} // namespace OrvexKavorCore
