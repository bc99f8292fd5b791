// dexmor: the command-line tool over the conversion that the Python module offers.
//
// Each subcommand is one entry in `commands` below: a name and a function that
// receives the arguments after the name (see Commands.hpp). The tool holds no
// conversion logic of its own; it calls the core's conversion and diagnosis.
#include "Commands.hpp"

#include <dexmor/version.hpp>
#include <dexmor/dexmor.hpp>

#include <csignal>
#include <exception>
#include <new>
#include <string_view>
#include <vector>

namespace dexmor {

const std::string_view helpText =
    "Usage: dexmor COMMAND [OPTIONS] FILE...\n"
    "       dexmor --help | --version\n"
    "\n"
    "Turns material libraries (.zelmat) and render-options files (.zelopt) into\n"
    "XML asset documents. A FILE may be a folder (every .zelmat and .zelopt file\n"
    "beneath it) or - (standard input, with --kind).\n"
    "\n"
    "Commands:\n"
    "  xml [-o DIR] [-j N] [--max-output BYTES] [--kind KIND] [--strict] [--wrap]\n"
    "      [-q] [--no-progress] FILE...\n"
    "      Converts each FILE by its extension (.zelmat or .zelopt, in any letter\n"
    "      case) and writes the documents to standard output one after the other,\n"
    "      adding nothing between them. A file that is not in the binary format\n"
    "      is taken to be XML text already and is written as it stands; a line on\n"
    "      standard error says so, and why.\n"
    "\n"
    "      -o DIR, -oDIR, --output DIR, --output=DIR\n"
    "          Writes each document to DIR/<file name>.xml instead (scene.zelmat\n"
    "          gives DIR/scene.zelmat.xml; a file found in a folder gives\n"
    "          DIR/<its path beneath the folder>.xml; standard input\n"
    "          DIR/stdin.zelmat.xml). DIR is created if it is missing. A document\n"
    "          appears there only once it is complete. A line on standard error\n"
    "          sums up the batch: \"304 converted, 3 passed through as text,\n"
    "          1 not converted\".\n"
    "      -j N, -jN, --jobs N, --jobs=N\n"
    "          With -o, converts N files at a time (default: one per core). The\n"
    "          documents are the same whatever N is. When standard error is a\n"
    "          terminal, a progress line shows the files done, the rate and the\n"
    "          time left. Without -o the files are converted one at a time.\n"
    "      --max-output BYTES, --max-output=BYTES\n"
    "          The output budget: a document that would exceed BYTES is not\n"
    "          written (with -o its target is left as it was; on standard output\n"
    "          what was written of it stays and nothing more follows). Default:\n"
    "          the larger of 256 MiB and 1,000 times the FILE's size; 0: no limit.\n"
    "      --kind zelmat|zelopt\n"
    "          The kind of standard input and of every FILE named (lib.zelmat.bak);\n"
    "          files found in folders go by their extension.\n"
    "      --strict\n"
    "          A file that does not read as binary is an error (exit status 3):\n"
    "          its text is not written.\n"
    "      --wrap\n"
    "          The wrapped form, for XML tools: an XML declaration and one root,\n"
    "          <AssetDocument kind=\"zelmat\"> (or \"zelopt\"), around the <Assets>\n"
    "          blocks, and U+FFFD for each character XML 1.0 cannot carry. Each\n"
    "          document is then well-formed XML, valid against the schema in\n"
    "          share/dexmor/dexmor-assets.rng. A file passed through as text gives\n"
    "          its text, escaped, in a <passedThrough> element.\n"
    "      -q, --quiet\n"
    "          Says only what went wrong: no lines for files passed through as\n"
    "          text, no summary, no progress line.\n"
    "      --no-progress\n"
    "          No progress line.\n"
    "      --  Takes every later argument as a FILE, even one starting with '-'.\n"
    "\n"
    "      Examples:\n"
    "          dexmor xml scene.zelmat > scene.xml\n"
    "          dexmor xml -o converted/ scene.zelmat render.zelopt\n"
    "          dexmor xml -o converted/ -j 8 archive/\n"
    "          dexmor xml --kind zelmat - < lib.zelmat.bak > lib.xml\n"
    "\n"
    "  check [--json] [--strict] [--kind KIND] FILE...\n"
    "      Tells for each FILE, in one line, what it holds when it reads as a\n"
    "      binary file of the kind its extension names (\"material library,\n"
    "      generation 3, 12 materials\", \"render options, version 23\"), or\n"
    "      \"not readable as binary\", why (the record, the byte offset and what\n"
    "      was wrong there), and what the conversion returns instead. Then one\n"
    "      line for each warning of the lint of its document: an asset url given\n"
    "      to several assets, a reference that names no asset of the document, a\n"
    "      url holding a character XML 1.0 cannot carry. --json writes one JSON\n"
    "      object per FILE a line (path, kind, reads_as_binary, description,\n"
    "      reason, offset, record_path, fallback_bytes, warnings). --strict\n"
    "      counts a warning as a failure.\n"
    "\n"
    "      Example:\n"
    "          dexmor check scene.zelmat render.zelopt\n"
    "\n"
    "  list [--json] [--kind KIND] FILE...\n"
    "      For a material library, one line per material: its index, name and\n"
    "      kind, and the url of its asset, or \"no asset\" for a material that\n"
    "      folds into none (multi, single-BRDF, instance). For render options, the\n"
    "      version and the settings assets present. --json: one JSON object per\n"
    "      FILE a line.\n"
    "\n"
    "  explain [--json] [--offset N] [--depth K] [--kind KIND] FILE\n"
    "      Shows FILE as the reader reads it, one line per item, indented by\n"
    "      nesting: the header and the archive's chunks; each record with its\n"
    "      byte range, record path, kind id, class and version; each value with\n"
    "      its offset, size, name, encoding, bytes (the first 16) and decoded\n"
    "      value; the bytes no record reads; and where the reading failed, with\n"
    "      the rest shown as one undecoded range. --json: the same tree as one\n"
    "      JSON document. --offset N: only what contains byte N. --depth K: only\n"
    "      K levels below the file.\n"
    "\n"
    "Options:\n"
    "  -h, --help   Shows this help.\n"
    "  --version    Shows the version.\n"
    "\n"
    "Exit status:\n"
    "  xml    0 when every document was written; 1 when an output could not be\n"
    "         written or a document would exceed the output budget; 2 for wrong\n"
    "         usage or a FILE that was not converted (unknown extension, missing,\n"
    "         not a regular file, or not readable in full); 3 with --strict for a\n"
    "         FILE that does not read as binary. The other FILEs are still\n"
    "         converted; the lowest of these that applies is the status.\n"
    "  check  0 when every FILE reads as binary (and with --strict has no\n"
    "  list   warning); 1 when one does not; 2 for wrong usage or a FILE with an\n"
    "         unknown extension.\n"
    "  explain  0 when FILE reads as binary; 1 when it does not (the explanation\n"
    "         shows where) or the output cannot be written; 2 for wrong usage or a\n"
    "         FILE that cannot be read.\n"
    "\n"
    "More in 'man dexmor'. From Python: Dexmor.getZelmatXml, Dexmor.getZeloptXml,\n"
    "Dexmor.diagnose and Dexmor.explain.\n";

namespace {

struct Command {
    std::string_view name;
    int (*run)(Args args);
};

constexpr Command commands[] = {
    {"xml", runXml},
    {"check", runCheck},
    {"list", runList},
    {"explain", runExplain},
};

int run(Args args) {
    if (args.empty()) return usageError({"no command given"});
    const std::string_view first = args.front();
    if (first == "-h" || first == "--help") return showText(helpText);
    if (first == "--version") return showText("dexmor " DEXMOR_VERSION_STRING "\n");
    for (const Command& command : commands)
        if (command.name == first) return command.run(args.subspan(1));
    if (first.starts_with('-')) return usageError({"unknown option '", first, "'"});
    return usageError({"unknown command '", first, "'"});
}

} // namespace

} // namespace dexmor

int main(int argc, char** argv) {
    using namespace dexmor;
    // A write beyond the file-size limit then fails with EFBIG and is reported as
    // any failed write, instead of killing the tool halfway through a batch.
    std::signal(SIGXFSZ, SIG_IGN);
    // An interrupted batch leaves whole documents only.
    OrvexKavorCore::AtomicFileSink::removeTemporariesOnSignals();
    try {
        const std::vector<std::string_view> args(argv + (argc > 0 ? 1 : 0), argv + argc);
        return run(args);
    } catch (const std::bad_alloc&) {
        complain({"out of memory"});
    } catch (const std::exception& error) {
        complain({error.what()});
    } catch (...) {
        complain({"unexpected failure"});
    }
    return Failed;
}
