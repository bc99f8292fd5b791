#include <dexmor/brdfs/ReflectionBRDFs.hpp>

#include <dexmor/textures/ColorTextures.hpp>

#include <array>

namespace OrvexKavorCore {

using record::between;
using record::field;
using record::since;

TexturePtr brdf::defaultFresnel() { return boost::make_shared<FresnelTexture>(); }

// --- Mirror_BRDF ---

std::span<const record::Field<Mirror_BRDF>> Mirror_BRDF::fields() {
    using B = Mirror_BRDF;
    using L = brdf::LegacyFresnel;
    static constexpr std::array kFields = {
        field<&B::color>("color"),
        field<&B::transparency>("transparency"),
        field<&B::transparencyTexMult>("transparencyTexMult"),
        field<&B::legacyFresnel_, &L::ior>("legacy Fresnel ior", between(1, 4)),
        field<&B::cutoff>("cutoff"),
        field<&B::legacyFresnel_, &L::on>("legacy Fresnel switch", between(1, 4)),
        field<&B::extraInt>("extraInt"),
        brdf::pathItem<&B::transparencyTex>("transparencyTex path", between(1, 2)),
        field<&B::colorTexMult>("colorTexMult", since(2)),
        brdf::pathItem<&B::colorTex>("colorTex path", between(2, 2)),
        brdf::textureItem<&B::transparencyTex>("transparencyTex", since(3)),
        brdf::textureItem<&B::colorTex>("colorTex", since(3)),
        brdf::baseRecord<B>(since(4)),
        brdf::fresnelConversion<&B::legacyFresnel_, &B::transparencyTex>(between(1, 4)),
    };
    return kFields;
}

std::span<const brdf::Parameter<Mirror_BRDF>> Mirror_BRDF::parameters() {
    using B = Mirror_BRDF;
    static constexpr std::array kParameters = {
        brdf::value<&B::color>("color"),
        brdf::value<&B::transparency>("transparency"),
        brdf::value<&B::colorTexMult>("color_tex_mult"),
        brdf::value<&B::transparencyTexMult>("transparency_tex_mult"),
        brdf::value<&B::cutoff>("cutoff"),
        brdf::texture<&B::transparencyTex>("transparency_tex", "transparency_texture"),
        brdf::texture<&B::colorTex>("color_tex", "color_texture"),
    };
    return kParameters;
}

// --- Phong_BRDF and Blinn_BRDF ---

template <class Leaf>
std::span<const record::Field<GlossyReflection<Leaf>>> GlossyReflection<Leaf>::fields() {
    using B = GlossyReflection<Leaf>;
    using L = brdf::LegacyFresnel;
    static constexpr std::array kFields = {
        field<&B::color>("color"),
        field<&B::transparency>("transparency"),
        field<&B::hilightGlossiness>("hilightGlossiness"),
        field<&B::reflectionGlossiness>("reflectionGlossiness"),
        field<&B::legacyFresnel_, &L::ior>("legacy Fresnel ior", between(1, 5)),
        field<&B::cutoff>("cutoff"),
        field<&B::subdivs>("subdivs"),
        field<&B::legacyFresnel_, &L::on>("legacy Fresnel switch", between(1, 5)),
        field<&B::backSide>("backSide"),
        field<&B::extraInt>("extraInt"),
        field<&B::colorTexMult>("colorTexMult", since(2)),
        field<&B::hilightGlossinessTexMult>("hilightGlossinessTexMult", since(2)),
        field<&B::reflectionGlossinessTexMult>("reflectionGlossinessTexMult", since(2)),
        field<&B::transparencyTexMult>("transparencyTexMult", since(6)),
        brdf::pathItem<&B::colorTex>("colorTex path", between(2, 3)),
        brdf::pathItem<&B::hilightGlossinessTex>("hilightGlossinessTex path", between(2, 3)),
        brdf::pathItem<&B::reflectionGlossinessTex>("reflectionGlossinessTex path", between(2, 3)),
        brdf::textureItem<&B::colorTex>("colorTex", since(4)),
        brdf::textureItem<&B::hilightGlossinessTex>("hilightGlossinessTex", since(4)),
        brdf::textureItem<&B::reflectionGlossinessTex>("reflectionGlossinessTex", since(4)),
        brdf::textureItem<&B::transparencyTex>("transparencyTex", since(6)),
        field<&B::anisotropy>("anisotropy", since(3)),
        field<&B::anisotropyRotation>("anisotropyRotation", since(3)),
        brdf::baseRecord<B>(since(5)),
        brdf::fresnelConversion<&B::legacyFresnel_, &B::transparencyTex>(between(1, 5)),
    };
    return kFields;
}

template <class Leaf>
std::span<const brdf::Parameter<GlossyReflection<Leaf>>> GlossyReflection<Leaf>::parameters() {
    using B = GlossyReflection<Leaf>;
    static constexpr std::array kParameters = {
        brdf::value<&B::color>("color"),
        brdf::value<&B::transparency>("transparency"),
        brdf::value<&B::hilightGlossiness>("hilightGlossiness"),
        brdf::value<&B::reflectionGlossiness>("reflectionGlossiness"),
        brdf::value<&B::cutoff>("cutoff"),
        brdf::value<&B::subdivs>("subdivs"),
        brdf::value<&B::backSide>("back_side"),
        brdf::value<&B::colorTexMult>("color_tex_mult"),
        brdf::value<&B::hilightGlossinessTexMult>("hilightGlossiness_tex_mult"),
        brdf::value<&B::reflectionGlossinessTexMult>("reflectionGlossiness_tex_mult"),
        brdf::value<&B::transparencyTexMult>("transparency_tex_mult"),
        brdf::value<&B::anisotropy>("anisotropy"),
        brdf::value<&B::anisotropyRotation>("anisotropy_rotation"),
        brdf::texture<&B::colorTex>("color_tex", "color_texture"),
        brdf::texture<&B::hilightGlossinessTex>("hilightGlossiness_tex", "hilight_glossiness_texture"),
        brdf::texture<&B::reflectionGlossinessTex>("reflectionGlossiness_tex", "reflection_glossiness_texture"),
        brdf::texture<&B::transparencyTex>("transparency_tex", "transparency_texture"),
    };
    return kParameters;
}

template class GlossyReflection<Phong_BRDF>;
template class GlossyReflection<Blinn_BRDF>;

} // namespace OrvexKavorCore
