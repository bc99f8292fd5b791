#pragma once
// What every light kind shares.
//
// A light kind is described by data, kept beside the kind's class:
//   - its record table: one row per stored field, in the order of the current
//     record, each row with the record versions that hold it. A record of an older
//     version is the same table filtered by that version (rows that an old version
//     stored differently, such as a plain transform in place of an animated one,
//     are rows of their own limited to those versions);
//   - its XML parameter list: one entry per parameter of its asset, in emission
//     order, with the field it shows.
// Reading, writing, comparing, copying, resetting and the XML asset follow from
// these tables here, once for all kinds:
//   record:  VersionWord (0, current version), then the fields of the table;
//   reading: reset to the defaults, accept versions (0, 1) to (0, current), read the
//            rows that version holds;
//   XML:     one asset of type "light" under the url path + "/" + plugin type, the
//            plugin named after the plugin type, the parameters in list order.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/lights/BaseLight.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <boost/make_shared.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

// The fixed facts of a light kind.
struct LightKindInfo {
    std::int32_t kind;        // the kind id under which the factory creates it
    std::uint16_t version;    // the current record version (the one written)
    const char* pluginType;   // the renderer plugin; empty for a kind without XML
    const char* what;         // the kind in failure reports ("omni light")
};

namespace lightxml {

// One parameter of a light's asset: its name and how the field is written.
template <class Light>
struct Parameter {
    const char* name;
    void (*write)(AssetXmlWriter& writer, const char* name, const Light& light);
};

// The encoding follows the field's type: colours "color", vectors "vector",
// transforms "transform", floats "float", integers and counts "integer" (a count
// above 2^31 - 1 shows as its signed 32-bit value), flags "bool", text "string".
void writeValue(AssetXmlWriter& writer, const char* name, const Color& value);
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

template <class M>
struct MemberClass;
template <class C, class T>
struct MemberClass<T C::*> {
    using type = C;
};

// The parameter `name` showing the field `Member`:
//   lightxml::param<&OmniLight::color>("color")
template <auto Member>
constexpr auto param(const char* name) {
    using Light = typename MemberClass<decltype(Member)>::type;
    return Parameter<Light>{name, [](AssetXmlWriter& writer, const char* n, const Light& light) {
                                writeValue(writer, n, light.*Member);
                            }};
}

// Opens the asset, the plugin and its parameter list / closes them again.
void beginAsset(AssetXmlWriter& writer, const std::string& url, const std::string& pluginType);
void endAsset(AssetXmlWriter& writer);

} // namespace lightxml

// Records the refusal of a light's version word; returns false.
bool refuseLightVersion(QuickArchive& ar, const char* what, VersionWord version);

// The shared implementation of a light kind. `Derived` provides
//   static constexpr LightKindInfo kInfo;
//   static std::span<const record::Field<Derived>> recordFields();
//   static std::span<const lightxml::Parameter<Derived>> xmlParameters();
// and declares every stored field itself (the tables point at its members).
template <class Derived>
class LightKind : public BaseLight {
public:
    std::int32_t kindId() const override { return Derived::kInfo.kind; }
    std::string pluginType() const override { return Derived::kInfo.pluginType; }

    LightPtr clone() const override { return boost::make_shared<Derived>(self()); }

    // Same kind and every stored field equal, floats exactly.
    bool isEqual(const LightPtr& other) const override {
        const auto* that = dynamic_cast<const Derived*>(other.get());
        return that && record::fieldsEqual(self(), *that, Derived::recordFields());
    }

    void resetToDefaults() override { self() = Derived(); }

    bool writeToArchive(QuickArchive& ar) override {
        constexpr std::uint16_t version = Derived::kInfo.version;
        ar.write(VersionWord::make(0, version));
        return record::writeFields(ar, self(), Derived::recordFields(), version);
    }

    // A refused version leaves the light at its defaults.
    bool readFromArchive(QuickArchive& ar) override {
        resetToDefaults();
        const auto version = ar.get<VersionWord>();
        if (version.first() != 0 || version.second() < 1 || version.second() > Derived::kInfo.version)
            return refuseLightVersion(ar, Derived::kInfo.what, version);
        return record::readFields(ar, self(), Derived::recordFields(), version.second());
    }

    // The asset under path + "/" + plugin type. A kind without XML parameters
    // writes nothing.
    void writeXml(AssetXmlWriter& writer, std::string path) override {
        if (Derived::xmlParameters().empty()) return;
        writeAsset(writer, path + "/" + pluginType());
    }

protected:
    // The asset, its plugin and every XML parameter, under `url`.
    void writeAsset(AssetXmlWriter& writer, const std::string& url) const {
        lightxml::beginAsset(writer, url, pluginType());
        for (const lightxml::Parameter<Derived>& p : Derived::xmlParameters()) p.write(writer, p.name, self());
        lightxml::endAsset(writer);
    }

private:
    Derived& self() { return static_cast<Derived&>(*this); }
    const Derived& self() const { return static_cast<const Derived&>(*this); }
};

} // namespace OrvexKavorCore
