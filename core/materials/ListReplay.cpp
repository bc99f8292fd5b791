#include <dexmor/materials/ListReplay.hpp>

#include <dexmor/lights/SunLight.hpp>
#include <dexmor/textures/SkyTexture.hpp>

namespace OrvexKavorCore::replay {

void readAgain(const ReplayedList& replayed, const std::function<bool(QuickArchive&, std::uint32_t)>& readItem) {
    if (!replayed) return;
    QuickArchive& ar = *replayed.archive;
    const std::uint64_t resume = ar.readPosition();
    DefaultSun& sun = PerConversion<DefaultSun>::current();
    const SunLight sunAfterReading = *sun.light;
    const unsigned long writesAfterReading = sun.writes;
    ar.seekRead(replayed.position);
    for (std::uint32_t i = 0; i < replayed.count; ++i) {
        // The items read before, from the same bytes: reading them again cannot fail.
        const bool read = readItem(ar, i);
        *sun.light = sunAfterReading;
        sun.writes = writesAfterReading;
        if (!read) break;
    }
    ar.seekRead(resume);
}

} // namespace OrvexKavorCore::replay
