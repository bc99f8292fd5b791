// The environment colour lookup: which slot a ray uses and what the slot gives.
#include <dexmor/textures/ZelSequenceDataEnvironment.hpp>

#include <gtest/gtest.h>

#include <cstdint>

using namespace OrvexKavorCore;
using KavorUtils::KavorContext;

namespace {

// A renderer texture with one colour that remembers the ray it was asked for.
class FixedTexture final : public KavorUtils::KavorTextureInterface {
public:
    explicit FixedTexture(AColor c) : color(c) {}
    AColor getTexColor(KavorContext& context) const override {
        askedFor = context.rayType;
        return color;
    }
    AColor color;
    mutable std::uint32_t askedFor = 0xFFFFFFFF;
};

// Four slots told apart by their colours.
ZelSequenceDataEnvironment fourColours() {
    ZelSequenceDataEnvironment environment;
    const float grey[] = {0, 16, 2, 4};
    for (int slot = 0; slot < 4; ++slot) environment.slots[slot].color = Color{grey[slot], grey[slot], grey[slot]};
    return environment;
}

} // namespace

TEST(Environment, SlotChoiceByRayFlags) {
    const ZelSequenceDataEnvironment environment = fourColours();
    const std::pair<std::uint32_t, float> cases[] = {
        {0, 0},   {1, 0},  {8, 0},       {32, 0}, // no selecting bit: the default slot
        {16, 16}, {2, 2},  {4, 4},                //
        {16 | 2, 16}, {16 | 4, 16}, {2 | 4, 2}, {16 | 2 | 4 | 1, 16}, {0xFFFFFFFF, 16}, {4 | 8, 4},
    };
    for (const auto& [flags, expected] : cases) {
        KavorContext context{flags};
        EXPECT_EQ(environment.computeEnvironment(context), (Color{expected, expected, expected})) << flags;
    }
}

TEST(Environment, TextureTimesMultiplierOverridesTheColour) {
    ZelSequenceDataEnvironment environment = fourColours();
    FixedTexture grey(AColor{0.5f, 0.25f, 0.125f, 1});
    environment.slots[ZelSequenceDataEnvironment::kFlag2Slot].texture = &grey;
    environment.slots[ZelSequenceDataEnvironment::kFlag2Slot].multiplier = 2;

    KavorContext reflected{2};
    EXPECT_EQ(environment.computeEnvironment(reflected), (Color{1, 0.5f, 0.25f}));
    EXPECT_EQ(grey.askedFor, 2u);
    // The product is formed in double precision before it is rounded.
    environment.slots[ZelSequenceDataEnvironment::kFlag2Slot].multiplier = 3;
    grey.color = AColor{0.1f, 0.7f, 1e30f, 0};
    EXPECT_EQ(environment.computeEnvironment(reflected),
              (Color{static_cast<float>(0.1f * 3.0), static_cast<float>(0.7f * 3.0), static_cast<float>(1e30f * 3.0)}));

    // A slot without a texture gives its colour whatever the multiplier.
    environment.slots[ZelSequenceDataEnvironment::kDefaultSlot].multiplier = 100;
    KavorContext camera{0};
    EXPECT_EQ(environment.computeEnvironment(camera), (Color{0, 0, 0}));
}
