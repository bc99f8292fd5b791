#pragma once
// The renderer's shading services that the environment lookup needs, as small
// stand-ins of our own: the shading context of one ray (only its ray-type flag
// word matters here) and the colour query of the renderer's texture objects.
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>

namespace KavorUtils {

// The shading context of a ray.
struct KavorContext {
    // Bits describing the kind of ray being shaded.
    std::uint32_t rayType = 0;
};

// A texture object of the renderer: answers its colour at a shading context.
class KavorTextureInterface {
public:
    virtual ~KavorTextureInterface() = default;
    virtual AColor getTexColor(KavorContext& context) const = 0;
};

} // namespace KavorUtils
