#include <dexmor/textures/BitmapTexture.hpp>

#include <array>
#include <string>

namespace OrvexKavorCore {

namespace {

constexpr std::array kBitmapMembers = {
    texture::mandatory<&BitmapTexture::uvwgen>("uvwgen"),
    texture::mandatory<&BitmapTexture::bitmap>("bitmap"),
};
constexpr std::array kBitmapFields = {record::field<&BitmapTexture::tile>("tile")};
constexpr std::array kBitmapParameters = {
    kind::reference<&BitmapTexture::uvwgen>("uvwgen", "uvwgen"),
    kind::reference<&BitmapTexture::bitmap>("bitmap", "buffer"),
    kind::value<&BitmapTexture::tile>("tile"),
};

// The record of a member whose object was already created from its kind id.
template <class Base>
bool readCreated(QuickArchive& ar, const boost::shared_ptr<Base>& object, const char* name) {
    QuickArchive::Scope scope(ar, Family<Base>::word, name);
    return scope && object->readFromArchive(ar);
}

} // namespace

std::span<const texture::Member<BitmapTexture>> BitmapTexture::members() { return kBitmapMembers; }
std::span<const record::Field<BitmapTexture>> BitmapTexture::fields() { return kBitmapFields; }
std::span<const kind::ParameterRow<BitmapTexture>> BitmapTexture::parameters() { return kBitmapParameters; }

bool BitmapTexture::writeToArchive(QuickArchive& ar) {
    if (!uvwgen || !bitmap) return false;
    ar.write(VersionWord::make(0, kInfo.version));
    ar.write(static_cast<std::int32_t>(uvwgen->kindId()));
    ar.write(static_cast<std::int32_t>(bitmap->kindId()));
    if (!uvwgen->writeToArchive(ar) || !bitmap->writeToArchive(ar)) return false;
    ar.write(tile);
    return true;
}

bool BitmapTexture::readFromArchive(QuickArchive& ar) {
    const auto version = startRead(ar);
    if (!version) return false;
    // Each kind id is checked as soon as it is read, so a failure points at it.
    std::int32_t uvwKind = 0;
    ar.readAs("uvwgen kind id", uvwKind);
    const UVWPtr newUvwgen = createUVW(uvwKind);
    if (!newUvwgen) return ar.fail("unknown UVW generator kind " + std::to_string(uvwKind) + " of the uvwgen");
    std::int32_t bitmapKind = 0;
    ar.readAs("bitmap kind id", bitmapKind);
    const BitmapPtr newBitmap = createBitmap(bitmapKind);
    if (!newBitmap) return ar.fail("unknown bitmap kind " + std::to_string(bitmapKind) + " of the bitmap");
    uvwgen = newUvwgen;
    bitmap = newBitmap;
    if (!readCreated(ar, uvwgen, "uvwgen") || !readCreated(ar, bitmap, "bitmap")) return false;
    ar.readAs("tile", tile);
    return true;
}

} // namespace OrvexKavorCore
