#pragma once
// Every BRDF kind, for callers that hold layers of any kind.
#include <dexmor/brdfs/Base_BRDF.hpp>
#include <dexmor/brdfs/Diffuse_BRDF.hpp>
#include <dexmor/brdfs/Glass_BRDF.hpp>
#include <dexmor/brdfs/Light_BRDF.hpp>
#include <dexmor/brdfs/ReflectionBRDFs.hpp>
