#include "BenchCorpus.hpp"

#include "SampleBuilders.hpp"

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/textures/UVWGenerators.hpp>

#include <array>
#include <cmath>
#include <random>
#include <sstream>
#include <string_view>
#include <vector>

namespace OrvexKavorCore::bench {

using namespace samples;

namespace {

// Choices drawn from the 32-bit Mersenne twister's raw output, which the standard
// fixes bit for bit (its distributions it does not).
class Choices {
public:
    explicit Choices(std::uint32_t seed) : random_(seed) {}

    // 0 <= result < n.
    std::size_t below(std::size_t n) { return static_cast<std::size_t>(random_() % n); }
    bool chance(double p) { return unit() < p; }
    // 0 <= result < 1, 24 bits.
    float unit() { return static_cast<float>(random_() >> 8) * (1.0f / 16777216.0f); }
    // Half the values as a user types them (steps of 0.05), half as arithmetic
    // leaves them (every digit used).
    float between(float low, float high) {
        const float value = low + unit() * (high - low);
        return chance(0.5) ? std::round(value * 20.0f) / 20.0f : value;
    }
    Color color() { return {between(0, 1), between(0, 1), between(0, 1)}; }
    template <class T, std::size_t N>
    const T& pick(const std::array<T, N>& items) {
        return items[below(N)];
    }
    // An index drawn by the weights.
    template <std::size_t N>
    std::size_t weighted(const std::array<int, N>& weights) {
        int total = 0;
        for (int w : weights) total += w;
        int left = static_cast<int>(below(static_cast<std::size_t>(total)));
        for (std::size_t i = 0; i < N; ++i) {
            if (left < weights[i]) return i;
            left -= weights[i];
        }
        return N - 1;
    }

private:
    std::mt19937 random_;
};

// Words for names and file paths. Some hold letters beyond ASCII, as users' do.
constexpr std::array<std::string_view, 24> kSurfaces{
    "Oak",     "Walnut",  "Pine",    "Marble", "Granite", "Concrete", "Brick",   "Plaster",
    "Steel",   "Copper",  "Brass",   "Chrome", "Glass",   "Leather",  "Velvet",  "Linen",
    "Ceramic", "Terrazzo", "Béton",  "Ziegel Ära", "Verre dépoli", "Kork", "Slate", "Rubber"};
constexpr std::array<std::string_view, 12> kFinishes{"Polished", "Brushed", "Matte",  "Satin",
                                                     "Rough",    "Aged",    "Glossy", "Worn",
                                                     "Painted",  "Oiled",   "Frosted", "Dark"};
constexpr std::array<std::string_view, 8> kFolders{"wood", "stone", "metal", "fabric",
                                                   "tiles", "walls", "floors", "misc"};
constexpr std::array<std::string_view, 4> kImageTypes{".jpg", ".png", ".tif", ".exr"};

class LibraryMaker {
public:
    LibraryMaker(std::uint32_t seed, std::string prefix) : c_(seed), prefix_(std::move(prefix)) {}

