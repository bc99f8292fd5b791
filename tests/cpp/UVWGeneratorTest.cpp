// UVW generators: the factory, record images, old record layouts, round trips and
// the XML assets.
#include "archive/QuickArchive.hpp"
#include "textures/UVWGenerators.hpp"
#include "xml/AssetXmlWriter.hpp"

#include <boost/make_shared.hpp>
#include <gtest/gtest.h>

#include <bit>
#include <climits>
#include <cstdint>
#include <functional>
#include <random>
#include <string>
#include <vector>

using namespace OrvexKavorCore;

namespace {

using ByteVector = std::vector<std::uint8_t>;

// Little-endian byte images assembled by hand.
struct Image {
    ByteVector bytes;
    Image& u32(std::uint32_t v) {
        for (int i = 0; i < 4; ++i) bytes.push_back(static_cast<std::uint8_t>(v >> (8 * i)));
        return *this;
    }
    Image& i32(std::int32_t v) { return u32(static_cast<std::uint32_t>(v)); }
    Image& version(std::uint16_t a, std::uint16_t b) { return u32(a | (std::uint32_t{b} << 16)); }
    Image& f32(std::initializer_list<float> vs) {
        for (float v : vs) u32(std::bit_cast<std::uint32_t>(v));
        return *this;
    }
    Image& identityMatrix() { return f32({1, 0, 0, 0, 1, 0, 0, 0, 1}); }
    Image& identityTransform() { return identityMatrix().f32({0, 0, 0}); }
    Image& defaultComponents() { return version(0, 1).f32({0, 0, 0, 1, 1, 1, 0, 0, 0}).i32(0).i32(0).i32(0); }
};

ByteVector recordOf(BaseUVW& uvw) {
    QuickArchive ar;
    EXPECT_TRUE(uvw.writeToArchive(ar));
    ByteVector out(ar.writePosition());
    ar.getRaw(out.data(), out.size());
    return out;
}

// Reads a record into `uvw`; an accepted record must be consumed exactly.
bool readInto(BaseUVW& uvw, const ByteVector& bytes, QuickArchive* keep = nullptr) {
    QuickArchive ar(bytes.data(), bytes.size());
    const bool ok = uvw.readFromArchive(ar);
    if (ok) {
        EXPECT_EQ(ar.readPosition(), bytes.size());
    }
    if (keep) *keep = ar;
    return ok;
}

std::string xmlOf(BaseUVW& uvw) {
    std::string out;
    AssetXmlWriter writer(out);
    uvw.writeXml(writer, "/Oak/uvwgen");
    EXPECT_EQ(writer.depth(), 0u);
    return out;
}

// Every field of a generator set to random (finite) values.
void randomise(BaseUVW& uvw, std::mt19937& rng) {
    auto real = [&] { return std::uniform_real_distribution<float>(-1000.0f, 1000.0f)(rng); };
    auto integer = [&] { return std::uniform_int_distribution<std::int32_t>(INT_MIN, INT_MAX)(rng); };
    auto matrix = [&] {
        return Matrix{{{real(), real(), real()}, {real(), real(), real()}, {real(), real(), real()}}};
    };
    auto transform = [&] { return Transform{matrix(), Vector{real(), real(), real()}}; };
    auto components = [&] {
        TransformComponents c;
        for (float* f : {&c.x_rotation, &c.y_rotation, &c.z_rotation, &c.x_scale, &c.y_scale, &c.z_scale, &c.x_offset,
                         &c.y_offset, &c.z_offset})
            *f = real();
        for (std::int32_t* m : {&c.x_mirror, &c.y_mirror, &c.z_mirror}) *m = integer();
        return c;
    };
    if (auto* p = dynamic_cast<GenProjectionUVW*>(&uvw)) {
        p->uvwTransform = transform();
        p->uvwComponents = components();
    } else if (auto* e = dynamic_cast<GenEnvironmentUVW*>(&uvw)) {
        e->mappingType = integer();
        e->uvwMatrix = matrix();
        e->uvwComponents = components();
    } else if (auto* c = dynamic_cast<GenChannelUVW*>(&uvw)) {
        c->uvwTransform = transform();
        c->texTransform = transform();
        c->uvwComponents = components();
        c->texComponents = components();
        c->wrap_u = integer();
        c->wrap_v = integer();
        c->uvw_channel = integer();
    }
}

const std::int32_t kKinds[] = {BaseUVW::kPlanarWorld, BaseUVW::kObject, BaseUVW::kEnvironment, BaseUVW::kChannel};

} // namespace

