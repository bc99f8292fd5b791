#pragma once
// Every texture kind and the operations over textures, for callers that hold
// textures of any kind.
#include <dexmor/textures/BaseTexture.hpp>
#include <dexmor/textures/BitmapTexture.hpp>
#include <dexmor/textures/ColorTextures.hpp>
#include <dexmor/textures/PatternTextures.hpp>
#include <dexmor/textures/SkyTexture.hpp>
#include <dexmor/textures/TextureFunctions.hpp>
