#include <dexmor/textures/PatternTextures.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

using kind::reference;
using kind::value;
using record::field;
using record::since;
using texture::mandatory;
using texture::optional;

// --- UVWTexture ---

constexpr std::array kUVWMembers = {mandatory<&UVWTexture::uvwgen>("uvwgen")};
constexpr std::array<record::Field<UVWTexture>, 0> kUVWFields = {};
constexpr std::array kUVWParameters = {reference<&UVWTexture::uvwgen>("uvwgen", "uvwgen")};

// --- NoiseTexture ---

constexpr std::array kNoiseMembers = {
    mandatory<&NoiseTexture::uvwgen>("uvwgen"),
    optional<&NoiseTexture::color1_tex>("color1_tex"),
    optional<&NoiseTexture::color2_tex>("color2_tex"),
};
constexpr std::array kNoiseFields = {
    field<&NoiseTexture::color1>("color1"),
    field<&NoiseTexture::color2>("color2"),
    field<&NoiseTexture::persistence>("persistence"),
    field<&NoiseTexture::amplitude_ratio>("amplitude_ratio"),
    field<&NoiseTexture::frequency_ratio>("frequency_ratio"),
    field<&NoiseTexture::frequency1>("frequency1"),
    field<&NoiseTexture::amplitude1>("amplitude1"),
    field<&NoiseTexture::size>("size"),
    field<&NoiseTexture::mix_ratio>("mix_ratio"),
    field<&NoiseTexture::bias>("bias"),
    field<&NoiseTexture::color1_tex_mult>("color1_tex_mult"),
    field<&NoiseTexture::color2_tex_mult>("color2_tex_mult"),
    field<&NoiseTexture::octaves>("octaves"),
    field<&NoiseTexture::noiseType>("noiseType"),
    field<&NoiseTexture::inflection>("inflection"),
};
constexpr std::array kNoiseParameters = {
    reference<&NoiseTexture::uvwgen>("uvwgen", "uvwgen"),
    reference<&NoiseTexture::color1_tex>("color1_tex", "color1_tex"),
    reference<&NoiseTexture::color2_tex>("color2_tex", "color2_tex"),
    value<&NoiseTexture::color1>("color1"),
    value<&NoiseTexture::color2>("color2"),
    value<&NoiseTexture::persistence>("persistence"),
    value<&NoiseTexture::amplitude_ratio>("amplitude_ratio"),
    value<&NoiseTexture::frequency_ratio>("frequency_ratio"),
    value<&NoiseTexture::frequency1>("frequency1"),
    value<&NoiseTexture::amplitude1>("amplitude1"),
    value<&NoiseTexture::size>("size"),
    value<&NoiseTexture::mix_ratio>("mix_ratio"),
    value<&NoiseTexture::bias>("bias"),
    value<&NoiseTexture::color1_tex_mult>("color1_tex_mult"),
    value<&NoiseTexture::color2_tex_mult>("color2_tex_mult"),
    value<&NoiseTexture::octaves>("octaves"),
    value<&NoiseTexture::noiseType>("noiseType"),
    value<&NoiseTexture::inflection>("inflection"),
};

// --- CheckerTexture ---

constexpr std::array kCheckerMembers = {
    mandatory<&CheckerTexture::uvwgen>("uvwgen"),
    mandatory<&CheckerTexture::white_color>("white_color"),
    mandatory<&CheckerTexture::black_color>("black_color"),
};
constexpr std::array kCheckerFields = {
    field<&CheckerTexture::tile_u>("tile_u"),
    field<&CheckerTexture::tile_v>("tile_v"),
    field<&CheckerTexture::whiteFactor>("whiteFactor", since(2)),
    field<&CheckerTexture::blackFactor>("blackFactor", since(2)),
};
constexpr std::array kCheckerParameters = {
    reference<&CheckerTexture::uvwgen>("uvwgen", "uvwgen"),
    reference<&CheckerTexture::white_color>("white_color", "white_color"),
    reference<&CheckerTexture::black_color>("black_color", "black_color"),
    value<&CheckerTexture::tile_u>("tile_u"),
    value<&CheckerTexture::tile_v>("tile_v"),
};

// --- GridTexture ---

constexpr std::array kGridMembers = {
    mandatory<&GridTexture::uvwgen>("uvwgen"),
    mandatory<&GridTexture::line_color>("line_color"),
    mandatory<&GridTexture::fill_color>("fill_color"),
};
constexpr std::array kGridFields = {
    field<&GridTexture::lineFactor>("lineFactor", since(2)),
    field<&GridTexture::fillFactor>("fillFactor", since(2)),
    field<&GridTexture::u_width>("u_width"),
    field<&GridTexture::v_width>("v_width"),
};
constexpr std::array kGridParameters = {
    reference<&GridTexture::uvwgen>("uvwgen", "uvwgen"),
    reference<&GridTexture::line_color>("line_color", "line_color"),
    reference<&GridTexture::fill_color>("fill_color", "fill_color"),
    value<&GridTexture::u_width>("u_width"),
    value<&GridTexture::v_width>("v_width"),
};