TEST(UVWGenerator, FactoryKnowsFourKindsAndNoOthers) {
    const std::pair<std::int32_t, const char*> known[] = {
        {0, "UVWGenPlanarWorld"}, {1, "UVWGenObject"}, {3, "UVWGenEnvironment"}, {4, "UVWGenChannel"}};
    for (const auto& [kind, plugin] : known) {
        const UVWPtr uvw = createUVW(kind);
        ASSERT_TRUE(uvw) << kind;
        EXPECT_EQ(uvw->kindId(), kind);
        EXPECT_EQ(uvw->pluginType(), plugin);
        EXPECT_EQ(uvw->assetType(), "uvw");
    }
    for (std::int32_t kind : {2, -1, 5, INT_MIN}) EXPECT_FALSE(createUVW(kind)) << kind;

    // So a member record naming kind 2 is refused.
    const ByteVector member = Image{}.i32(2).bytes;
    QuickArchive ar(member.data(), member.size());
    UVWPtr uvw;
    EXPECT_FALSE(readMember(ar, uvw, "uvwgen"));
    ASSERT_TRUE(ar.failure());
    EXPECT_NE(ar.failure()->reason.find("kind 2"), std::string::npos) << ar.failure()->describe();
}

TEST(UVWGenerator, DefaultRecords) {
    GenChannelUVW channel;
    const Image twoTransforms = Image{}.version(0, 2).identityTransform().identityTransform();
    EXPECT_EQ(recordOf(channel),
              Image(twoTransforms).i32(0).i32(0).i32(1).defaultComponents().defaultComponents().bytes);
    GenEnvironmentUVW environment;
    EXPECT_EQ(recordOf(environment), Image{}.version(0, 2).identityMatrix().i32(2).defaultComponents().bytes);
    GenObjectUVW object;
    EXPECT_EQ(recordOf(object), Image{}.version(0, 1).identityTransform().defaultComponents().bytes);
}

TEST(UVWGenerator, RandomRoundTripsAndClones) {
    std::mt19937 rng(20240611);
    for (std::int32_t kind : kKinds) {
        for (int round = 0; round < 20; ++round) {
            const UVWPtr original = createUVW(kind);
            randomise(*original, rng);
            const ByteVector bytes = recordOf(*original);

            const UVWPtr copy = createUVW(kind);
            ASSERT_TRUE(readInto(*copy, bytes)) << kind;
            EXPECT_TRUE(copy->isEqual(original)) << kind;
            EXPECT_EQ(recordOf(*copy), bytes) << kind;

            const UVWPtr clone = original->clone();
            ASSERT_NE(clone, original);
            EXPECT_TRUE(clone->isEqual(original)) << kind;
            EXPECT_EQ(recordOf(*clone), bytes) << kind;
        }
    }
}

TEST(UVWGenerator, ComparisonSeesEveryFieldAndTheKind) {
    const std::function<void(GenChannelUVW&)> changes[] = {
        [](GenChannelUVW& c) { c.uvwTransform.offs.x = 1; },
        [](GenChannelUVW& c) { c.texTransform.m[0].z = 1; },
        [](GenChannelUVW& c) { c.uvwComponents.z_mirror = 1; },
        [](GenChannelUVW& c) { c.texComponents.y_scale = 2; },
        [](GenChannelUVW& c) { c.wrap_u = 1; },
        [](GenChannelUVW& c) { c.wrap_v = 1; },
        [](GenChannelUVW& c) { c.uvw_channel = 2; },
    };
    const auto channel = boost::make_shared<GenChannelUVW>();
    for (const auto& change : changes) {
        auto other = boost::make_shared<GenChannelUVW>();
        change(*other);
        EXPECT_FALSE(channel->isEqual(other));
    }
    auto environment = boost::make_shared<GenEnvironmentUVW>();
    environment->mappingType = 3;
    EXPECT_FALSE(environment->isEqual(createUVW(BaseUVW::kEnvironment)));

    // The two projection kinds hold the same fields but are different kinds.
    const UVWPtr planar = createUVW(BaseUVW::kPlanarWorld);
    EXPECT_FALSE(planar->isEqual(createUVW(BaseUVW::kObject)));
    EXPECT_FALSE(createUVW(BaseUVW::kObject)->isEqual(planar));
    EXPECT_FALSE(planar->isEqual(UVWPtr()));
}

