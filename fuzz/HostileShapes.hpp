#pragma once
// Libraries of shapes a hostile file may take, for the seed corpora and the tests:
// documents far larger than the file, and nesting as deep as the reader accepts.
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/materials/Materials.hpp>
#include <dexmor/textures/Textures.hpp>

#include <boost/make_shared.hpp>

#include <cstdint>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

namespace hostile {

using namespace OrvexKavorCore;

// A material whose urls repeat its name: every url beneath a material starts
// with its escaped name (a '"' costs six bytes), and each layer writes the
// material's url several times, so the document grows with the square of the file.
inline MaterialPtr amplifier(std::size_t nameLength, std::size_t layerCount, const std::function<BRDFPtr()>& layer) {
    auto material = boost::make_shared<MaterialLayeredBRDF>();
    material->name = std::string(nameLength, '"');
    for (std::size_t i = 0; i < layerCount; ++i) material->layers.push_back(layer());
    return material;
}

inline MaterialPtr diffuseMaterial(TexturePtr texture = {}) {
    auto layer = boost::make_shared<Diffuse_BRDF>();
    layer->colorTex = std::move(texture);
    auto material = boost::make_shared<MaterialLayeredBRDF>();
    material->name = "Leaf";
    material->layers.push_back(layer);
    return material;
}

// Bump materials each wrapping the next, `depth` deep: reading and writing
// recurse once per level.
inline MaterialPtr bumpChain(std::size_t depth) {
    MaterialPtr material = diffuseMaterial();
    for (std::size_t i = 0; i < depth; ++i) {
        auto bump = boost::make_shared<MaterialBump>();
        bump->name = "Bump" + std::to_string(i);
        bump->baseMtl = std::move(material);
        material = bump;
    }
    return material;
}

// Invert textures each inverting the next, `depth` deep, in a diffuse layer.
inline MaterialPtr textureChain(std::size_t depth) {
    TexturePtr texture = boost::make_shared<AColorTexture>(AColor{0.5f, 0.25f, 0.125f, 1.0f});
    for (std::size_t i = 0; i < depth; ++i) {
        auto invert = boost::make_shared<InvertTexture>();
        invert->texture = std::move(texture);
        texture = invert;
    }
    return diffuseMaterial(texture);
}


// Names that try the document's escaping and the characters XML 1.0 cannot carry:
// markup characters, C0 controls, U+FFFE and U+FFFF, bytes that are not UTF-8,
// line breaks, characters beyond the Basic Multilingual Plane.
inline std::vector<std::string> hostileNames() {
    return {"a&b<c>\"d'e", "]]>", "Ctl\x01\x02\x1f", "Tab\tLine\nFeed\rReturn", "Not\xef\xbf\xbe",
            "Not\xef\xbf\xbf", "Bytes\xff\xc0\x80\xed\xa0\x80", "Cut\xe2\x82", "Del\x7f\xc2\x85",
            "Face\xf0\x9f\x98\x80", "&amp;"};
}

// A library with hostile names: per name, a material whose layer has a bitmap
// texture with the name in its file path; an object exclusion listing every name
// as an object; and a two-sided material whose back is a multi material, which
// folds into no asset, so that its reference names no asset of the document.
inline std::vector<MaterialPtr> hostileNameLibrary() {
    std::vector<MaterialPtr> materials;
    auto exclusion = boost::make_shared<MaterialObjectExclusion>();
    exclusion->name = "Exclude <\x01>";
    exclusion->baseMtl = diffuseMaterial();
    for (const std::string& name : hostileNames()) {
        MaterialPtr material = diffuseMaterial(makeBitmapTexture("C:\\maps\\" + name + ".png"));
        material->name = name;
        materials.push_back(material);
        exclusion->objects.push_back(name);
    }
    materials.push_back(exclusion);
    auto twoSided = boost::make_shared<Material2Sided>();
    twoSided->name = "Sheet\x01";
    twoSided->front = diffuseMaterial();
    twoSided->back = boost::make_shared<MaterialMulti>();
    twoSided->back->name = "Set\x02";
    materials.push_back(twoSided);
    return materials;
}

// A library of generation 2 holding `materials`; empty when one cannot be written.
inline std::string libraryOf(const std::vector<MaterialPtr>& materials) {
    QuickArchive ar;
    for (const MaterialPtr& material : materials)
        if (!writeMember(ar, material)) return {};
    std::string bytes(8 + ar.writePosition(), '\0');
    const std::uint32_t header[2] = {VersionWord::make(0, 2).raw, static_cast<std::uint32_t>(materials.size())};
    std::memcpy(bytes.data(), header, sizeof header);
    ar.getRaw(bytes.data() + 8, ar.writePosition());
    return bytes;
}
inline std::string libraryOf(const MaterialPtr& material) { return libraryOf(std::vector{material}); }

// The deepest chain of a shape that still reads as a library: one level more
// fails the file at the nesting limit.
template <class Chain>
MaterialPtr deepestChain(Chain chain) {
    MaterialPtr deepest;
    for (std::size_t depth = 1;; ++depth) {
        const ConversionContext context;
        MaterialPtr material = chain(depth);
        if (!ZelMatFile().readFromBytes(libraryOf(material))) return deepest;
        deepest = std::move(material);
    }
}

} // namespace hostile
