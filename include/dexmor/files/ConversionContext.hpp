#pragma once
// ConversionContext: everything one conversion owns and shares with no other
// conversion: the default sun that sky records write into, the sun assets the
// document has written, and the path of the recursive walks. While it lives it
// is the current context of its thread (see PerConversion); contexts nest.
//
// Every conversion makes one; so does a program that reads or writes objects of
// the model by hand and wants them to start from a pristine state.
#include <dexmor/lights/SunLight.hpp>
#include <dexmor/model/PerConversion.hpp>
#include <dexmor/model/WalkGuard.hpp>
#include <dexmor/textures/SkyTexture.hpp>

namespace OrvexKavorCore {

class ConversionContext {
public:
    ConversionContext() = default;
    ConversionContext(const ConversionContext&) = delete;
    ConversionContext& operator=(const ConversionContext&) = delete;

    // The default sun. Sky records point at this one object and write into it, so
    // its content is replaced in place, never the object itself.
    SunLight& defaultSun() { return *defaultSun_.light; }
    // Starts the document again: no sun asset written yet.
    void restartDocument() { sunUrls_.urls.clear(); }

private:
    DefaultSun defaultSun_;
    DocumentSunUrls sunUrls_;
    WalkGuard::Path walk_;
    PerConversion<DefaultSun>::Use useDefaultSun_{defaultSun_};
    PerConversion<DocumentSunUrls>::Use useSunUrls_{sunUrls_};
    PerConversion<WalkGuard::Path>::Use useWalk_{walk_};
};

} // namespace OrvexKavorCore
