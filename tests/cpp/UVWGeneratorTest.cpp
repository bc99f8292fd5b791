// UVW generators: the factory, record images, old record layouts, round trips,
// comparison and the XML assets.
#include "TrimSupport.hpp"

#include <dexmor/textures/UVWGenerators.hpp>

using namespace OrvexKavorCore;
using namespace testsupport;

namespace {

Image& defaultComponents(Image& image) {
    return image.version(0, 1).f32({0, 0, 0, 1, 1, 1, 0, 0, 0}).i32(0).i32(0).i32(0);
}

// A generator of `kind` read from its default record with every word that can take
// random bits replaced by them: all its fields are 32-bit numbers, and only a
// changed version word makes the record unreadable.
UVWPtr randomised(std::int32_t kind, std::mt19937& rng) {
    ByteVector bytes = recordOf(*createUVW(kind));
    std::size_t kept = 0;
    for (std::size_t at = 0; at < bytes.size(); at += 4) {
        const ByteVector changed = withWord(bytes, at, randomWord(rng));
        QuickArchive ar(changed.data(), changed.size());
        if (createUVW(kind)->readFromArchive(ar) && ar.readPosition() == changed.size()) bytes = changed, ++kept;
    }
    EXPECT_EQ(kept + (kind == BaseUVW::kChannel ? 3 : 2), bytes.size() / 4); // all but the version words
    const UVWPtr uvw = createUVW(kind);
    EXPECT_TRUE(readInto(*uvw, bytes));
    EXPECT_EQ(recordOf(*uvw), bytes);
    return uvw;
}

const std::int32_t kKinds[] = {BaseUVW::kPlanarWorld, BaseUVW::kObject, BaseUVW::kEnvironment, BaseUVW::kChannel};

} // namespace

TEST(UVWGenerator, FactoryKnowsFourKindsAndNoOthers) {
    for (std::int32_t kind : kKinds) EXPECT_EQ(createUVW(kind)->kindId(), kind);
    for (std::int32_t kind : {2, -1, 5, INT_MIN}) EXPECT_FALSE(createUVW(kind)) << kind;
}

TEST(UVWGenerator, DefaultRecords) {
    GenChannelUVW channel;
    Image expected = Image{}.version(0, 2).identityTransform().identityTransform().i32(0).i32(0).i32(1);
    EXPECT_EQ(recordOf(channel), defaultComponents(defaultComponents(expected)).bytes);
    GenEnvironmentUVW environment;
    expected = Image{}.version(0, 2).f32({1, 0, 0, 0, 1, 0, 0, 0, 1}).i32(2);
    EXPECT_EQ(recordOf(environment), defaultComponents(expected).bytes);
    GenObjectUVW object;
    expected = Image{}.version(0, 1).identityTransform();
    EXPECT_EQ(recordOf(object), defaultComponents(expected).bytes);
}

// Random generators write, read back and copy to equal ones with the same bytes;
// every stored byte takes part in comparison, and so does the kind.
TEST(UVWGenerator, RandomRoundTripsClonesAndComparison) {
    std::mt19937 rng(20240611);
    for (std::int32_t kind : kKinds) {
        for (int round = 0; round < 20; ++round) {
            const UVWPtr original = randomised(kind, rng);
            const ByteVector bytes = expectRoundTrip(original, [&] { return createUVW(kind); });
            if (round == 0) {
                EXPECT_GE(expectEveryStoredByteCompared(original, bytes, [&] { return createUVW(kind); }) + 16,
                          bytes.size());
            }
        }
    }
    // The two projection kinds hold the same fields but are different kinds.
    const UVWPtr planar = createUVW(BaseUVW::kPlanarWorld);
    EXPECT_FALSE(planar->isEqual(createUVW(BaseUVW::kObject)));
    EXPECT_FALSE(createUVW(BaseUVW::kObject)->isEqual(planar));
    EXPECT_FALSE(planar->isEqual(UVWPtr()));
}