// --- ClothTexture ---

constexpr std::array kClothMembers = {mandatory<&ClothTexture::uvwgen>("uvwgen")};
constexpr std::array kClothFields = {
    field<&ClothTexture::gap_color>("gap_color"),
    field<&ClothTexture::u_color>("u_color"),
    field<&ClothTexture::v_color>("v_color"),
    field<&ClothTexture::u_width>("u_width"),
    field<&ClothTexture::v_width>("v_width"),
    field<&ClothTexture::tile>("tile", since(2)),
};
constexpr std::array kClothParameters = {
    reference<&ClothTexture::uvwgen>("uvwgen", "uvwgen"),
    value<&ClothTexture::gap_color>("gap_color"),
    value<&ClothTexture::u_color>("u_color"),
    value<&ClothTexture::v_color>("v_color"),
    value<&ClothTexture::u_width>("u_width"),
    value<&ClothTexture::v_width>("v_width"),
    value<&ClothTexture::tile>("tile_u"),
    value<&ClothTexture::tile>("tile_v"),
};

// --- BulgeTexture ---

constexpr std::array kBulgeMembers = {mandatory<&BulgeTexture::uvwgen>("uvwgen")};
constexpr std::array kBulgeFields = {
    field<&BulgeTexture::u_width>("u_width"),
    field<&BulgeTexture::v_width>("v_width"),
};
constexpr std::array kBulgeParameters = {
    reference<&BulgeTexture::uvwgen>("uvwgen", "uvwgen"),
    value<&BulgeTexture::u_width>("u_width"),
    value<&BulgeTexture::v_width>("v_width"),
};

// --- RampTexture ---

constexpr std::array kRampMembers = {
    mandatory<&RampTexture::uvwgen>("uvwgen"),
    mandatory<&RampTexture::colors>("colors"),
};
constexpr std::array kRampFields = {
    field<&RampTexture::positions>("positions"),
    field<&RampTexture::u_wave>("u_wave"),
    field<&RampTexture::v_wave>("v_wave"),
    field<&RampTexture::type>("type"),
    field<&RampTexture::interpolation>("interpolation"),
};
constexpr std::array kRampParameters = {
    reference<&RampTexture::uvwgen>("uvwgen", "uvwgen"),
    reference<&RampTexture::colors>("colors", "colors"),
    value<&RampTexture::positions>("positions"),
    value<&RampTexture::u_wave>("u_wave"),
    value<&RampTexture::v_wave>("v_wave"),
    value<&RampTexture::type>("type"),
    value<&RampTexture::interpolation>("interpolation"),
};

} // namespace

std::span<const texture::Member<UVWTexture>> UVWTexture::members() { return kUVWMembers; }
std::span<const record::Field<UVWTexture>> UVWTexture::fields() { return kUVWFields; }
std::span<const kind::ParameterRow<UVWTexture>> UVWTexture::parameters() { return kUVWParameters; }

std::span<const texture::Member<NoiseTexture>> NoiseTexture::members() { return kNoiseMembers; }
std::span<const record::Field<NoiseTexture>> NoiseTexture::fields() { return kNoiseFields; }
std::span<const kind::ParameterRow<NoiseTexture>> NoiseTexture::parameters() { return kNoiseParameters; }

std::span<const texture::Member<CheckerTexture>> CheckerTexture::members() { return kCheckerMembers; }
std::span<const record::Field<CheckerTexture>> CheckerTexture::fields() { return kCheckerFields; }
std::span<const kind::ParameterRow<CheckerTexture>> CheckerTexture::parameters() { return kCheckerParameters; }

std::span<const texture::Member<GridTexture>> GridTexture::members() { return kGridMembers; }
std::span<const record::Field<GridTexture>> GridTexture::fields() { return kGridFields; }
std::span<const kind::ParameterRow<GridTexture>> GridTexture::parameters() { return kGridParameters; }

std::span<const texture::Member<ClothTexture>> ClothTexture::members() { return kClothMembers; }
std::span<const record::Field<ClothTexture>> ClothTexture::fields() { return kClothFields; }
std::span<const kind::ParameterRow<ClothTexture>> ClothTexture::parameters() { return kClothParameters; }

std::span<const texture::Member<BulgeTexture>> BulgeTexture::members() { return kBulgeMembers; }
std::span<const record::Field<BulgeTexture>> BulgeTexture::fields() { return kBulgeFields; }
std::span<const kind::ParameterRow<BulgeTexture>> BulgeTexture::parameters() { return kBulgeParameters; }

std::span<const texture::Member<RampTexture>> RampTexture::members() { return kRampMembers; }
std::span<const record::Field<RampTexture>> RampTexture::fields() { return kRampFields; }
std::span<const kind::ParameterRow<RampTexture>> RampTexture::parameters() { return kRampParameters; }

} // namespace OrvexKavorCore
