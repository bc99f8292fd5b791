// Builds the seed corpora of the fuzz targets with Dexmor's own writers:
//   make_seeds SAMPLE_DIR OUTPUT_DIR
// reads SAMPLE_DIR/sample.zelmat and sample.zelopt and writes into OUTPUT_DIR:
//   lib_*    material libraries: each sample material alone, in generations 2 and 3
//            (generation 2 is the plain archive run, the smallest form), each
//            sample material in every older record version of its kind, every
//            BRDF kind in every record version, every texture kind and UVW
//            generator kind in a diffuse layer;
//   opt_*    render options: the sample and the defaults cut after their record,
//            and the sample in every options version the reader accepts.
//   lib_hostile_names  names with markup, control characters and bytes that are
//            not UTF-8 (make_seeds --hostile-names FILE writes it alone).
// Every file is read back before it is kept; a form that does not read is left out.
// The checked-in corpora are these files after libFuzzer's -merge=1.
#include "HostileShapes.hpp"

#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/materials/Materials.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/textures/SkyTexture.hpp>
#include <dexmor/textures/Textures.hpp>
#include <dexmor/textures/UVWGenerators.hpp>

#include <boost/make_shared.hpp>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <span>
#include <sstream>
#include <string>
#include <string_view>
#include <vector>

using namespace OrvexKavorCore;
namespace fs = std::filesystem;

