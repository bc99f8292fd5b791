#pragma once
// BitmapTexture: an image file (a bitmap) laid out by a UVW generator.
//
// Its record differs from every other texture's: both kind ids come first and
// both member records after them.
//   VersionWord (0, 1)
//   Int32    kind of uvwgen
//   Int32    kind of bitmap
//            record of uvwgen
//            record of bitmap
//   Bool     tile
// Both members are mandatory. The bitmap's asset is the child "buffer".
#include <dexmor/textures/BaseBitmap.hpp>
#include <dexmor/textures/BaseUVW.hpp>
#include <dexmor/textures/TextureKind.hpp>

#include <span>

namespace OrvexKavorCore {

class BitmapTexture final : public TextureKind<BitmapTexture> {
public:
    static constexpr KindInfo kInfo{.kind = kBitmap, .version = 1, .pluginType = "TexBitmap",
                                    .what = "bitmap texture"};

    UVWPtr uvwgen;
    BitmapPtr bitmap;
    bool tile = true;

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;

    static std::span<const texture::Member<BitmapTexture>> members();
    static std::span<const record::Field<BitmapTexture>> fields();
    static std::span<const kind::ParameterRow<BitmapTexture>> parameters();
};

} // namespace OrvexKavorCore
