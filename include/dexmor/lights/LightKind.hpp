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
#include <dexmor/model/Kind.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <boost/make_shared.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

// The shared implementation of a light kind. `Derived` provides
//   static constexpr KindInfo kInfo;
//   static std::span<const record::Field<Derived>> recordFields();
//   static std::span<const kind::ParameterRow<Derived>> xmlParameters();
// and declares every stored field itself (the tables point at its members).
template <class Derived>
class LightKind : public kind::Basics<Derived, BaseLight> {
public:
    LightPtr clone() const override { return boost::make_shared<Derived>(self()); }

    // Same kind and every stored field equal, floats exactly.
    bool isEqual(const LightPtr& other) const override {
        const auto* that = dynamic_cast<const Derived*>(other.get());
        return that && record::fieldsEqual(self(), *that, Derived::recordFields());
    }

    bool writeToArchive(QuickArchive& ar) override {
        constexpr std::uint16_t version = Derived::kInfo.version;
        ar.write(VersionWord::make(0, version));
        return record::writeFields(ar, self(), Derived::recordFields(), version);
    }

    // A refused version leaves the light at its defaults.
    bool readFromArchive(QuickArchive& ar) override {
        this->resetToDefaults();
        const auto version = ar.readVersion(Derived::kInfo.version, Derived::kInfo.what);
        return version && record::readFields(ar, self(), Derived::recordFields(), version->second());
    }

    // The asset under path + "/" + plugin type. A kind without XML parameters
    // writes nothing.
    void writeXml(AssetXmlWriter& writer, std::string path) override {
        if (Derived::xmlParameters().empty()) return;
        writeAsset(writer, path + "/" + this->pluginType());
    }

protected:
    // The asset, its plugin and every XML parameter, under `url`.
    void writeAsset(AssetXmlWriter& writer, const std::string& url) const {
        kind::beginAsset(writer, url, "light", Derived::kInfo.pluginType);
        kind::writeParameters(writer, self(), url, Derived::xmlParameters());
        kind::endAsset(writer);
    }

private:
    Derived& self() { return static_cast<Derived&>(*this); }
    const Derived& self() const { return static_cast<const Derived&>(*this); }
};

} // namespace OrvexKavorCore