    MaterialPtr material(std::size_t index) {
        std::string name = prefix_ + std::string(c_.pick(kFinishes)) + " " + std::string(c_.pick(kSurfaces)) +
                           " " + std::to_string(index + 1);
        switch (c_.weighted(std::array{45, 15, 12, 12, 8, 8})) {
        case 0:
            return layeredMaterial(name);
        case 1: {
            auto bump = named<MaterialBump>(name);
            bump->baseMtl = layeredMaterial(name + " Base");
            bump->bumpTex = c_.chance(0.6) ? texture() : noise(c_.between(0.01f, 2.0f));
            bump->bumpTexMult = c_.between(0.05f, 2.0f);
            return bump;
        }
        case 2: {
            auto displaced = named<MaterialDisplaced>(name);
            displaced->baseMtl = layeredMaterial(name + " Base");
            displaced->displaceTex = bitmapTexture("height");
            displaced->displaceTexMult = c_.between(0.1f, 10.0f);
            displaced->displaceShift = c_.between(-1.0f, 0.0f);
            displaced->displaceEdgeLength = c_.between(1.0f, 8.0f);
            displaced->displaceUseGlobals = c_.chance(0.7);
            return displaced;
        }
        case 3: {
            auto twoSided = named<Material2Sided>(name);
            twoSided->front = layeredMaterial(name + " Front");
            twoSided->back = layeredMaterial(name + " Back");
            twoSided->translucency = c_.color();
            if (c_.chance(0.3)) twoSided->translucencyTex = texture();
            return twoSided;
        }
        case 4: {
            auto toon = named<MaterialToon>(name);
            toon->baseMtl = layeredMaterial(name + " Base");
            toon->lineColor = c_.color();
            toon->lineWidth = c_.between(0.5f, 5.0f);
            if (c_.chance(0.5)) toon->lineWidthTex = noise(c_.between(0.1f, 2.0f));
            toon->opacity = c_.between(0.5f, 1.0f);
            toon->doSecondary = c_.chance(0.5);
            return toon;
        }
        default: {
            // A bump over a two-sided material: wrappers in wrappers.
            auto bump = named<MaterialBump>(name);
            auto twoSided = named<Material2Sided>(name + " Sides");
            twoSided->front = layeredMaterial(name + " Front");
            twoSided->back = layeredMaterial(name + " Back");
            twoSided->translucency = c_.color();
            bump->baseMtl = twoSided;
            bump->bumpTex = texture();
            bump->bumpTexMult = c_.between(0.05f, 1.0f);
            return bump;
        }
        }
    }

private:
    boost::shared_ptr<MaterialLayeredBRDF> layeredMaterial(const std::string& name) {
        auto material = named<MaterialLayeredBRDF>(name);
        const std::size_t count = 1 + c_.weighted(std::array{40, 30, 20, 10});
        std::vector<std::string> used;
        for (std::size_t i = 0; i < count; ++i) {
            BRDFPtr layer = i == 0 ? firstLayer() : upperLayer();
            // Two layers of one kind would share a url; number the later ones.
            std::size_t same = 0;
            for (const std::string& u : used) same += u == layer->name;
            used.push_back(layer->name);
            if (same) layer->name += " " + std::to_string(same + 1);
            material->layers.push_back(std::move(layer));
        }
        material->doubleSided = c_.chance(0.8);
        return material;
    }

    BRDFPtr firstLayer() {
        switch (c_.weighted(std::array{70, 12, 12, 6})) {
        case 0: return diffuseLayer();
        case 1: return glassLayer();
        case 2: return glossyLayer<Blinn_BRDF>();
        default: {
            auto light = make<Light_BRDF>();
            light->color = c_.color();
            light->intensity = c_.between(1.0f, 30.0f);
            if (c_.chance(0.3)) light->colorTex = texture();
            return light;
        }
        }
    }

    BRDFPtr upperLayer() {
        switch (c_.weighted(std::array{35, 25, 20, 10, 10})) {
        case 0: return glossyLayer<Phong_BRDF>();
        case 1: return glossyLayer<Blinn_BRDF>();
        case 2: {
            auto mirror = make<Mirror_BRDF>();
            mirror->color = c_.color();
            if (c_.chance(0.1)) mirror->colorTex = texture();
            if (c_.chance(0.3)) mirror->transparencyTex = fresnel();
            return mirror;
        }
        case 3: return diffuseLayer();
        default: return glassLayer();
        }
    }

    BRDFPtr diffuseLayer() {
        auto layer = diffuse(c_.color(), c_.chance(0.55) ? texture() : TexturePtr{});
        if (c_.chance(0.05)) layer->transparencyTex = texture();
        return layer;
    }

    template <class Glossy>
    BRDFPtr glossyLayer() {
        auto layer = make<Glossy>();
        layer->color = c_.color();
        layer->reflectionGlossiness = c_.between(0.5f, 1.0f);
        layer->hilightGlossiness = c_.between(0.5f, 1.0f);
        layer->subdivs = static_cast<std::int32_t>(8 * (1 + c_.below(4)));
        if (c_.chance(0.3)) {
            layer->anisotropy = c_.between(-1.0f, 1.0f);
            layer->anisotropyRotation = c_.between(0.0f, 360.0f);
        }
        if (c_.chance(0.2)) layer->reflectionGlossinessTex = texture();
        if (c_.chance(0.1)) layer->hilightGlossinessTex = texture();
        if (c_.chance(0.1)) layer->colorTex = texture();
        if (c_.chance(0.3)) layer->transparencyTex = fresnel();
        return layer;
    }

