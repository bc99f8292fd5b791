#include <dexmor/textures/SkyTexture.hpp>

#include <dexmor/platform/Text.hpp>
#include <dexmor/platform/Uuid.hpp>

#include <boost/make_shared.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

// The identifier is text compared ignoring the case of ASCII letters.
struct IdentifierText {
    static bool read(QuickArchive& ar, std::string& value) { return ar.readWString(value); }
    static bool write(QuickArchive& ar, const std::string& value) {
        ar.writeWString(value);
        return true;
    }
    static bool equal(const std::string& a, const std::string& b) { return text::equalsIgnoringAsciiCase(a, b); }
};

using record::between;
using record::field;
using record::since;

constexpr std::array kSkyMembers = {texture::optional<&SkyTexture::sun>("sun")};

// Versions 2 and 3 after the sun part. Version 2 stores the transform as a plain
// Transform first; version 3 stores its record after the identifier.
constexpr std::array kSkyFields = {
    record::fieldAs<record::AnimatedPlainValue, &SkyTexture::transform>("transform", between(2, 2)),
    field<&SkyTexture::up_vector>("up_vector", since(2)),
    field<&SkyTexture::shadowBias>("shadowBias", since(2)),
    field<&SkyTexture::turbidity>("turbidity", since(2)),
    field<&SkyTexture::water_vapour>("water_vapour", since(2)),
    field<&SkyTexture::intensity_multiplier>("intensity_multiplier", since(2)),
    field<&SkyTexture::size_multiplier>("size_multiplier", since(2)),
    field<&SkyTexture::photon_radius>("photon_radius", since(2)),
    field<&SkyTexture::photon_emit_distance>("photon_emit_distance", since(2)),
    field<&SkyTexture::ozone>("ozone", since(2)),
    field<&SkyTexture::photonSubdivs>("photonSubdivs", since(2)),
    field<&SkyTexture::causticSubdivs>("causticSubdivs", since(2)),
    field<&SkyTexture::shadow_subdivs>("shadow_subdivs", since(2)),
    field<&SkyTexture::flag1>("flag1", since(2)),
    field<&SkyTexture::flag2>("flag2", since(2)),
    record::fieldAs<IdentifierText, &SkyTexture::identifier>("identifier", since(2)),
    field<&SkyTexture::transform>("transform", since(3)),
};

// "sun" holds the url under which the document wrote the sun (the empty text when
// it wrote none for it).
constexpr std::array kSkyParameters = {
    kind::ParameterRow<SkyTexture>{
        "sun", nullptr, nullptr, nullptr,
        [](AssetXmlWriter& w, const char* n, const SkyTexture& sky, const std::string&) {
            std::string sunUrl;
            if (const SunLight* s = sky.sunLight()) {
                sunUrl = DocumentSunUrls::urlOf(s->identifier);
            }
            w.writePluginUrl(n, static_cast<bool>(sky.sun), sunUrl);
        }},
};

} // namespace

boost::shared_ptr<SunLight> DefaultSun::pristine() {
    return boost::make_shared<SunLight>(kDefaultSunName, kDefaultSunIdentifier);
}

boost::shared_ptr<SunLight> sharedDefaultSun() { return PerConversion<DefaultSun>::current().light; }

std::span<const texture::Member<SkyTexture>> SkyTexture::members() { return kSkyMembers; }
std::span<const record::Field<SkyTexture>> SkyTexture::fields() { return kSkyFields; }
std::span<const kind::ParameterRow<SkyTexture>> SkyTexture::parameters() { return kSkyParameters; }

SunLight* SkyTexture::sunLight() const {
    if (!sun || sun->kindId() != BaseLight::kSun) return nullptr;
    return dynamic_cast<SunLight*>(sun.get());
}

bool SkyTexture::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kInfo.version));
    // A sun that carries the default sun's identifier is the default sun: the sky
    // points at the shared one before anything is written, so that the sky's own
    // sun record and the default sun record agree and the record reads back to a
    // sky that writes the same bytes.
    const boost::shared_ptr<SunLight> defaultSun = sharedDefaultSun();
    SunLight* own = sunLight();
    const bool isDefault = own && text::equalsIgnoringAsciiCase(own->identifier, defaultSun->identifier);
    if (isDefault) {
        sun = defaultSun;
        own = defaultSun.get();
    }
    ar.write(own != nullptr);
    if (own && !own->writeToArchive(ar)) return false;
    if (!record::writeFields(ar, *this, fields(), kInfo.version)) return false;
    if (!defaultSun->writeToArchive(ar)) return false;
    ar.write(isDefault);
    return true;
}

bool SkyTexture::readFromArchive(QuickArchive& ar) {
    const auto version = startRead(ar);
    if (!version) return false;
    const unsigned v = *version;

    // The sky's own sun. Its failure is not the sky's: the record goes on after it.
    if (ar.getAs<bool>("sun present")) {
        QuickArchive::Scope scope(ar, "light", "sun");
        if (!scope) return false;
        auto own = boost::make_shared<SunLight>();
        sun = own;
        const bool hadFailure = ar.failed();
        if (!own->readFromArchive(ar) && !hadFailure) ar.clearFailure();
    }
    if (!record::readFields(ar, *this, fields(), v)) return false;
    if (v < 3) return true;

    DefaultSun& shared = PerConversion<DefaultSun>::current();
    const boost::shared_ptr<SunLight> defaultSun = shared.light;
    ++shared.writes;
    {
        QuickArchive::Scope scope(ar, "light", "default sun");
        if (!scope || !defaultSun->readFromArchive(ar)) return false;
    }
    if (ar.getAs<bool>("uses default sun")) sun = defaultSun;
    return true;
}

TexturePtr SkyTexture::clone() const {
    TexturePtr copy = TextureKind::clone();
    if (copy) static_cast<SkyTexture&>(*copy).identifier = newUuidText();
    return copy;
}

void SkyTexture::writeXml(AssetXmlWriter& writer, std::string url) {
    if (sun) sun->writeXml(writer, std::string());
    writeOwnAsset(writer, url);
}

} // namespace OrvexKavorCore
