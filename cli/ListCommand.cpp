// dexmor list [--json] [--kind KIND] FILE...
//
// Lists what each FILE holds as its document shows it: for a material library
// one line per material (index, name, kind, and the url of its asset, or "no
// asset" for a material that folds into none); for render options the version
// and the settings assets present. With --json, one JSON object per FILE a line.
#include "Commands.hpp"
#include "Reports.hpp"

#include <dexmor/dexmor.hpp>

#include <nlohmann/json.hpp>

#include <optional>
#include <string>
#include <vector>

namespace dexmor {

namespace {

namespace core = OrvexKavorCore;

std::string textOf(const Source& source, const core::Diagnosis& diagnosis) {
    std::string text = shownName(source.name) + ": ";
    if (diagnosis.exceededBudget) return text + "not listed, " + overBudget(diagnosis) + "\n";
    if (!diagnosis.readsAsBinary) return text + "not readable as binary: " + diagnosis.reason() + "\n";
    text += diagnosis.description + "\n";
    for (std::size_t i = 0; i < diagnosis.materials.size(); ++i) {
        const core::MaterialSummary& material = diagnosis.materials[i];
        text += "  " + std::to_string(i) + " \"" + material.name + "\" " + material.kind + ": " +
                (material.assetUrl ? *material.assetUrl : std::string("no asset")) + "\n";
    }
    for (const std::string& settings : diagnosis.settings) text += "  " + settings + "\n";
    return text;
}

std::string jsonOf(const Source& source, const core::Diagnosis& diagnosis) {
    nlohmann::ordered_json line = {
        {"path", source.name},
        {"kind", core::extensionOf(source.kind)},
        {"reads_as_binary", diagnosis.readsAsBinary},
    };
    if (diagnosis.exceededBudget) {
        line["reads_as_binary"] = nullptr;
        line["reason"] = overBudget(diagnosis);
    } else if (!diagnosis.readsAsBinary) {
        line["reason"] = diagnosis.reason();
    } else if (source.kind == core::FileKind::MaterialLibrary) {
        line["description"] = diagnosis.description;
        nlohmann::ordered_json materials = nlohmann::ordered_json::array();
        for (std::size_t i = 0; i < diagnosis.materials.size(); ++i) {
            const core::MaterialSummary& material = diagnosis.materials[i];
            materials.push_back({{"index", i},
                                 {"name", material.name},
                                 {"kind", material.kind},
                                 {"asset_url", material.assetUrl ? nlohmann::ordered_json(*material.assetUrl) : nullptr}});
        }
        line["materials"] = std::move(materials);
    } else {
        line["description"] = diagnosis.description;
        line["settings"] = diagnosis.settings;
    }
    return line.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

} // namespace

int runList(Args args) {
    int exitStatus = Rejected;
    const std::optional<ReportArgs> parsed = parseReportArgs(args, "list", exitStatus);
    if (!parsed) return exitStatus;

    bool rejected = false;
    StandardOutput out;
    bool allBinary = true;
    for (const Source& source : sourcesOf(parsed->files, parsed->kind, {"listed", false}, rejected)) {
        const core::Diagnosis diagnosis = surveyOf(source);
        allBinary = allBinary && diagnosis.readsAsBinary;
        if (!out.write(parsed->json ? jsonOf(source, diagnosis) : textOf(source, diagnosis))) break;
    }
    const bool written = out.finish();
    if (rejected) return Rejected;
    return allBinary && written ? Success : Failed;
}

} // namespace dexmor
