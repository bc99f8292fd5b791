#include "SampleBuilders.hpp"

#include <dexmor/textures/UVWGenerators.hpp>

#include <utility>

namespace OrvexKavorCore::samples {

TexturePtr bitmap(const std::string& file) { return makeBitmapTexture(file); }

boost::shared_ptr<NoiseTexture> noise(float size) {
    auto texture = make<NoiseTexture>();
    texture->uvwgen = make<GenChannelUVW>();
    texture->size = size;
    texture->octaves = 5;
    texture->color2 = {0.2f, 0.15f, 0.1f};
    return texture;
}

boost::shared_ptr<CheckerTexture> checker(float scale, float rotationDegrees) {
    auto texture = make<CheckerTexture>();
    auto uvw = make<GenPlanarWorldUVW>();
    uvw->uvwComponents.x_scale = scale;
    uvw->uvwComponents.y_scale = scale;
    uvw->uvwComponents.z_rotation = rotationDegrees;
    texture->uvwgen = uvw;
    return texture;
}

boost::shared_ptr<Diffuse_BRDF> diffuse(Color color, TexturePtr colorTex) {
    auto layer = make<Diffuse_BRDF>();
    layer->color = color;
    layer->colorTex = std::move(colorTex);
    return layer;
}

boost::shared_ptr<MaterialLayeredBRDF> layered(const std::string& name, std::initializer_list<BRDFPtr> layers) {
    auto material = named<MaterialLayeredBRDF>(name);
    material->layers.assign(layers);
    return material;
}

AllOptions sampleOptions() {
    AllOptions options;
    KavorUtils::KavorParams& p = options.params;
    p.imageSampler.type = 1;
    p.imageSampler.dmc_maxSubdivs = 16;
    p.imageFilter.on = 1;
    p.camera.type = 0;
    p.cameraDof.on = 1;
    p.cameraDof.subdivs = 12;
    p.motionBlur.on = 1;
    p.motionBlur.duration = 0.5f;
    p.gi.on = 1;
    p.gi.primary_engine = 0;
    p.gi.secondary_engine = 3;
    p.irradianceMap.min_rate = -4;
    p.irradianceMap.max_rate = -1;
    p.photonMap.bounces = 6;
    p.lightCache.subdivs = 1500;
    p.caustics.on = 1;
    p.raycaster.maxLevels = 80;
    p.regionsGenerator.xc = 32;
    p.regionsGenerator.yc = 32;
    p.dmcSampler.adaptive_amount = 0.9f;
    p.colorMapping.type = 6;
    p.colorMapping.gamma = 2.2f;
    p.options.light_doDefaultLights = 0;
    p.defaultDisplacement.edgeLength = 2.0f;
    options.frameData.height = 300.0f;
    options.frameData.focal_dist = 150.0f;
    options.frameData.dark_mult = 1.2f;
    options.frameData.bmp_width = 1920;
    options.frameData.bmp_height = 1080;

    options.img_width = 1920;
    options.img_height = 1080;
    options.filter_kind = 1;
    options.fov = 60.0f;
    options.gamma_correct_rgb = 1;
    options.input_gamma = 2.2f;
    options.img_file = "renders/Atrium Ansicht \xC3\x9C" "bersicht.png";
    options.im_file = "cache/atrium.vrmap";
    options.channels.push_back(117); // ZDepth
    options.channels.push_back(101); // Diffuse

    options.use_bg = 1;
    options.bg_tex = boost::make_shared<SkyTexture>();
    options.bg_tex_mult = 0.8f;
    options.use_gi = 1;
    options.gi_tex = boost::make_shared<SkyTexture>();
    options.use_reflect = 1;
    options.reflect_tex = bitmap("hdri/courtyard.hdr");
    options.reflect_tex_mult = 1.5f;
    options.refract_color = {0.1f, 0.2f, 0.3f};

    options.physical_on = 1;
    options.camera.f_number = 5.6f;
    options.camera.focal_length.setConstant(35.0f);
    options.camera.focal_length.setValue(50.0f, 10.0);
    return options;
}

} // namespace OrvexKavorCore::samples
