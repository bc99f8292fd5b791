#pragma once
// Every material kind, the scene library and the folding into XML assets.
#include "materials/BaseMaterial.hpp"
#include "materials/CompositeMaterials.hpp"
#include "materials/LayeredMaterials.hpp"
#include "materials/MaterialAssets.hpp"
#include "materials/ReferenceMaterials.hpp"
#include "materials/SceneMaterials.hpp"
#include "materials/WrapperMaterials.hpp"
