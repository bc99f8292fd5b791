#include <dexmor/textures/ColorTextures.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using kind::reference;
using kind::value;
using record::field;
using record::since;
using texture::mandatory;
using texture::optional;

// --- AColorTexture ---

constexpr std::array<texture::Member<AColorTexture>, 0> kAColorMembers = {};
constexpr std::array kAColorFields = {field<&AColorTexture::texture>("texture")};
constexpr std::array kAColorParameters = {value<&AColorTexture::texture>("texture")};

// --- FresnelTexture ---

constexpr std::array kFresnelMembers = {
    optional<&FresnelTexture::black_color_tex>("black_color_tex", since(2)),
    optional<&FresnelTexture::white_color_tex>("white_color_tex", since(2)),
    optional<&FresnelTexture::fresnel_ior_tex>("fresnel_ior_tex", since(2)),
    optional<&FresnelTexture::refract_ior_tex>("refract_ior_tex", since(2)),
};
constexpr std::array kFresnelFields = {
    field<&FresnelTexture::white_color>("white_color"),
    field<&FresnelTexture::black_color>("black_color"),
    field<&FresnelTexture::fresnel_ior>("fresnel_ior"),
    field<&FresnelTexture::refract_ior>("refract_ior"),
    field<&FresnelTexture::black_color_tex_mult>("black_color_tex_mult", since(2)),
    field<&FresnelTexture::white_color_tex_mult>("white_color_tex_mult", since(2)),
    field<&FresnelTexture::fresnel_ior_tex_mult>("fresnel_ior_tex_mult", since(2)),
    field<&FresnelTexture::refract_ior_tex_mult>("refract_ior_tex_mult", since(2)),
};
constexpr std::array kFresnelParameters = {
    value<&FresnelTexture::white_color>("white_color"),
    value<&FresnelTexture::black_color>("black_color"),
    value<&FresnelTexture::fresnel_ior>("fresnel_ior"),
    value<&FresnelTexture::refract_ior>("refract_ior"),
    value<&FresnelTexture::black_color_tex_mult>("black_color_tex_mult"),
    value<&FresnelTexture::white_color_tex_mult>("white_color_tex_mult"),
    value<&FresnelTexture::fresnel_ior_tex_mult>("fresnel_ior_tex_mult"),
    value<&FresnelTexture::refract_ior_tex_mult>("refract_ior_tex_mult"),
    reference<&FresnelTexture::black_color_tex>("black_color_tex", "reflection_tex"),
    reference<&FresnelTexture::white_color_tex>("white_color_tex", "refraction_tex"),
    reference<&FresnelTexture::fresnel_ior_tex>("fresnel_ior_tex", "fresnel_ior_tex"),
    reference<&FresnelTexture::refract_ior_tex>("refract_ior_tex", "refract_ior_tex"),
    // The consumers expect the old Fresnel evaluation, whatever the record held.
    kind::ParameterRow<FresnelTexture>{"old_way", nullptr, nullptr, nullptr,
                                       [](AssetXmlWriter& w, const char* n, const FresnelTexture&,
                                          const std::string&) { w.writeBool(n, true); }},
};

// --- InvertTexture ---

constexpr std::array kInvertMembers = {mandatory<&InvertTexture::texture>("texture")};
constexpr std::array kInvertFields = {field<&InvertTexture::invert_alpha>("invert_alpha")};
constexpr std::array kInvertParameters = {
    reference<&InvertTexture::texture>("texture", "base_texture"),
    value<&InvertTexture::invert_alpha>("invert_alpha"),
};

// --- BlendTexture ---

constexpr std::array kBlendMembers = {
    optional<&BlendTexture::color_a>("color_a"),
    optional<&BlendTexture::color_b>("color_b"),
};
constexpr std::array kBlendFields = {
    field<&BlendTexture::colorAFactor>("colorAFactor"),
    field<&BlendTexture::colorBFactor>("colorBFactor"),
    field<&BlendTexture::blend_amount>("blend_amount"),
};
constexpr std::array kBlendParameters = {
    reference<&BlendTexture::color_a>("color_a", "color_a"),
    reference<&BlendTexture::color_b>("color_b", "color_b"),
    value<&BlendTexture::blend_amount>("blend_amount"),
};

} // namespace

std::span<const texture::Member<AColorTexture>> AColorTexture::members() { return kAColorMembers; }
std::span<const record::Field<AColorTexture>> AColorTexture::fields() { return kAColorFields; }
std::span<const kind::ParameterRow<AColorTexture>> AColorTexture::parameters() { return kAColorParameters; }

std::span<const texture::Member<FresnelTexture>> FresnelTexture::members() { return kFresnelMembers; }
std::span<const record::Field<FresnelTexture>> FresnelTexture::fields() { return kFresnelFields; }
std::span<const kind::ParameterRow<FresnelTexture>> FresnelTexture::parameters() { return kFresnelParameters; }

std::span<const texture::Member<InvertTexture>> InvertTexture::members() { return kInvertMembers; }
std::span<const record::Field<InvertTexture>> InvertTexture::fields() { return kInvertFields; }
std::span<const kind::ParameterRow<InvertTexture>> InvertTexture::parameters() { return kInvertParameters; }

std::span<const texture::Member<BlendTexture>> BlendTexture::members() { return kBlendMembers; }
std::span<const record::Field<BlendTexture>> BlendTexture::fields() { return kBlendFields; }
std::span<const kind::ParameterRow<BlendTexture>> BlendTexture::parameters() { return kBlendParameters; }

// --- the blend texture's record ---

bool BlendTexture::writeToArchive(QuickArchive& ar) {
    Descent descent;
    if (!descent) return false;
    ar.write(VersionWord::make(0, kInfo.version));
    if (!writeOptionalMember(ar, color_a)) return false;
    if (color_a) ar.write(colorAFactor);
    if (!writeOptionalMember(ar, color_b)) return false;
    if (color_b) ar.write(colorBFactor);
    ar.write(blend_amount);
    return true;
}

bool BlendTexture::readFromArchive(QuickArchive& ar) {
    const auto version = startRead(ar);
    if (!version) return false;
    const bool withFactors = *version >= 2;
    if (!readOptionalMember(ar, color_a, "color_a")) return false;
    if (withFactors && color_a) ar.readAs("colorAFactor", colorAFactor);
    if (!readOptionalMember(ar, color_b, "color_b")) return false;
    if (withFactors && color_b) ar.readAs("colorBFactor", colorBFactor);
    ar.readAs("blend_amount", blend_amount);
    return true;
}

} // namespace OrvexKavorCore
