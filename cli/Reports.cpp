#include "Reports.hpp"

#include "Options.hpp"

namespace dexmor {

namespace {

namespace core = OrvexKavorCore;

// Discards the document; it can take back what it was sent, so a library is read once.
class Nowhere final : public core::DocumentSink {
public:
    void write(std::string_view) override {}
    bool canTakeBack() const override { return true; }
};

} // namespace

std::optional<ReportArgs> parseReportArgs(Args args, std::string_view command, int& exitStatus) {
    ReportArgs parsed;
    bool optionsEnd = false;
    exitStatus = Rejected;
    for (std::size_t i = 0; i < args.size(); ++i) {
        const std::string_view arg = args[i];
        std::string_view value;
        if (optionsEnd || arg.size() < 2 || arg[0] != '-') {
            parsed.files.push_back(arg);
        } else if (arg == "--") {
            optionsEnd = true;
        } else if (arg == "-h" || arg == "--help") {
            exitStatus = showText(helpText);
            return std::nullopt;
        } else if (arg == "--json") {
            parsed.json = true;
        } else if (arg == "--strict" && command == "check") {
            parsed.strict = true;
        } else if (command == "explain" && (arg.starts_with("--offset") || arg.starts_with("--depth"))) {
            const bool isOffset = arg.starts_with("--offset");
            const Match found = optionValue(args, i, "", isOffset ? "--offset" : "--depth", value);
            const std::optional<std::uint64_t> number = found == Match::Found ? parseBytes(value) : std::nullopt;
            if (!number || (!isOffset && *number > 1000))
                return usageError({command, ": option ", isOffset ? "--offset" : "--depth", " needs a number",
                                   isOffset ? "" : " up to 1000"}),
                       std::nullopt;
            if (isOffset)
                parsed.offset = *number;
            else
                parsed.depth = static_cast<unsigned>(*number);
        } else if (const Match kind = optionValue(args, i, "", "--kind", value); kind != Match::No) {
            if (kind == Match::Missing) return usageError({command, ": option ", arg, " needs zelmat or zelopt"}), std::nullopt;
            parsed.kind = parseKind(value);
            if (!parsed.kind) return usageError({command, ": the kind must be zelmat or zelopt, not '", value, "'"}), std::nullopt;
        } else {
            return usageError({command, ": unknown option '", arg, "'"}), std::nullopt;
        }
    }
    if (parsed.files.empty()) return usageError({command, ": no FILE given"}), std::nullopt;
    return parsed;
}

core::Diagnosis surveyOf(const Source& source) {
    core::ConversionOptions options;
    options.survey = true;
    // Nothing is kept, but the document is still made: the output budget bounds the
    // time a hostile file can take.
    Nowhere nowhere;
    return core::convert(source.kind, source.input(), nowhere, options);
}

std::string overBudget(const core::Diagnosis& diagnosis) {
    return "its XML would exceed " + std::to_string(diagnosis.exceededBudget.value_or(0)) + " bytes (the output budget)";
}

} // namespace dexmor