    BRDFPtr glassLayer() {
        auto glass = make<Glass_BRDF>();
        glass->ior = c_.between(1.0f, 2.4f);
        glass->glossiness = c_.between(0.6f, 1.0f);
        glass->fogColor = c_.color();
        glass->fogColorMult = c_.between(0.0f, 1.0f);
        glass->affectShadows = c_.chance(0.5);
        if (c_.chance(0.1)) glass->colorTex = texture();
        return glass;
    }

    TexturePtr texture() {
        switch (c_.weighted(std::array{45, 20, 25, 10})) {
        case 0: return bitmapTexture("diffuse");
        case 1: {
            auto tiles = checker(c_.between(0.5f, 20.0f), c_.chance(0.5) ? 0.0f : c_.between(0.0f, 90.0f));
            tiles->white_color = make<AColorTexture>();
            tiles->black_color = boost::make_shared<AColorTexture>(AColor{c_.unit(), c_.unit(), c_.unit(), 1.0f});
            return tiles;
        }
        case 2: {
            auto pattern = noise(c_.between(0.01f, 5.0f));
            pattern->color1 = c_.color();
            pattern->color2 = c_.color();
            pattern->octaves = static_cast<std::int32_t>(1 + c_.below(8));
            return pattern;
        }
        default: return fresnel();
        }
    }

    TexturePtr fresnel() {
        auto texture = make<FresnelTexture>();
        texture->fresnel_ior = c_.between(1.2f, 3.0f);
        texture->refract_ior = texture->fresnel_ior;
        texture->black_color = c_.color();
        return texture;
    }

    TexturePtr bitmapTexture(std::string_view use) {
        // A few hundred images per folder, so materials share image files as they do.
        std::string path = "textures/" + std::string(c_.pick(kFolders)) + "/" + std::string(c_.pick(kSurfaces)) +
                           "_" + std::string(use) + "_" + std::to_string(c_.below(400)) +
                           std::string(c_.pick(kImageTypes));
        return bitmap(path);
    }

