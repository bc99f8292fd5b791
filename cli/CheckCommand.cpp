// dexmor check FILE...
//
// Tells, one line per FILE, whether it reads as a binary file of the kind its
// extension names, and when it does not, why not and what the conversion gives
// instead.
#include "Commands.hpp"

#include <dexmor/dexmor.hpp>

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace dexmor {

namespace {

namespace core = OrvexKavorCore;

std::string lineOf(std::string_view name, const core::Diagnosis& diagnosis) {
    std::string line = shownName(name);
    if (diagnosis.readsAsBinary) return line + ": " + diagnosis.description + "\n";
    line += ": not readable as binary: ";
    line += diagnosis.reason();
    if (diagnosis.fallbackLength > 0)
        line += "; the conversion returns the file's text (" + std::to_string(diagnosis.fallbackLength) + " bytes)";
    else
        line += "; the conversion returns the empty text";
    return line + "\n";
}

} // namespace

int runCheck(Args args) {
    std::vector<std::string_view> files;
    bool optionsEnd = false;
    for (const std::string_view arg : args) {
        if (optionsEnd || arg.size() < 2 || arg[0] != '-')
            files.push_back(arg);
        else if (arg == "--")
            optionsEnd = true;
        else if (arg == "-h" || arg == "--help")
            return showText(helpText);
        else
            return usageError({"check: unknown option '", arg, "'"});
    }
    if (files.empty()) return usageError({"check: no FILE given"});

    StandardOutput out;
    bool allBinary = true;
    bool rejected = false;
    bool outputGone = false;
    for (const std::string_view name : files) {
        const std::optional<core::FileKind> kind = core::fileKindOf(name);
        if (!kind) {
            complain({shownName(name), ": not checked, the name ends in neither .zelmat nor .zelopt"});
            rejected = true;
            continue;
        }
        const core::Diagnosis diagnosis = core::diagnose(*kind, std::filesystem::path(std::string(name)));
        allBinary = allBinary && diagnosis.readsAsBinary;
        if (!out.write(lineOf(name, diagnosis))) {
            outputGone = true;
            break;
        }
    }
    if (!out.finish()) outputGone = true;
    if (rejected) return Rejected;
    return allBinary && !outputGone ? Success : Failed;
}

} // namespace dexmor
