#pragma once
// What the reporting commands (check, list) share: their arguments and the
// survey of each file's document.
#include "Inputs.hpp"
#include "Output.hpp"

#include <dexmor/dexmor.hpp>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace dexmor {

struct ReportArgs {
    bool json = false;
    bool strict = false;
    // explain: --offset N, --depth K
    std::optional<std::uint64_t> offset;
    std::optional<unsigned> depth;
    std::optional<OrvexKavorCore::FileKind> kind;
    std::vector<std::string_view> files;
};

// Parses "[--json] [--strict] [--kind KIND] FILE..." for `command` (explain:
// "[--json] [--offset N] [--depth K] [--kind KIND] FILE..."); nullopt after
// a usage message, or with `exitStatus` set when the arguments ask for help.
std::optional<ReportArgs> parseReportArgs(Args args, std::string_view command, int& exitStatus);

// Converts `source` without keeping the document, for what the conversion
// finds: the diagnosis with the survey of the document. A document over the
// output budget stops the survey (Diagnosis::exceededBudget).
OrvexKavorCore::Diagnosis surveyOf(const Source& source);

// "its XML would exceed N bytes (the output budget)", for a survey stopped there.
std::string overBudget(const OrvexKavorCore::Diagnosis& diagnosis);

} // namespace dexmor