TEST(UVWGenerator, EnvironmentVersion1SetsTwoRotationsAndTwoMirrors) {
    // Matrix, mapping type, z rotation, x rotation, z mirror, x mirror.
    const ByteVector v1 =
        Image{}.version(0, 1).f32({2, 0, 0, 0, 3, 0, 0, 0, 4}).i32(3).f32({45, 30}).i32(1).i32(1).bytes;
    GenEnvironmentUVW read;
    ASSERT_TRUE(readInto(read, v1));
    EXPECT_EQ(read.mappingType, 3);

    // Written back: version 2, the whole components record with the other fields at their defaults.
    const Image header = Image{}.version(0, 2).f32({2, 0, 0, 0, 3, 0, 0, 0, 4}).i32(3);
    EXPECT_EQ(recordOf(read),
              Image(header).version(0, 1).f32({30, 0, 45, 1, 1, 1, 0, 0, 0}).i32(1).i32(0).i32(1).bytes);
}

TEST(UVWGenerator, ChannelVersion1SetsTwoTextureRotationsAndTwoMirrors) {
    // Two transforms, tex x and y rotation, tex x and y mirror, wrap_u, wrap_v, uvw_channel.
    const Image transforms =
        Image{}.version(0, 1).f32({1, 0, 0, 0, 1, 0, 0, 0, 1, 5, 6, 7}).f32({2, 0, 0, 0, 2, 0, 0, 0, 2, 0, 0, 0});
    const ByteVector v1 = Image(transforms).f32({10, 20}).i32(1).i32(0).i32(1).i32(2).i32(3).bytes;
    GenChannelUVW read;
    ASSERT_TRUE(readInto(read, v1));

    auto expected = boost::make_shared<GenChannelUVW>();
    expected->uvwTransform = Transform{Matrix::identity(), Vector{5, 6, 7}};
    expected->texTransform = Transform{Matrix{{{2, 0, 0}, {0, 2, 0}, {0, 0, 2}}}, Vector{}};
    expected->texComponents.x_rotation = 10;
    expected->texComponents.y_rotation = 20;
    expected->texComponents.x_mirror = 1;
    expected->wrap_u = 1;
    expected->wrap_v = 2;
    expected->uvw_channel = 3;
    EXPECT_TRUE(read.isEqual(expected));

    // Written back as version 2, which reads to the same generator.
    const ByteVector v2 = recordOf(read);
    EXPECT_EQ(ByteVector(v2.begin(), v2.begin() + 4), (ByteVector{0, 0, 2, 0}));
    GenChannelUVW again;
    ASSERT_TRUE(readInto(again, v2));
    EXPECT_TRUE(again.isEqual(expected));
}

TEST(UVWGenerator, RefusedVersionsFailAndOnlyTheObjectGeneratorResets) {
    std::mt19937 rng(5);
    for (std::int32_t kind : kKinds) {
        const std::uint16_t newest = recordOf(*createUVW(kind))[2];
        const std::pair<std::uint8_t, std::uint16_t> refused[] = {{0, 0}, {0, newest + 1}, {1, 1}, {1, newest}};
        for (const auto& [a, b] : refused) {
            const UVWPtr uvw = createUVW(kind);
            randomise(*uvw, rng);
            const UVWPtr before = uvw->clone();
            ByteVector bytes = recordOf(*createUVW(kind));
            bytes[0] = a;
            bytes[2] = static_cast<std::uint8_t>(b);
            QuickArchive ar;
            EXPECT_FALSE(readInto(*uvw, bytes, &ar)) << kind << " " << int{a} << "." << b;
            ASSERT_TRUE(ar.failure());
            EXPECT_NE(ar.failure()->reason.find("version"), std::string::npos) << ar.failure()->reason;
            EXPECT_TRUE(uvw->isEqual(kind == BaseUVW::kObject ? createUVW(kind) : before)) << kind;
        }
    }
    // A refused components record inside an accepted generator record fails it too.
    ByteVector bytes = recordOf(*createUVW(BaseUVW::kChannel));
    bytes[4 + 48 + 48 + 12 + 2] = 9;
    GenChannelUVW channel;
    EXPECT_FALSE(readInto(channel, bytes));
}

// --- XML ---

