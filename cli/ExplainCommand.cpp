// dexmor explain [--json] [--offset N] [--depth K] [--kind KIND] FILE
//
// Shows FILE as its readers read it: the container, every record with its byte
// range, record path, kind and version, every value with its offset, size, name,
// encoding, bytes and decoded value, the ranges no record reads, and where a
// reading failed. With --json the same as one JSON document.
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
using Json = nlohmann::ordered_json;

Json jsonOf(const core::ExplainedNode& node) {
    Json json = {
        {"offset", node.offset}, {"size", node.size}, {"name", node.name}, {"kind", node.kind}, {"value", node.value},
    };
    if (!node.encoding.empty()) json["encoding"] = node.encoding;
    if (!node.hex.empty()) json["hex"] = node.hex;
    if (node.kindId) json["kind_id"] = *node.kindId;
    if (!node.className.empty()) json["class"] = node.className;
    if (!node.version.empty()) json["version"] = node.version;
    if (node.heldSince) json["held_since"] = *node.heldSince;
    if (node.heldUntil) json["held_until"] = *node.heldUntil;
    if (!node.note.empty()) json["note"] = node.note;
    Json children = Json::array();
    for (const core::ExplainedNode& child : node.children) children.push_back(jsonOf(child));
    json["children"] = std::move(children);
    return json;
}

std::string jsonDocument(const Source& source, const core::Explanation& explanation,
                         const core::ExplainedNode& shown) {
    Json document = jsonOf(shown);
    document["path"] = source.name;
    document["file_kind"] = core::extensionOf(source.kind);
    document["reads_as_binary"] = explanation.readsAsBinary;
    if (explanation.failure)
        document["failure"] = {{"reason", explanation.failure->reason},
                               {"offset", explanation.failure->offset},
                               {"record_path", explanation.failure->recordPath}};
    else
        document["failure"] = nullptr;
    document["cut"] = explanation.cut;
    return document.dump(-1, ' ', false, Json::error_handler_t::replace) + "\n";
}

} // namespace

int runExplain(Args args) {
    int exitStatus = Rejected;
    const std::optional<ReportArgs> parsed = parseReportArgs(args, "explain", exitStatus);
    if (!parsed) return exitStatus;
    if (parsed->files.size() != 1) return usageError({"explain: one FILE at a time"});

    bool rejected = false;
    const std::vector<Source> sources = sourcesOf(parsed->files, parsed->kind, {"explained", true}, rejected);
    if (rejected) return Rejected;
    if (sources.size() != 1)
        return usageError({"explain: ", shownName(parsed->files.front()), " names ", std::to_string(sources.size()),
                           " files; explain takes one"});
    const Source& source = sources.front();
    const core::Explanation explanation = core::explain(source.kind, source.input());
    if (!explanation.opened) {
        complain({shownName(source.name), ": not explained, the file ",
                  explanation.failure ? explanation.failure->reason : "cannot be read"});
        return Rejected;
    }
    const core::ExplainedNode shown = core::viewOf(explanation.root, {parsed->offset, parsed->depth});
    StandardOutput out;
    const bool written = out.write(parsed->json ? jsonDocument(source, explanation, shown)
                                                : core::explanationText(shown)) &&
                         out.finish();
    if (!written) return Failed;
    return explanation.readsAsBinary ? Success : Failed;
}

} // namespace dexmor
