// The record-version tables of docs/maintainers.md state each kind's id and the
// version its writer produces; they must say what the code does.
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/lights/LightKinds.hpp>
#include <dexmor/lights/SunLight.hpp>
#include <dexmor/materials/Materials.hpp>
#include <dexmor/textures/Textures.hpp>

#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <map>
#include <string>
#include <utility>

namespace {

using namespace OrvexKavorCore;

// Class name -> (kind id, written version), from the classes themselves.
#define KIND(Class) {#Class, {Class::kInfo.kind, Class::kInfo.version}}

TEST(Documentation, RecordVersionTablesMatchTheKinds) {
    const std::map<std::string, std::pair<int, int>> code = {
        KIND(MaterialSingleBRDF), KIND(MaterialLayeredBRDF), KIND(MaterialMulti), KIND(MaterialBump),
        KIND(MaterialInstance), KIND(Material2Sided), KIND(MaterialLinked), KIND(MaterialSkp2Sided),
        KIND(MaterialOverrideEnvironment), KIND(MaterialDisplaced), KIND(MaterialObjectExclusion),
        KIND(MaterialAlphaContribution), KIND(MaterialAngleBlend), KIND(MaterialReference), KIND(MaterialToon),
        KIND(Glass_BRDF), KIND(Diffuse_BRDF), KIND(Blinn_BRDF), KIND(Phong_BRDF), KIND(Mirror_BRDF),
        KIND(Light_BRDF), KIND(BitmapTexture), KIND(FresnelTexture), KIND(UVWTexture), KIND(NoiseTexture),
        KIND(CheckerTexture), KIND(AColorTexture), KIND(GridTexture), KIND(ClothTexture), KIND(BulgeTexture),
        KIND(InvertTexture), KIND(BlendTexture), KIND(RampTexture), KIND(SkyTexture), KIND(MayaDirectLight),
        KIND(OmniLight), KIND(RectangleLight), KIND(SpotLight), KIND(SunLight), KIND(IESLight), KIND(SphereLight),
    };

    std::ifstream file(DEXMOR_SOURCE_DIR "/docs/maintainers.md");
    ASSERT_TRUE(file) << "docs/maintainers.md is missing";
    // Rows such as "| `Glass_BRDF` | 1 | 6 | 1–6 | ... |": name, kind id, written version.
    std::map<std::string, std::pair<int, int>> documented;
    for (std::string line; std::getline(file, line);) {
        const auto close = line.find("` | ", 3);
        if (!line.starts_with("| `") || close == std::string::npos) continue;
        const std::string name = line.substr(3, close - 3);
        int kind = 0;
        int written = 0;
        if (code.count(name) && std::sscanf(line.c_str() + close + 4, "%d | %d |", &kind, &written) == 2)
            documented[name] = {kind, written};
    }

    for (const auto& [name, facts] : code) {
        ASSERT_TRUE(documented.count(name)) << name << " has no row in docs/maintainers.md";
        EXPECT_EQ(documented[name], facts) << name << ": the row's kind id or written version is not the code's";
    }
}

#undef KIND

} // namespace
