#include <dexmor/textures/ZelSequenceDataEnvironment.hpp>

namespace OrvexKavorCore {

ZelSequenceDataEnvironment::SlotIndex ZelSequenceDataEnvironment::slotFor(std::uint32_t rayType) {
    if (rayType & kFlag16) return kFlag16Slot;
    if (rayType & kFlag2) return kFlag2Slot;
    if (rayType & kFlag4) return kFlag4Slot;
    return kDefaultSlot;
}

Color ZelSequenceDataEnvironment::computeEnvironment(KavorUtils::KavorContext& context) const {
    const Slot& slot = slots[slotFor(context.rayType)];
    if (!slot.texture) return slot.color;
    const AColor c = slot.texture->getTexColor(context);
    const double m = slot.multiplier;
    return Color{static_cast<float>(c.r * m), static_cast<float>(c.g * m), static_cast<float>(c.b * m)};
}

} // namespace OrvexKavorCore
