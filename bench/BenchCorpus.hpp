#pragma once
// The files the benchmarks convert, built with our own model classes and writers:
// material libraries of any size with a mix like the sample library's (layered
// materials of one to four BRDF layers with bitmap, checker, noise and Fresnel
// textures, some wrapped in bump, displaced, two-sided and toon materials), and
// render-options files with varied settings.
//
// Every choice comes from a pseudo-random sequence with a fixed seed, so the same
// seed gives the same objects, and so the same XML, on every machine (the
// materials' identifiers, random UUIDs, are the only bytes that differ between two
// runs, and the XML does not show them).
#include <dexmor/files/ZelMatFile.hpp>
#include <dexmor/options/AllOptions.hpp>

#include <cstddef>
#include <cstdint>
#include <string>

namespace OrvexKavorCore::bench {

// A library of `count` materials with distinct names; `namePrefix` starts every
// top-level name (so that the small files of a folder differ in their names too).
ZelMatFile makeLibrary(std::size_t count, std::uint32_t seed, const std::string& namePrefix = {});

// An options set with settings varied in most sections.
AllOptions makeOptions(std::uint32_t seed);

// The bytes of the files the writers store for these objects.
std::string libraryBytes(ZelMatFile& library);
std::string optionsBytes(AllOptions& options);

} // namespace OrvexKavorCore::bench
