#include <dexmor/brdfs/Base_BRDF.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/brdfs/BRDFs.hpp>

#include <boost/make_shared.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

constexpr std::uint16_t kBaseRecordVersion = 4;

constexpr std::array kBaseFields = {
    record::field<&Base_BRDF::name>("name"),
    record::field<&Base_BRDF::flag1>("flag1", record::since(2)),
    record::field<&Base_BRDF::flag2>("flag2", record::since(3)),
    record::field<&Base_BRDF::flag3>("flag3", record::since(4)),
};

} // namespace

void Base_BRDF::resetBase() {
    name = pluginType();
    flag1 = true;
    flag2 = false;
    flag3 = false;
}

bool Base_BRDF::writeBaseRecord(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kBaseRecordVersion));
    return record::writeFields(ar, *this, kBaseFields, kBaseRecordVersion);
}

bool Base_BRDF::readBaseRecord(QuickArchive& ar) {
    resetBase();
    const auto version = ar.readVersion(kBaseRecordVersion, "BRDF base record");
    return version && record::readFields(ar, *this, kBaseFields, version->second());
}

bool Base_BRDF::writeToArchive(QuickArchive& ar) { return writeBaseRecord(ar); }

bool Base_BRDF::readFromArchive(QuickArchive& ar) { return readBaseRecord(ar); }

BRDFPtr createBRDF(std::int32_t kind) {
    switch (kind) {
    case Base_BRDF::kGlass:
        return boost::make_shared<Glass_BRDF>();
    case Base_BRDF::kDiffuse:
        return boost::make_shared<Diffuse_BRDF>();
    case Base_BRDF::kBlinn:
        return boost::make_shared<Blinn_BRDF>();
    case Base_BRDF::kPhong:
        return boost::make_shared<Phong_BRDF>();
    case Base_BRDF::kMirror:
        return boost::make_shared<Mirror_BRDF>();
    case Base_BRDF::kLight:
        return boost::make_shared<Light_BRDF>();
    default:
        return {};
    }
}

} // namespace OrvexKavorCore
