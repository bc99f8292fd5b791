// Builds the sample files of examples/ with Dexmor's own writers:
//   make_samples OUTPUT_DIR
// writes OUTPUT_DIR/sample.zelmat, a library of twenty materials that uses every
// material kind, every BRDF kind and many texture kinds, with names that hold
// spaces, digits and letters beyond ASCII, and OUTPUT_DIR/sample.zelopt, a
// render-options file with settings changed in every section and an environment
// lit by a sky and a bitmap.
#include "SampleBuilders.hpp"

#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/files/ZelOptFile.hpp>

#include <cstdio>
#include <filesystem>
#include <string>

using namespace OrvexKavorCore;
using namespace OrvexKavorCore::samples;

namespace {

ZelMatFile sampleLibrary() {
    ZelMatFile file;

    auto oak = layered("Oak Floor", {diffuse({0.55f, 0.35f, 0.2f}, bitmap("textures/oak floor 01.jpg"))});
    auto varnish = make<Phong_BRDF>();
    varnish->reflectionGlossiness = 0.85f;
    varnish->hilightGlossiness = 0.8f;
    varnish->subdivs = 16;
    oak->layers.push_back(varnish);
    file.add(oak);

    auto steel = layered("Brushed Steel 2", {});
    auto brushed = make<Blinn_BRDF>();
    brushed->color = {0.7f, 0.72f, 0.75f};
    brushed->anisotropy = 0.6f;
    brushed->anisotropyRotation = 90.0f;
    brushed->reflectionGlossinessTex = noise(0.25f);
    steel->layers.push_back(brushed);
    steel->layers.push_back(make<Mirror_BRDF>());
    file.add(steel);

    auto glass = make<Glass_BRDF>();
    glass->ior = 1.52f;
    glass->glossiness = 0.9f;
    glass->fogColor = {0.8f, 0.95f, 0.9f};
    glass->affectShadows = 1;
    file.add(layered("Verre d\xC3\xA9poli", {glass}));

    auto neon = make<Light_BRDF>();
    neon->color = {1.0f, 0.2f, 0.6f};
    neon->intensity = 12.5f;
    file.add(layered("Neon Sign", {diffuse({0.1f, 0.1f, 0.1f}), neon}));

    auto tiles = layered("Checker Tiles 40cm", {diffuse({1, 1, 1}, checker())});
    file.add(tiles);

    auto plaster = named<MaterialBump>("Bumped Plaster");
    plaster->baseMtl = layered("Plaster Base", {diffuse({0.9f, 0.88f, 0.85f})});
    plaster->bumpTex = noise(0.05f);
    plaster->bumpTexMult = 0.3f;
    file.add(plaster);

    auto stone = named<MaterialDisplaced>("Displaced Stone");
    stone->baseMtl = layered("Stone Base", {diffuse({0.5f, 0.5f, 0.48f}, bitmap("textures/stone.png"))});
    stone->displaceTex = bitmap("textures/stone_height.png");
    stone->displaceTexMult = 2.0f;
    stone->displaceShift = -0.5f;
    file.add(stone);

    auto leaf = named<Material2Sided>("Two-Sided Leaf");
    leaf->front = layered("Leaf Front", {diffuse({0.2f, 0.6f, 0.1f})});
    leaf->back = layered("Leaf Back", {diffuse({0.3f, 0.7f, 0.2f})});
    leaf->translucency = {0.4f, 0.5f, 0.2f};
    file.add(leaf);

    auto paper = named<MaterialSkp2Sided>("Paper Sheet");
    paper->front = layered("Paper Front", {diffuse({0.95f, 0.95f, 0.92f})});
    paper->back = layered("Paper Back", {diffuse({0.8f, 0.8f, 0.78f})});
    file.add(paper);

    auto pool = named<MaterialOverrideEnvironment>("Pool Water");
    auto water = make<Glass_BRDF>();
    water->ior = 1.33f;
    pool->baseMtl = layered("Water Base", {water});
    pool->reflectTex = make<SkyTexture>();
    pool->overrideReflect = true;
    pool->giColor = {0.2f, 0.3f, 0.4f};
    pool->overrideGi = true;
    file.add(pool);

    auto shower = named<MaterialObjectExclusion>("Shower Glass");
    shower->baseMtl = layered("Shower Base", {make<Glass_BRDF>()});
    shower->mode = 1;
    shower->objects = {"Shower Tray", "Drain"};
    file.add(shower);

    auto fence = named<MaterialAlphaContribution>("Alpha Fence");
    fence->baseMtl = layered("Fence Base", {diffuse({0.3f, 0.25f, 0.2f})});
    fence->alphaTex = bitmap("textures/fence_mask.png");
    fence->alpha = 0.5f;
    file.add(fence);

    auto paint = named<MaterialAngleBlend>("Pearl Paint");
    paint->mtlOne = layered("Pearl Face", {diffuse({0.9f, 0.9f, 1.0f}), make<Phong_BRDF>()});
    paint->mtlTwo = layered("Pearl Edge", {diffuse({1.0f, 0.85f, 0.9f})});
    paint->startAngle = 60.0f;
    file.add(paint);

    auto toon = named<MaterialToon>("Toon Outline");
    toon->baseMtl = layered("Toon Base", {diffuse({1.0f, 0.8f, 0.1f})});
    toon->lineColor = {0.05f, 0.05f, 0.05f};
    toon->lineWidth = 2.5f;
    toon->lineWidthTex = noise(1.0f);
    file.add(toon);

    auto multi = named<MaterialMulti>("Multi Set");
    multi->subMaterials = {layered("Multi A", {diffuse({1, 0, 0})}), layered("Multi B", {diffuse({0, 0, 1})})};
    file.add(multi);

    auto single = named<MaterialSingleBRDF>("Single Diffuse");
    single->brdf = diffuse({0.25f, 0.5f, 0.75f});
    file.add(single);

    file.add(named<MaterialInstance>("Instance Placeholder"));

    auto linked = named<MaterialLinked>("Linked Oak");
    linked->linkedMaterial = oak->clone();
    file.add(linked);

    file.add(named<MaterialReference>("Reference Without Target"));

    auto brick = layered("Ziegelmauer \xC3\x84ra 1900", {});
    auto grid = make<GridTexture>();
    grid->uvwgen = make<GenChannelUVW>();
    auto mortar = make<AColorTexture>();
    mortar->texture = {0.8f, 0.8f, 0.75f, 1.0f};
    grid->line_color = mortar;
    auto blend = make<BlendTexture>();
    blend->color_a = bitmap("textures/brick \xC3\xA4.jpg");
    blend->color_b = noise(0.5f);
    blend->blend_amount = 0.3f;
    grid->fill_color = blend;
    brick->layers.push_back(diffuse({0.6f, 0.3f, 0.2f}, grid));
    file.add(brick);

    return file;
}

} // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: make_samples OUTPUT_DIR\n");
        return 2;
    }
    const std::filesystem::path dir = argv[1];
    ZelMatFile library = sampleLibrary();
    if (!library.save(dir / "sample.zelmat")) {
        std::fprintf(stderr, "make_samples: %s\n", library.lastError().c_str());
        return 1;
    }
    AllOptions options = sampleOptions();
    if (!ZelOptFile().writeFile(options, dir / "sample.zelopt")) {
        std::fprintf(stderr, "make_samples: the options file could not be written\n");
        return 1;
    }
    return 0;
}
