#include <dexmor/options/RenderChannels.hpp>

#include <array>

namespace OrvexKavorCore {

namespace {

// Indexed by id - 100.
constexpr std::array<std::string_view, kLastRenderChannel - kFirstRenderChannel + 1> kNames{
    "Atmosphere",        // 100
    "Diffuse",           // 101
    "Reflection",        // 102
    "Refraction",        // 103
    "Self-illumination", // 104
    "Shadow",            // 105
    "Specular",          // 106
    "Lighting",          // 107
    "GI",                // 108
    "Caustics",          // 109
    "Raw GI",            // 110
    "Raw Light",         // 111
    "Raw Shadow",        // 112
    "Velocity",          // 113
    "RenderID",          // 114
    "Material ID",       // 115
    "Node ID",           // 116
    "ZDepth",            // 117
    "Reflection Filter", // 118
    "Raw Reflection",    // 119
    "Refraction Filter", // 120
    "Raw Refraction",    // 121
    "Real Color",        // 122
    "Normals",           // 123
    "Background",        // 124
    "Alpha",             // 125
    "RGB color",         // 126
    "Wire Color",        // 127
    "Matte Shadow",      // 128
    "Total Light",       // 129
    "Raw Total Light",   // 130
    "Bump Normal",       // 131
    "Sample Rate",       // 132
    "SSS2",              // 133
};

} // namespace

std::string_view renderChannelName(std::uint32_t id) {
    if (id < kFirstRenderChannel || id > kLastRenderChannel) return {};
    return kNames[id - kFirstRenderChannel];
}

} // namespace OrvexKavorCore
