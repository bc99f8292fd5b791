#pragma once
// Small builders of materials, textures and options with our own model classes,
// shared by the program that makes the sample files of this folder and by the
// generator of the benchmark files (bench/).
#include <dexmor/brdfs/BRDFs.hpp>
#include <dexmor/materials/Materials.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/textures/Textures.hpp>

#include <boost/make_shared.hpp>

#include <initializer_list>
#include <string>

namespace OrvexKavorCore::samples {

template <class T>
boost::shared_ptr<T> make() {
    return boost::make_shared<T>();
}

// A material of kind M with the given name.
template <class M>
boost::shared_ptr<M> named(const std::string& name) {
    auto material = make<M>();
    material->name = name;
    return material;
}

// A bitmap texture showing the image file through mapping channel coordinates.
TexturePtr bitmap(const std::string& file);
// Five octaves of noise on mapping channel coordinates, from white to dark brown.
boost::shared_ptr<NoiseTexture> noise(float size);
// A checker on planar world coordinates, scaled and turned about the z axis.
boost::shared_ptr<CheckerTexture> checker(float scale = 4.0f, float rotationDegrees = 45.0f);
boost::shared_ptr<Diffuse_BRDF> diffuse(Color color, TexturePtr colorTex = {});
boost::shared_ptr<MaterialLayeredBRDF> layered(const std::string& name, std::initializer_list<BRDFPtr> layers);

// Render options changed in every section, with an environment lit by a sky and
// a bitmap: the options of examples/sample.zelopt.
AllOptions sampleOptions();

} // namespace OrvexKavorCore::samples