namespace {

fs::path outputDir;
int written = 0;

std::string readFile(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

void keep(const std::string& name, const std::string& bytes) {
    std::ofstream(outputDir / name, std::ios::binary) << bytes;
    ++written;
}

// The bytes of an archive up to its write position.
std::string archiveBytes(QuickArchive& ar) {
    std::string bytes(ar.writePosition(), '\0');
    ar.getRaw(bytes.data(), bytes.size());
    return bytes;
}

// A library of the materials as a generation-2 file: header, then the plain archive.
// Empty when a material cannot be written.
std::string generation2(const std::vector<MaterialPtr>& materials) {
    QuickArchive ar;
    for (const MaterialPtr& m : materials)
        if (!writeMember(ar, m)) return {};
    std::string bytes;
    const std::uint32_t header[2] = {VersionWord::make(0, 2).raw, static_cast<std::uint32_t>(materials.size())};
    bytes.append(reinterpret_cast<const char*>(header), sizeof header);
    return bytes + archiveBytes(ar);
}

void keepLibrary(const std::string& name, const std::vector<MaterialPtr>& materials) {
    const std::string bytes = generation2(materials);
    const ConversionContext fresh1;
    if (bytes.empty() || !ZelMatFile().readFromBytes(bytes)) {
        std::fprintf(stderr, "left out: %s\n", name.c_str());
        return;
    }
    keep(name, bytes);
}

// The element type of a record table.
template <class Obj>
Obj* objectOf(std::span<const record::Field<Obj>>);

// Stands in for an object of kind K in a tree and writes K's record in an older
// version, straight from the kind's record table.
template <class Base, class K>
class OlderRecord : public Base {
public:
    OlderRecord(boost::shared_ptr<K> object, std::uint16_t version) : object_(std::move(object)), version_(version) {}
    std::int32_t kindId() const override { return K::kInfo.kind; }
    void resetToDefaults() override {}
    boost::shared_ptr<Base> clone() const override { return {}; }
    bool isEqual(const boost::shared_ptr<Base>&) const override { return false; }
    bool writeToArchive(QuickArchive& ar) override {
        using Shape = std::remove_pointer_t<decltype(objectOf(K::fields()))>;
        ar.write(VersionWord::make(0, version_));
        return record::writeFields(ar, static_cast<Shape&>(*object_), K::fields(), version_);
    }

private:
    boost::shared_ptr<K> object_;
    std::uint16_t version_;
};

template <class K>
class OlderMaterial final : public OlderRecord<BaseMaterial, K> {
public:
    using OlderRecord<BaseMaterial, K>::OlderRecord;
    MaterialPtr cloneRenamed() const override { return {}; }
};

template <class K>
using OlderBRDF = OlderRecord<Base_BRDF, K>;

// Every older version of a sample material whose kind is K.
template <class K>
bool olderMaterialVersions(const MaterialPtr& material, const std::string& stem) {
    auto object = boost::dynamic_pointer_cast<K>(material);
    if (!object) return false;
    for (std::uint16_t v = 1; v < K::kInfo.version; ++v)
        keepLibrary(stem + "_v" + std::to_string(v), {boost::make_shared<OlderMaterial<K>>(object, v)});
    return true;
}

template <class... Kinds>
void olderMaterialVersionsOfAny(const MaterialPtr& material, const std::string& stem) {
    (olderMaterialVersions<Kinds>(material, stem) || ...);
}

MaterialPtr layeredWith(BRDFPtr layer) {
    auto material = boost::make_shared<MaterialLayeredBRDF>();
    material->name = "Seed";
    material->layers.push_back(std::move(layer));
    return material;
}

template <class K>
void brdfVersions(const std::string& stem) {
    auto layer = boost::make_shared<K>();
    for (std::uint16_t v = 1; v <= K::kInfo.version; ++v)
        keepLibrary("lib_brdf_" + stem + "_v" + std::to_string(v),
                    {layeredWith(v == K::kInfo.version ? BRDFPtr(layer) : boost::make_shared<OlderBRDF<K>>(layer, v))});
}

MaterialPtr diffuseWith(TexturePtr texture) {
    auto layer = boost::make_shared<Diffuse_BRDF>();
    layer->colorTex = std::move(texture);
    return layeredWith(layer);
}

// Gives a texture's empty mandatory members something to write.
void fill(const TexturePtr& texture) {
    auto uvw = boost::make_shared<GenChannelUVW>();
    auto color = [] { return boost::make_shared<AColorTexture>(AColor{0.5f, 0.25f, 0.125f, 1.0f}); };
    if (auto* t = dynamic_cast<UVWTexture*>(texture.get())) t->uvwgen = uvw;
    if (auto* t = dynamic_cast<NoiseTexture*>(texture.get())) t->uvwgen = uvw, t->color1_tex = color();
    if (auto* t = dynamic_cast<GridTexture*>(texture.get())) t->uvwgen = uvw, t->line_color = color(), t->fill_color = color();
    if (auto* t = dynamic_cast<ClothTexture*>(texture.get())) t->uvwgen = uvw;
    if (auto* t = dynamic_cast<BulgeTexture*>(texture.get())) t->uvwgen = uvw;
    if (auto* t = dynamic_cast<RampTexture*>(texture.get())) t->uvwgen = uvw, t->colors = color();
    if (auto* t = dynamic_cast<InvertTexture*>(texture.get())) t->texture = color();
    if (auto* t = dynamic_cast<BlendTexture*>(texture.get())) t->color_a = color(), t->color_b = color();
    if (auto* t = dynamic_cast<FresnelTexture*>(texture.get())) t->black_color_tex = color();
}

// The oldest version of a diffuse layer, without a name: a handful of bytes.
BRDFPtr cheapestLayer() {
    static const auto layer = [] {
        auto diffuse = boost::make_shared<Diffuse_BRDF>();
        diffuse->name.clear();
        return diffuse;
    }();
    return boost::make_shared<OlderBRDF<Diffuse_BRDF>>(layer, 1);
}

void keepHostileShapes() {
    keepLibrary("lib_amplify_quoted_name_layers", {hostile::amplifier(2000, 40, cheapestLayer)});
    keepLibrary("lib_hostile_names", hostile::hostileNameLibrary());
    keepLibrary("lib_deepest_bump_chain", {hostile::deepestChain(hostile::bumpChain)});
    keepLibrary("lib_deepest_texture_chain", {hostile::deepestChain(hostile::textureChain)});
}

std::string optionsBytes(AllOptions& options, std::uint16_t version) {
    QuickArchive ar;
    ar.write(VersionWord::make(AllOptions::kVersionFirstHalf, version));
    if (!record::writeFields(ar, options, AllOptions::recordFields(), version)) return {};
    return archiveBytes(ar);
}

void keepOptions(const std::string& name, const std::string& bytes) {
    AllOptions check;
    const ConversionContext fresh2;
    if (bytes.empty() || !ZelOptFile().readBytes(check, bytes)) {
        std::fprintf(stderr, "left out: %s\n", name.c_str());
        return;
    }
    keep(name, bytes);
}

} // namespace

int main(int argc, char** argv) {
    if (argc == 5 && std::string_view(argv[1]) == "--amplifier") {
        // make_seeds --amplifier NAME_LENGTH LAYERS FILE: a large hostile library, to measure with.
        const ConversionContext context;
        std::ofstream(argv[4], std::ios::binary)
            << generation2({hostile::amplifier(std::stoul(argv[2]), std::stoul(argv[3]), cheapestLayer)});
        return 0;
    }
    if (argc == 4 && std::string_view(argv[1]) == "--sub-materials") {
        // make_seeds --sub-materials COUNT FILE: one multi material of COUNT empty
        // multi materials, the cheapest long list, to measure with.
        const ConversionContext context;
        auto multi = boost::make_shared<MaterialMulti>();
        multi->name = "Set";
        for (unsigned long i = std::stoul(argv[2]); i > 0; --i)
            multi->subMaterials.push_back(boost::make_shared<MaterialMulti>());
        std::ofstream(argv[3], std::ios::binary) << generation2({multi});
        return 0;
    }
    if (argc >= 4 && std::string_view(argv[1]) == "--names") {
        // make_seeds --names FILE NAME...: one material of 20 layers per name (as
        // UTF-8), so that each name stands in 20 urls: documents of any width of
        // character, to test what takes the text.
        const ConversionContext context;
        std::vector<MaterialPtr> materials;
        for (int i = 3; i < argc; ++i) {
            MaterialPtr material = hostile::amplifier(0, 20, cheapestLayer);
            material->name = argv[i];
            materials.push_back(material);
        }
        std::ofstream(argv[2], std::ios::binary) << generation2(materials);
        return 0;
    }
    if (argc == 3 && std::string_view(argv[1]) == "--hostile-names") {
        // make_seeds --hostile-names FILE: a library of hostile names (see hostileNameLibrary).
        const ConversionContext context;
        std::ofstream(argv[2], std::ios::binary) << generation2(hostile::hostileNameLibrary());
        return 0;
    }
    if (argc != 3) {
        std::fprintf(stderr, "usage: make_seeds SAMPLE_DIR OUTPUT_DIR\n"
                             "       make_seeds --amplifier NAME_LENGTH LAYERS FILE\n"
                             "       make_seeds --sub-materials COUNT FILE\n"
                             "       make_seeds --names FILE NAME...\n"
                             "       make_seeds --hostile-names FILE\n");
        return 2;
    }
    const fs::path samples = argv[1];
    outputDir = argv[2];
    fs::create_directories(outputDir);

    ZelMatFile library;
    if (!library.readFromBytes(readFile(samples / "sample.zelmat"))) {
        std::fprintf(stderr, "sample.zelmat does not read\n");
        return 1;
    }
    for (std::size_t i = 0; i < library.materials.size(); ++i) {
        const MaterialPtr& m = library.materials[i];
        const std::string stem = "lib_material_" + std::to_string(i) + "_kind" + std::to_string(m->kindId());
        keepLibrary(stem, {m});
        ZelMatFile single;
        single.add(m);
        std::ostringstream generation3;
        if (single.writeToStream(generation3)) keep(stem + "_gen3", generation3.str());
        olderMaterialVersionsOfAny<MaterialLayeredBRDF, MaterialSingleBRDF, MaterialMulti, MaterialBump, Material2Sided,
                                   MaterialLinked, MaterialSkp2Sided, MaterialOverrideEnvironment, MaterialDisplaced,
                                   MaterialObjectExclusion, MaterialAlphaContribution, MaterialAngleBlend,
                                   MaterialReference, MaterialToon>(m, stem);
    }

    brdfVersions<Glass_BRDF>("glass");
    brdfVersions<Diffuse_BRDF>("diffuse");
    brdfVersions<Blinn_BRDF>("blinn");
    brdfVersions<Phong_BRDF>("phong");
    brdfVersions<Mirror_BRDF>("mirror");
    brdfVersions<Light_BRDF>("light");

    for (std::int32_t kind = 0; kind < BaseTexture::kKindCount; ++kind) {
        TexturePtr texture = createTexture(kind);
        fill(texture);
        keepLibrary("lib_texture_kind" + std::to_string(kind), {diffuseWith(texture)});
    }
    for (std::int32_t kind : {0, 1, 3, 4}) {
        auto texture = boost::make_shared<NoiseTexture>();
        texture->uvwgen = createUVW(kind);
        keepLibrary("lib_uvw_kind" + std::to_string(kind), {diffuseWith(texture)});
    }

    keepHostileShapes();

    {
        // Two skies whose stored default suns differ only in the sign of a zero
        // shadow bias: read once or twice, the library must give one document.
        const ConversionContext context;
        QuickArchive ar;
        writeMember(ar, diffuseWith(boost::make_shared<SkyTexture>()));
        sharedDefaultSun()->shadowBias = -0.0f;
        writeMember(ar, diffuseWith(boost::make_shared<SkyTexture>()));
        const std::uint32_t header[2] = {VersionWord::make(0, 2).raw, 2};
        keep("lib_sky_default_sun_minus_zero",
             std::string(reinterpret_cast<const char*>(header), sizeof header) + archiveBytes(ar));
    }

    const std::string sampleOptions = readFile(samples / "sample.zelopt");
    AllOptions options;
    if (!ZelOptFile().readBytes(options, sampleOptions)) {
        std::fprintf(stderr, "sample.zelopt does not read\n");
        return 1;
    }
    for (unsigned v = 0; v <= AllOptions::kVersion; ++v)
        if (AllOptions::acceptsVersion(v))
            keepOptions("opt_sample_v" + std::to_string(v), optionsBytes(options, static_cast<std::uint16_t>(v)));
    AllOptions defaults;
    keepOptions("opt_defaults", optionsBytes(defaults, AllOptions::kVersion));
    auto sky = boost::make_shared<SkyTexture>();
    defaults.bg_tex = sky;
    defaults.use_bg = 1;
    keepOptions("opt_sky", optionsBytes(defaults, AllOptions::kVersion));

    std::printf("%d seeds written to %s\n", written, outputDir.c_str());
    return 0;
}
