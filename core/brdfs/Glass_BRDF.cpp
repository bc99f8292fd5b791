#include <dexmor/brdfs/Glass_BRDF.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using B = Glass_BRDF;
using record::between;
using record::field;
using record::since;

constexpr std::array kFields = {
    field<&B::color>("color"),
    field<&B::fogColor>("fog_color"),
    field<&B::ior>("ior"),
    field<&B::ior2>("ior2"),
    field<&B::cutoff>("cutoff"),
    field<&B::fogColorMult>("fog_color_mult"),
    field<&B::glossiness>("glossiness"),
    field<&B::extraInt>("extraInt"),
    field<&B::subdivs>("subdivs"),
    field<&B::affectShadows>("affect_shadows"),
    field<&B::affectAlpha>("affect_alpha"),
    field<&B::transparencyTexMult>("transparency_tex_mult", between(2, 4)),
    field<&B::colorTexMult>("color_tex_mult", since(5)),
    field<&B::glossinessTexMult>("glossiness_tex_mult", since(2)),
    field<&B::iorTexMult>("ior_tex_mult", since(2)),
    brdf::pathItem<&B::transparencyTex>("transparency_tex path", between(2, 3)),
    brdf::pathItem<&B::glossinessTex>("glossiness_tex path", between(2, 3)),
    brdf::pathItem<&B::iorTex>("ior_texture path", between(2, 3)),
    field<&B::translucencyOn>("translucency_on", since(3)),
    field<&B::thickness>("thickness", since(3)),
    field<&B::scatterCoeff>("scatter_coeff", since(3)),
    field<&B::scatterDirection>("scatter_direction", since(3)),
    field<&B::translucencyTexMult>("translucency_tex_mult", since(3)),
    field<&B::translucency>("translucency", since(3)),
    brdf::pathItem<&B::translucencyTex>("translucency_tex path", between(3, 3)),
    field<&B::transparencyTex>("transparency_tex", between(4, 4)),
    field<&B::colorTex>("color_tex", since(5)),
    field<&B::glossinessTex>("glossiness_tex", since(4)),
    field<&B::iorTex>("ior_texture", since(4)),
    field<&B::translucencyTex>("translucency_tex", since(4)),
    field<&B::transparency>("transparency", since(5)),
    field<&B::transparencyTexMult>("transparency_tex_mult", since(5)),
    field<&B::transparencyTex>("transparency_tex", since(5)),
    kind::baseRecord<B>(since(6)),
};

constexpr std::array kParameters = {
    kind::value<&B::color>("color"),
    kind::value<&B::transparency>("transparency"),
    kind::value<&B::fogColor>("fog_color"),
    kind::value<&B::translucency>("translucency"),
    kind::flag<&B::affectShadows>("affect_shadows"),
    kind::flag<&B::affectAlpha>("affect_alpha"),
    kind::flag<&B::translucencyOn>("translucency_on"),
    kind::value<&B::ior>("ior"),
    kind::value<&B::fogColorMult>("fog_color_mult"),
    kind::value<&B::glossiness>("glossiness"),
    kind::value<&B::glossinessTexMult>("glossiness_tex_mult"),
    kind::value<&B::iorTexMult>("ior_tex_mult"),
    kind::value<&B::translucencyTexMult>("translucency_tex_mult"),
    kind::value<&B::scatterCoeff>("scatter_coeff"),
    kind::value<&B::scatterDirection>("scatter_direction"),
    kind::value<&B::thickness>("thickness"),
    kind::value<&B::transparencyTexMult>("transparency_tex_mult"),
    kind::value<&B::cutoff>("cutoff"),
    kind::value<&B::colorTexMult>("color_tex_mult"),
    kind::value<&B::subdivs>("subdivs"),
    kind::reference<&B::transparencyTex>("transparency_tex", "transparency_texture"),
    kind::reference<&B::colorTex>("color_tex", "color_texture"),
    kind::reference<&B::glossinessTex>("glossiness_tex", "glossy_texture"),
    kind::reference<&B::iorTex>("ior_texture", "ior_texture"),
    kind::reference<&B::translucencyTex>("translucency_tex", "translucency_texture"),
};

} // namespace

std::span<const record::Field<Glass_BRDF>> Glass_BRDF::fields() { return kFields; }
std::span<const kind::ParameterRow<Glass_BRDF>> Glass_BRDF::parameters() { return kParameters; }

} // namespace OrvexKavorCore
