// dexmor check [--json] [--strict] [--kind KIND] FILE...
//
// Tells, for each FILE (a folder: every file of both kinds beneath it; "-":
// standard input), whether it reads as a binary file of its kind, and when it
// does not, why not and what the conversion gives instead; then the warnings of
// the lint of its document (urls given twice, references to no asset, characters
// XML cannot carry). With --json, one JSON object a line.
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

std::string lineOf(std::string_view name, const core::Diagnosis& diagnosis) {
    std::string line = shownName(name);
    if (diagnosis.exceededBudget) return line + ": not checked, " + overBudget(diagnosis) + "\n";
    if (diagnosis.readsAsBinary) {
        line += ": " + diagnosis.description + "\n";
        for (const std::string& warning : diagnosis.warnings) line += shownName(name) + ": warning: " + warning + "\n";
        return line;
    }
    line += ": not readable as binary: ";
    line += diagnosis.reason();
    if (diagnosis.fallbackLength > 0)
        line += "; the conversion returns the file's text (" + std::to_string(diagnosis.fallbackLength) + " bytes)";
    else
        line += "; the conversion returns the empty text";
    return line + "\n";
}

std::string jsonLineOf(const Source& source, const core::Diagnosis& diagnosis) {
    nlohmann::ordered_json line = {
        {"path", source.name},
        {"kind", core::extensionOf(source.kind)},
        {"reads_as_binary", diagnosis.readsAsBinary},
        {"description", diagnosis.readsAsBinary ? nlohmann::ordered_json(diagnosis.description) : nullptr},
    };
    if (diagnosis.exceededBudget) {
        line["reads_as_binary"] = nullptr;
        line["reason"] = overBudget(diagnosis);
        line["exceeded_budget"] = *diagnosis.exceededBudget;
    } else if (!diagnosis.readsAsBinary) {
        line["reason"] = diagnosis.opened && diagnosis.failure ? diagnosis.failure->reason : diagnosis.reason();
        line["offset"] = diagnosis.opened && diagnosis.failure ? nlohmann::ordered_json(diagnosis.failure->offset) : nullptr;
        line["record_path"] = diagnosis.failure ? diagnosis.failure->recordPath : std::vector<std::string>{};
        line["fallback_bytes"] = diagnosis.fallbackLength;
    }
    line["warnings"] = diagnosis.warnings;
    return line.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

} // namespace

int runCheck(Args args) {
    int exitStatus = Rejected;
    const std::optional<ReportArgs> parsed = parseReportArgs(args, "check", exitStatus);
    if (!parsed) return exitStatus;

    bool rejected = false;
    const std::vector<Source> sources = sourcesOf(parsed->files, parsed->kind, {"checked", false}, rejected);
    StandardOutput out;
    bool allGood = true;
    bool outputGone = false;
    for (const Source& source : sources) {
        const core::Diagnosis diagnosis = surveyOf(source);
        allGood = allGood && diagnosis.readsAsBinary && (!parsed->strict || diagnosis.warnings.empty());
        if (!out.write(parsed->json ? jsonLineOf(source, diagnosis) : lineOf(source.name, diagnosis))) {
            outputGone = true;
            break;
        }
    }
    if (!out.finish()) outputGone = true;
    if (rejected) return Rejected;
    return allGood && !outputGone ? Success : Failed;
}

} // namespace dexmor
