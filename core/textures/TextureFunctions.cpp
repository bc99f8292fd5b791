#include <dexmor/textures/TextureFunctions.hpp>

#include <dexmor/textures/BitmapBuffer.hpp>
#include <dexmor/textures/BitmapTexture.hpp>
#include <dexmor/textures/ColorTextures.hpp>
#include <dexmor/textures/PatternTextures.hpp>
#include <dexmor/textures/UVWGenerators.hpp>

#include <boost/make_shared.hpp>

#include <array>
#include <string>

namespace OrvexKavorCore {

namespace {

constexpr std::array<std::string_view, BaseTexture::kKindCount> kKindNames = {
    "Bitmap", "Fresnel", "UVW",   "Noise",  "Checker", "AColor", "Grid",
    "Cloth",  "Bulge",   "Invert", "Blend", "Ramp",    "Sky",
};

// max(0, 1 - x), where a NaN stays NaN (it is not below 0).
float inverse(float x) {
    const float y = 1.0f - x;
    return y < 0.0f ? 0.0f : y;
}

void invert(Color& c) {
    c.r = inverse(c.r);
    c.g = inverse(c.g);
    c.b = inverse(c.b);
}

void invert(AColor& c) {
    c.r = inverse(c.r);
    c.g = inverse(c.g);
    c.b = inverse(c.b);
}

} // namespace

std::string_view textureKindName(std::int32_t kind) {
    if (kind < 0 || kind >= BaseTexture::kKindCount) return {};
    return kKindNames[static_cast<std::size_t>(kind)];
}

TexturePtr makeBitmapTexture(std::string_view path) {
    if (path.empty()) return {};
    auto buffer = boost::make_shared<BitmapBuffer>();
    buffer->file = std::string(path);
    auto texture = boost::make_shared<BitmapTexture>();
    texture->uvwgen = boost::make_shared<GenChannelUVW>();
    texture->bitmap = buffer;
    return texture;
}

void invertColors(const TexturePtr& texture) {
    if (!texture) return;
    BaseTexture::Descent descent;
    if (!descent) return;
    BaseTexture* t = texture.get();
    if (auto* fresnel = dynamic_cast<FresnelTexture*>(t)) {
        invert(fresnel->white_color);
        invert(fresnel->black_color);
        invertColors(fresnel->black_color_tex);
        invertColors(fresnel->white_color_tex);
    } else if (auto* noise = dynamic_cast<NoiseTexture*>(t)) {
        invert(noise->color1);
        invert(noise->color2);
        invertColors(noise->color1_tex);
        invertColors(noise->color2_tex);
    } else if (auto* checker = dynamic_cast<CheckerTexture*>(t)) {
        invertColors(checker->white_color);
        invertColors(checker->black_color);
    } else if (auto* color = dynamic_cast<AColorTexture*>(t)) {
        invert(color->texture);
    } else if (auto* grid = dynamic_cast<GridTexture*>(t)) {
        invertColors(grid->line_color);
        invertColors(grid->fill_color);
    } else if (auto* cloth = dynamic_cast<ClothTexture*>(t)) {
        invert(cloth->gap_color);
        invert(cloth->u_color);
        invert(cloth->v_color);
    } else if (auto* inverted = dynamic_cast<InvertTexture*>(t)) {
        invertColors(inverted->texture);
    } else if (auto* blend = dynamic_cast<BlendTexture*>(t)) {
        invertColors(blend->color_a);
        invertColors(blend->color_b);
    }
}

} // namespace OrvexKavorCore
