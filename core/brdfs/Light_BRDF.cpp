#include <dexmor/brdfs/Light_BRDF.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using B = Light_BRDF;
using record::between;
using record::field;
using record::since;

constexpr std::array kFields = {
    field<&B::color>("color"),
    field<&B::transparency>("transparency", since(2)),
    field<&B::intensity>("intensity"),
    field<&B::extraFloat>("extraFloat", since(2)),
    field<&B::colorTexMult>("color_tex_mult", since(2)),
    field<&B::transparencyTexMult>("transparency_tex_mult"),
    brdf::pathItem<&B::colorTex>("color_tex path", between(2, 2)),
    brdf::pathItem<&B::transparencyTex>("transparency_tex path", between(1, 2)),
    field<&B::colorTex>("color_tex", since(3)),
    field<&B::transparencyTex>("transparency_tex", since(3)),
    kind::baseRecord<B>(since(4)),
    field<&B::doubleSided>("doubleSided", since(5)),
};

constexpr std::array kParameters = {
    kind::value<&B::color>("color"),
    kind::value<&B::transparency>("transparency"),
    kind::value<&B::intensity>("intensity"),
    kind::value<&B::transparencyTexMult>("transparency_tex_mult"),
    kind::value<&B::colorTexMult>("color_tex_mult"),
    kind::flag<&B::doubleSided>("doubleSided"),
    kind::reference<&B::colorTex>("color_tex", "color_texture"),
    kind::reference<&B::transparencyTex>("transparency_tex", "transp_texture"),
};

} // namespace

std::span<const record::Field<Light_BRDF>> Light_BRDF::fields() { return kFields; }
std::span<const kind::ParameterRow<Light_BRDF>> Light_BRDF::parameters() { return kParameters; }

} // namespace OrvexKavorCore
