#pragma once
// The shared test helpers under the name the texture, BRDF and material tests use.
#include "TestSupport.hpp"

namespace texturetest {
using namespace testsupport;
} // namespace texturetest
