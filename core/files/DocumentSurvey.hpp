#pragma once
// DocumentSurvey: reads an asset document as it is written and tells what it
// holds (the materials of a library with the url of each one's asset, the
// top-level assets of an options document) and what a consumer may trip over:
//   - an asset url given to more than one asset (two version-1 names that map to
//     one url, two layers of a material with one name);
//   - a plugin reference that names no asset of the document (a two-sided side
//     that is a material without an asset of its own);
//   - an asset url holding a character XML 1.0 cannot carry, and any other
//     parameter whose text holds one (the wrapped form writes U+FFFD there).
// It works on the writer's lines (one element a line), so it sees exactly what a
// consumer of the text sees. A reference names an asset either by its url or by
// its url, "/" and its plugin name.
#include <dexmor/dexmor.hpp>

#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

class DocumentSurvey {
public:
    // The block of the next material begins (libraries only).
    void beginMaterial(std::string name, std::string kind);
    // The document's text, in order, in pieces of any size.
    void take(std::string_view text);
    // Forgets everything taken: the document starts again.
    void reset();

    // After the whole document: the warnings, and the materials with their asset
    // urls (a library), and the urls of the settings assets (an options document).
    std::vector<std::string> warnings() const;
    std::vector<MaterialSummary> materials() const;
    std::vector<std::string> settingsAssets() const { return settings_; }

private:
    void line(std::string_view text);
    // "material 3 "Oak"", or "the document" before the first material.
    std::string whereOf(int material) const;
    void noteUncarriable(int material);

    struct Reference {
        std::string target;
        int material;
    };
    std::string partial_; // the start of a line not complete yet
    std::vector<MaterialSummary> materials_;
    std::vector<std::optional<std::string>> materialAssets_;
    std::map<std::string, std::vector<int>> assets_; // url -> the materials whose blocks hold it
    std::set<std::string> targets_;                  // what a reference may name
    std::vector<Reference> references_;
    std::vector<std::string> settings_;
    std::string lastAsset_;
    std::string parameter_; // the name of the parameter the lines belong to
    std::vector<std::string> uncarriable_;
    bool lastAssetIsMaterial_ = false;
    enum class Expecting { Nothing, PluginValue, PluginEntries } expecting_ = Expecting::Nothing;
};

} // namespace OrvexKavorCore
