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
        field<&B::transparencyTexMult>("transparency_tex_mult"),
        field<&B::legacyFresnel_, &L::ior>("legacy Fresnel ior", between(1, 4)),
        field<&B::cutoff>("cutoff"),
        field<&B::legacyFresnel_, &L::on>("legacy Fresnel switch", between(1, 4)),
        field<&B::extraInt>("extraInt"),
        brdf::pathItem<&B::transparencyTex>("transparency_tex path", between(1, 2)),
        field<&B::colorTexMult>("color_tex_mult", since(2)),
        brdf::pathItem<&B::colorTex>("color_tex path", between(2, 2)),
        field<&B::transparencyTex>("transparency_tex", since(3)),
        field<&B::colorTex>("color_tex", since(3)),
        kind::baseRecord<B>(since(4)),
        brdf::fresnelConversion<&B::legacyFresnel_, &B::transparencyTex>(between(1, 4)),
    };
    return kFields;
}

std::span<const kind::ParameterRow<Mirror_BRDF>> Mirror_BRDF::parameters() {
    using B = Mirror_BRDF;
    static constexpr std::array kParameters = {
        kind::value<&B::color>("color"),
        kind::value<&B::transparency>("transparency"),
        kind::value<&B::colorTexMult>("color_tex_mult"),
        kind::value<&B::transparencyTexMult>("transparency_tex_mult"),
        kind::value<&B::cutoff>("cutoff"),
        kind::reference<&B::transparencyTex>("transparency_tex", "transparency_texture"),
        kind::reference<&B::colorTex>("color_tex", "color_texture"),
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
        field<&B::backSide>("back_side"),
        field<&B::extraInt>("extraInt"),
        field<&B::colorTexMult>("color_tex_mult", since(2)),
        field<&B::hilightGlossinessTexMult>("hilightGlossiness_tex_mult", since(2)),
        field<&B::reflectionGlossinessTexMult>("reflectionGlossiness_tex_mult", since(2)),
        field<&B::transparencyTexMult>("transparency_tex_mult", since(6)),
        brdf::pathItem<&B::colorTex>("color_tex path", between(2, 3)),
        brdf::pathItem<&B::hilightGlossinessTex>("hilightGlossiness_tex path", between(2, 3)),
        brdf::pathItem<&B::reflectionGlossinessTex>("reflectionGlossiness_tex path", between(2, 3)),
        field<&B::colorTex>("color_tex", since(4)),
        field<&B::hilightGlossinessTex>("hilightGlossiness_tex", since(4)),
        field<&B::reflectionGlossinessTex>("reflectionGlossiness_tex", since(4)),
        field<&B::transparencyTex>("transparency_tex", since(6)),
        field<&B::anisotropy>("anisotropy", since(3)),
        field<&B::anisotropyRotation>("anisotropy_rotation", since(3)),
        kind::baseRecord<B>(since(5)),
        brdf::fresnelConversion<&B::legacyFresnel_, &B::transparencyTex>(between(1, 5)),
    };
    return kFields;
}

template <class Leaf>
std::span<const kind::ParameterRow<GlossyReflection<Leaf>>> GlossyReflection<Leaf>::parameters() {
    using B = GlossyReflection<Leaf>;
    static constexpr std::array kParameters = {
        kind::value<&B::color>("color"),
        kind::value<&B::transparency>("transparency"),
        kind::value<&B::hilightGlossiness>("hilightGlossiness"),
        kind::value<&B::reflectionGlossiness>("reflectionGlossiness"),
        kind::value<&B::cutoff>("cutoff"),
        kind::value<&B::subdivs>("subdivs"),
        kind::value<&B::backSide>("back_side"),
        kind::value<&B::colorTexMult>("color_tex_mult"),
        kind::value<&B::hilightGlossinessTexMult>("hilightGlossiness_tex_mult"),
        kind::value<&B::reflectionGlossinessTexMult>("reflectionGlossiness_tex_mult"),
        kind::value<&B::transparencyTexMult>("transparency_tex_mult"),
        kind::value<&B::anisotropy>("anisotropy"),
        kind::value<&B::anisotropyRotation>("anisotropy_rotation"),
        kind::reference<&B::colorTex>("color_tex", "color_texture"),
        kind::reference<&B::hilightGlossinessTex>("hilightGlossiness_tex", "hilight_glossiness_texture"),
        kind::reference<&B::reflectionGlossinessTex>("reflectionGlossiness_tex", "reflection_glossiness_texture"),
        kind::reference<&B::transparencyTex>("transparency_tex", "transparency_texture"),
    };
    return kParameters;
}

template class GlossyReflection<Phong_BRDF>;
template class GlossyReflection<Blinn_BRDF>;

} // namespace OrvexKavorCore
