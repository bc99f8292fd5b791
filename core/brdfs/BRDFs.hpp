#pragma once
// Every BRDF kind, for callers that hold layers of any kind.
#include "brdfs/Base_BRDF.hpp"
#include "brdfs/Diffuse_BRDF.hpp"
#include "brdfs/Glass_BRDF.hpp"
#include "brdfs/Light_BRDF.hpp"
#include "brdfs/ReflectionBRDFs.hpp"
