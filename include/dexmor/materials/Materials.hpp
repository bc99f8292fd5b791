#pragma once
// Every material kind, the scene library and the folding into XML assets.
#include <dexmor/materials/BaseMaterial.hpp>
#include <dexmor/materials/CompositeMaterials.hpp>
#include <dexmor/materials/LayeredMaterials.hpp>
#include <dexmor/materials/MaterialAssets.hpp>
#include <dexmor/materials/ReferenceMaterials.hpp>
#include <dexmor/materials/SceneMaterials.hpp>
#include <dexmor/materials/WrapperMaterials.hpp>
