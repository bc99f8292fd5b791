#include <dexmor/brdfs/Diffuse_BRDF.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using B = Diffuse_BRDF;
using record::between;
using record::field;
using record::since;

constexpr std::array kFields = {
    field<&B::color>("color"),
    field<&B::transparency>("transparency"),
    field<&B::colorTexMult>("color_tex_mult"),
    field<&B::transparencyTexMult>("transparency_tex_mult"),
    brdf::pathItem<&B::colorTex>("color_tex path", between(1, 1)),
    brdf::pathItem<&B::transparencyTex>("transparency_tex path", between(1, 1)),
    field<&B::colorTex>("color_tex", since(2)),
    field<&B::transparencyTex>("transparency_tex", since(2)),
    kind::baseRecord<B>(since(3)),
};

constexpr std::array kParameters = {
    kind::value<&B::color>("color"),
    kind::value<&B::transparency>("transparency"),
    kind::value<&B::colorTexMult>("color_tex_mult"),
    kind::value<&B::transparencyTexMult>("transparency_tex_mult"),
    kind::reference<&B::colorTex>("color_tex", "color_texture"),
    kind::reference<&B::transparencyTex>("transparency_tex", "transparency_texture"),
};

} // namespace

std::span<const record::Field<Diffuse_BRDF>> Diffuse_BRDF::fields() { return kFields; }
std::span<const kind::ParameterRow<Diffuse_BRDF>> Diffuse_BRDF::parameters() { return kParameters; }

} // namespace OrvexKavorCore