    Choices c_;
    std::string prefix_;
};

} // namespace

ZelMatFile makeLibrary(std::size_t count, std::uint32_t seed, const std::string& namePrefix) {
    LibraryMaker maker(seed, namePrefix);
    ZelMatFile library;
    library.materials.reserve(count);
    for (std::size_t i = 0; i < count; ++i) library.add(maker.material(i));
    return library;
}

AllOptions makeOptions(std::uint32_t seed) {
    Choices c(seed);
    // A third start from the sample's settings, the rest from the defaults.
    AllOptions options = c.chance(0.33) ? sampleOptions() : AllOptions();
    KavorUtils::KavorParams& p = options.params;

    constexpr std::array<std::array<std::int32_t, 2>, 6> sizes{
        {{640, 480}, {800, 600}, {1280, 720}, {1920, 1080}, {2560, 1440}, {3840, 2160}}};
    const auto& size = c.pick(sizes);
    options.img_width = size[0];
    options.img_height = size[1];
    options.frameData.bmp_width = size[0];
    options.frameData.bmp_height = size[1];
    options.fov = c.between(30.0f, 90.0f);
    options.filter_kind = static_cast<std::int32_t>(c.below(4));
    options.gamma_correct_rgb = c.chance(0.5);
    options.input_gamma = c.chance(0.5) ? 2.2f : 1.0f;

    p.imageSampler.type = static_cast<std::int32_t>(c.below(3));
    p.imageSampler.dmc_minSubdivs = static_cast<std::int32_t>(1 + c.below(2));
    p.imageSampler.dmc_maxSubdivs = static_cast<std::int32_t>(4 * (1 + c.below(6)));
    p.imageSampler.dmc_threshold = c.between(0.001f, 0.05f);
    p.imageFilter.on = c.chance(0.8);
    p.cameraDof.on = c.chance(0.2);
    p.cameraDof.subdivs = static_cast<std::int32_t>(4 + c.below(20));
    p.motionBlur.on = c.chance(0.2);
    p.motionBlur.duration = c.between(0.1f, 1.0f);
    p.gi.on = c.chance(0.8);
    p.gi.primary_engine = static_cast<std::uint32_t>(c.below(4));
    p.gi.secondary_engine = static_cast<std::uint32_t>(c.below(4));
    p.gi.saturation = c.between(0.5f, 1.0f);
    p.irradianceMap.min_rate = -static_cast<std::int32_t>(2 + c.below(4));
    p.irradianceMap.max_rate = p.irradianceMap.min_rate + static_cast<std::int32_t>(1 + c.below(4));
    p.irradianceMap.subdivs = static_cast<std::int32_t>(20 + 10 * c.below(8));
    p.lightCache.subdivs = static_cast<std::uint32_t>(500 + 100 * c.below(20));
    p.lightCache.sample_size = c.between(0.005f, 0.05f);
    p.photonMap.bounces = static_cast<std::int32_t>(1 + c.below(20));
    p.caustics.on = c.chance(0.1);
    p.raycaster.maxLevels = static_cast<std::int32_t>(60 + c.below(40));
    p.regionsGenerator.xc = p.regionsGenerator.yc = static_cast<std::int32_t>(16 << c.below(3));
    p.dmcSampler.adaptive_amount = c.between(0.5f, 1.0f);
    p.colorMapping.type = static_cast<std::int32_t>(c.below(7));
    p.colorMapping.gamma = c.chance(0.5) ? 2.2f : 1.0f;
    p.options.light_doDefaultLights = c.chance(0.3);
    p.defaultDisplacement.edgeLength = c.between(1.0f, 8.0f);

    options.frameData.focal_dist = c.between(10.0f, 1000.0f);
    options.frameData.dark_mult = c.between(0.5f, 2.0f);
    options.img_file = "renders/scene_" + std::to_string(c.below(1000)) + "_" + std::string(c.pick(kSurfaces)) + ".png";
    options.channels.clear();
    for (std::uint32_t id = AllOptions::kFirstStoredChannel; id <= AllOptions::kLastStoredChannel; ++id)
        if (c.chance(0.15)) options.channels.push_back(id);

    // The environment: a sky, an image, or nothing for each slot.
    const auto environment = [&]() -> TexturePtr {
        switch (c.weighted(std::array{40, 30, 30})) {
        case 0: return make<SkyTexture>();
        case 1: return bitmap("hdri/" + std::string(c.pick(kFolders)) + "_" + std::to_string(c.below(50)) + ".hdr");
        default: return {};
        }
    };
    options.bg_tex = environment();
    options.use_bg = static_cast<bool>(options.bg_tex);
    options.bg_tex_mult = c.between(0.5f, 2.0f);
    options.gi_tex = environment();
    options.use_gi = static_cast<bool>(options.gi_tex);
    options.reflect_tex = environment();
    options.use_reflect = static_cast<bool>(options.reflect_tex);
    options.refract_color = c.color();

    options.physical_on = c.chance(0.4);
    options.camera.f_number = c.between(1.4f, 16.0f);
    options.camera.focal_length.setConstant(c.between(18.0f, 200.0f));
    return options;
}

std::string libraryBytes(ZelMatFile& library) {
    std::ostringstream out;
    if (!library.writeToStream(out)) return {};
    return std::move(out).str();
}

std::string optionsBytes(AllOptions& options) {
    // The file is the archive's chunks and nothing else.
    QuickArchive ar(1);
    if (!options.writeToArchive(ar)) return {};
    std::string image;
    for (const auto& chunk : ar.chunks())
        image.append(reinterpret_cast<const char*>(chunk->data()), QuickArchive::kChunkSize);
    return image;
}

} // namespace OrvexKavorCore::bench