namespace {

// The asset frame of a generator around its parameter lines.
std::string asset(const char* plugin, const std::string& parameters) {
    return std::string("  <Asset layout=\"\" renderer=\"kavor\" type=\"uvw\" url=\"/Oak/uvwgen\" >\n"
                       "    <plugin>\n      <kavorplugin name=\"") +
           plugin + "\" type=\"uvw\">\n        <parameters>\n" + parameters +
           "        </parameters>\n      </kavorplugin>\n    </plugin>\n  </Asset>\n";
}

std::string defaultComponents(const char* name, const char* type) {
    return std::string("          <parameter type=\"") + type + "\" name=\"" + name + "\" listType=\"none\" label=\"" +
           name + R"(">
            <value>
              <x_rotation>0</x_rotation>
              <y_rotation>0</y_rotation>
              <z_rotation>0</z_rotation>
              <x_scale>1</x_scale>
              <y_scale>1</y_scale>
              <z_scale>1</z_scale>
              <x_offset>0</x_offset>
              <y_offset>0</y_offset>
              <z_offset>0</z_offset>
              <x_mirror>0</x_mirror>
              <y_mirror>0</y_mirror>
              <z_mirror>0</z_mirror>
            </value>
          </parameter>
)";
}

std::string mappingType(const char* name) {
    return std::string("          <parameter type=\"string\" name=\"mapping_type\" listType=\"none\" "
                       "label=\"mapping_type\">\n            <value>") +
           name + "</value>\n          </parameter>\n";
}

} // namespace

TEST(UVWGeneratorXml, ProjectionKinds) {
    GenPlanarWorldUVW planar;
    EXPECT_EQ(xmlOf(planar), asset("UVWGenPlanarWorld", defaultComponents("uvw_transform", "componentTransform")));
    GenObjectUVW object;
    object.uvwTransform = Transform::zero();
    EXPECT_EQ(xmlOf(object), asset("UVWGenObject", defaultComponents("uvw_transform", "componentTransform")));
    EXPECT_TRUE(object.uvwTransform == Transform::identity()); // rebuilt from the components
}

TEST(UVWGeneratorXml, EnvironmentMappingNames) {
    const std::pair<std::int32_t, const char*> cases[] = {
        {0, "angular"}, {1, "cubic"}, {2, "spherical"}, {3, "mirror_ball"}, {4, ""}, {-1, ""}, {INT_MIN, ""}};
    for (const auto& [type, name] : cases) {
        GenEnvironmentUVW environment;
        environment.mappingType = type;
        environment.uvwMatrix = Matrix::zero();
        EXPECT_EQ(xmlOf(environment),
                  asset("UVWGenEnvironment", defaultComponents("uvw_matrix", "componentMatrix") + mappingType(name)))
            << type;
        EXPECT_TRUE(environment.uvwMatrix == Matrix::identity()); // rebuilt from the components
    }
    GenEnvironmentUVW byDefault;
    EXPECT_NE(xmlOf(byDefault).find(mappingType("spherical")), std::string::npos);
}

TEST(UVWGeneratorXml, ChannelTexTransformComesFromItsComponents) {
    GenChannelUVW channel;
    channel.texTransform = Transform{Matrix{{{7, 7, 7}, {7, 7, 7}, {7, 7, 7}}}, Vector{7, 7, 7}};
    channel.texComponents.x_rotation = 90;
    channel.texComponents.z_offset = 2.5f;
    channel.wrap_u = 1;
    channel.uvw_channel = 3;
    // The rotation about x by 90 degrees; cos of the 32-bit angle is -4.37114e-08.
    const std::string parameters =
        R"(          <parameter type="transform" name="tex_transform" listType="none" label="tex_transform">
            <value>
              <vector>
                <x>1</x>
                <y>0</y>
                <z>0</z>
              </vector>
              <vector>
                <x>0</x>
                <y>-4.37114e-008</y>
                <z>1</z>
              </vector>
              <vector>
                <x>0</x>
                <y>-1</y>
                <z>-4.37114e-008</z>
              </vector>
              <vector>
                <x>0</x>
                <y>0</y>
                <z>2.5</z>
              </vector>
            </value>
          </parameter>
          <parameter type="integer" name="wrap_u" listType="none" label="wrap_u">
            <value>1</value>
          </parameter>
          <parameter type="integer" name="wrap_v" listType="none" label="wrap_v">
            <value>0</value>
          </parameter>
          <parameter type="integer" name="uvw_channel" listType="none" label="uvw_channel">
            <value>3</value>
          </parameter>
)";
    EXPECT_EQ(xmlOf(channel),
              asset("UVWGenChannel", defaultComponents("uvw_transform", "componentTransform") + parameters));
}
