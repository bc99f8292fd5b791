#pragma once
// The environment a ray sees: four slots, one chosen by the kind of the ray.
//
// The renderer host fills the slots and calls computeEnvironment while shading;
// nothing in this library calls it. A slot's texture, when there is one, wins over
// its constant colour and is scaled by the slot's multiplier.
#include <dexmor/platform/KavorContext.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <array>
#include <cstddef>
#include <cstdint>

namespace OrvexKavorCore {

class ZelSequenceDataEnvironment {
public:
    struct Slot {
        Color color;
        // Not owned; the host keeps the texture alive while the slot refers to it.
        const KavorUtils::KavorTextureInterface* texture = nullptr;
        float multiplier = 1.0f;
    };

    // The slots in declaration order, and the ray-type bit that selects each of
    // the last three; a ray with none of those bits uses the default slot.
    enum SlotIndex : std::size_t { kDefaultSlot = 0, kFlag16Slot = 1, kFlag2Slot = 2, kFlag4Slot = 3 };
    static constexpr std::uint32_t kFlag16 = 16;
    static constexpr std::uint32_t kFlag2 = 2;
    static constexpr std::uint32_t kFlag4 = 4;

    std::array<Slot, 4> slots{};

    virtual ~ZelSequenceDataEnvironment() = default;

    // The slot for a ray-type flag word: bit 16 first, then bit 2, then bit 4.
    static SlotIndex slotFor(std::uint32_t rayType);

    // The environment colour of the ray: the chosen slot's texture colour times its
    // multiplier (computed in double precision, alpha dropped), or the slot's
    // colour when it has no texture.
    virtual Color computeEnvironment(KavorUtils::KavorContext& context) const;
};

} // namespace OrvexKavorCore
