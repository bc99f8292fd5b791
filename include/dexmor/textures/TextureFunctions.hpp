#pragma once
// Operations over textures of any kind: the display names of the kinds, the
// bitmap texture made from a file path, and the colour inversion of a texture
// tree. (The factory, createTexture, is declared with the family base.)
#include <dexmor/textures/BaseTexture.hpp>

#include <cstdint>
#include <string_view>

namespace OrvexKavorCore {

// "Bitmap", "Fresnel", "UVW", "Noise", "Checker", "AColor", "Grid", "Cloth",
// "Bulge", "Invert", "Blend", "Ramp", "Sky" for kinds 0 to 12; the empty text for
// any other value.
std::string_view textureKindName(std::int32_t kind);

// A bitmap texture showing the image at `path` through mapping channel
// coordinates: a default channel generator and a default bitmap buffer whose file
// is `path`. An empty path gives an empty pointer. Older records that store a
// bitmap path in place of a texture are read through it.
TexturePtr makeBitmapTexture(std::string_view path);

// Replaces every colour of the texture tree by its inverse (max(0, 1 - x) per
// component, alpha unchanged; a component that is not a number stays so), in
// place. Colour and Fresnel colours, noise and cloth colours are inverted; the
// walk goes on into the colour members of Fresnel, noise, checker, grid, invert
// and blend textures. An empty pointer is left alone.
void invertColors(const TexturePtr& texture);

} // namespace OrvexKavorCore
