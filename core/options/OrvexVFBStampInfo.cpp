#include <dexmor/options/OrvexVFBStampInfo.hpp>

#include <dexmor/archive/QuickArchive.hpp>

namespace OrvexKavorCore {

bool OrvexVFBStampInfo::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kVersion));
    ar.write(si_i1);
    ar.write(si_i2);
    ar.write(si_i3);
    ar.writeWString(text);
    ar.writeBytes(si_block.data(), static_cast<std::uint32_t>(si_block.size()));
    return true;
}

bool OrvexVFBStampInfo::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    const auto version = ar.get<VersionWord>();
    if (!ar.checkVersion(version, kVersion, "stamp info")) return false;
    ar.readAs("si_i1", si_i1);
    ar.readAs("si_i2", si_i2);
    ar.readAs("si_i3", si_i3);
    // The stored text replaces the default, also when it is empty.
    if (!ar.readWStringAs("text", text)) return false;
    const auto label = QuickArchive::Scope::label(ar, "si_block");
    if (version.second() == 1) {
        ar.getRaw(si_block.data(), si_block.size());
        return true;
    }
    return ar.readBytes(si_block.data(), static_cast<std::uint32_t>(si_block.size()), false).has_value();
}

void OrvexVFBStampInfo::resetToDefaults() {
    static_cast<KavorUtils::KavorVFBStampInfo&>(*this) = KavorUtils::KavorVFBStampInfo{};
}

} // namespace OrvexKavorCore
