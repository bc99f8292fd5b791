#pragma once
// Every texture kind and the operations over textures, for callers that hold
// textures of any kind.
#include "textures/BaseTexture.hpp"
#include "textures/BitmapTexture.hpp"
#include "textures/ColorTextures.hpp"
#include "textures/PatternTextures.hpp"
#include "textures/SkyTexture.hpp"
#include "textures/TextureFunctions.hpp"