TEST(UVWGenerator, Version1RecordsSetSomeComponents) {
    // Environment: matrix, mapping type, z rotation, x rotation, z mirror, x mirror.
    const ByteVector environmentV1 =
        Image{}.version(0, 1).f32({2, 0, 0, 0, 3, 0, 0, 0, 4}).i32(3).f32({45, 30}).i32(1).i32(1).bytes;
    GenEnvironmentUVW environment;
    ASSERT_TRUE(readInto(environment, environmentV1));
    EXPECT_EQ(environment.mappingType, 3);
    // Written back: version 2, the whole components record with the other fields at their defaults.
    EXPECT_EQ(recordOf(environment), Image{}.version(0, 2).f32({2, 0, 0, 0, 3, 0, 0, 0, 4}).i32(3).version(0, 1)
                                         .f32({30, 0, 45, 1, 1, 1, 0, 0, 0}).i32(1).i32(0).i32(1).bytes);

    // Channel: two transforms, tex x and y rotation, tex x and y mirror, wrap_u, wrap_v, uvw_channel.
    const ByteVector channelV1 = Image{}.version(0, 1).f32({1, 0, 0, 0, 1, 0, 0, 0, 1, 5, 6, 7})
                                     .f32({2, 0, 0, 0, 2, 0, 0, 0, 2, 0, 0, 0}).f32({10, 20}).i32(1).i32(0)
                                     .i32(1).i32(2).i32(3).bytes;
    auto channel = boost::make_shared<GenChannelUVW>();
    ASSERT_TRUE(readInto(*channel, channelV1));
    auto expected = boost::make_shared<GenChannelUVW>();
    expected->uvwTransform = Transform{Matrix::identity(), Vector{5, 6, 7}};
    expected->texTransform = Transform{Matrix{{{2, 0, 0}, {0, 2, 0}, {0, 0, 2}}}, Vector{}};
    expected->texComponents.x_rotation = 10, expected->texComponents.y_rotation = 20;
    expected->texComponents.x_mirror = 1, expected->wrap_u = 1, expected->wrap_v = 2, expected->uvw_channel = 3;
    EXPECT_TRUE(channel->isEqual(expected));
    // Written back as version 2, which reads to the same generator.
    EXPECT_EQ(expectRoundTrip(channel, [] { return boost::make_shared<GenChannelUVW>(); })[2], 2);
}

TEST(UVWGenerator, RefusedVersionsFailAndOnlyTheObjectGeneratorResets) {
    std::mt19937 rng(5);
    for (std::int32_t kind : kKinds) {
        const std::uint16_t newest = recordOf(*createUVW(kind))[2];
        const std::pair<std::uint16_t, std::uint16_t> refused[] = {
            {0, 0}, {0, std::uint16_t(newest + 1)}, {1, 1}, {1, newest}};
        for (const auto& [a, b] : refused) {
            const UVWPtr uvw = randomised(kind, rng);
            const UVWPtr before = uvw->clone();
            expectReadFails(*uvw, withVersion(recordOf(*createUVW(kind)), a, b), "version");
            EXPECT_TRUE(uvw->isEqual(kind == BaseUVW::kObject ? createUVW(kind) : before)) << kind;
        }
    }
    // A refused components record inside an accepted generator record fails it too.
    GenChannelUVW channel;
    EXPECT_FALSE(readInto(channel, withVersion(recordOf(channel), 0, 9, 4 + 48 + 48 + 12)));
}

// --- XML ---

// The projection kinds and the environment rebuild their transform or matrix from
// the components; the environment's mapping type outside 0..3 gives an empty name.
TEST(UVWGeneratorXml, AssetsRebuiltFromTheComponents) {
    GenPlanarWorldUVW planar;
    GenObjectUVW object;
    object.uvwTransform = Transform::zero();
    expectGolden(xmlOf(planar, "/Oak/uvwgen") + xmlOf(object, "/Oak/uvwgen"), "uvw_projection.xml");
    EXPECT_TRUE(object.uvwTransform == Transform::identity());

    std::string mappings;
    for (const std::int32_t type : {0, 1, 2, 3, 4, -1, INT_MIN}) {
        GenEnvironmentUVW environment;
        environment.mappingType = type;
        environment.uvwMatrix = Matrix::zero();
        mappings += xmlOf(environment, "/e");
        EXPECT_TRUE(environment.uvwMatrix == Matrix::identity()) << type;
    }
    GenEnvironmentUVW byDefault; // spherical
    expectGolden(mappings + xmlOf(byDefault, "/e"), "uvw_environment_mapping_types.xml");

    // The rotation about x by 90 degrees; cos of the 32-bit angle is -4.37114e-08.
    GenChannelUVW channel;
    channel.texTransform = Transform{Matrix{{{7, 7, 7}, {7, 7, 7}, {7, 7, 7}}}, Vector{7, 7, 7}};
    channel.texComponents.x_rotation = 90, channel.texComponents.z_offset = 2.5f;
    channel.wrap_u = 1, channel.uvw_channel = 3;
    expectGolden(xmlOf(channel, "/c"), "uvw_channel.xml");
}
