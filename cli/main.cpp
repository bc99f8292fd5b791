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
    "XML asset documents.\n"
    "\n"
    "Commands:\n"
    "  xml [-o DIR] [-j N] [--max-output BYTES] FILE...\n"
    "      Converts each FILE by its extension (.zelmat or .zelopt, in any letter\n"
    "      case) and writes the documents to standard output one after the other,\n"
    "      adding nothing between them. A file that is not in the binary format\n"
    "      is taken to be XML text already and is written as it stands.\n"
    "\n"
    "      -o DIR, -oDIR, --output DIR, --output=DIR\n"
    "          Writes each document to DIR/<file name>.xml instead (scene.zelmat\n"
    "          gives DIR/scene.zelmat.xml). DIR is created if it is missing. A\n"
    "          document appears there only once it is complete.\n"
    "      -j N, -jN, --jobs N, --jobs=N\n"
    "          With -o, converts N files at a time (default: one per core). The\n"
    "          documents are the same whatever N is. When standard error is a\n"
    "          terminal, a progress line shows the files done, the rate and the\n"
    "          time left.\n"
    "      --max-output BYTES, --max-output=BYTES\n"
    "          The output budget: a document that would exceed BYTES is not\n"
    "          written (with -o its target is left as it was; on standard output\n"
    "          what was written of it stays and nothing more follows). Default:\n"
    "          the larger of 256 MiB and 1,000 times the FILE's size; 0: no limit.\n"
    "      --  Takes every later argument as a FILE, even one starting with '-'.\n"
    "\n"
    "      Examples:\n"
    "          dexmor xml scene.zelmat > scene.xml\n"
    "          dexmor xml -o converted/ scene.zelmat render.zelopt\n"
    "          dexmor xml -o converted/ -j 8 archive/*.zelmat\n"
    "\n"
    "  check FILE...\n"
    "      Tells for each FILE, in one line, what it holds when it reads as a\n"
    "      binary file of the kind its extension names (\"material library,\n"
    "      generation 3, 12 materials\", \"render options, version 23\"), or\n"
    "      \"not readable as binary\", why (the record, the byte offset and what\n"
    "      was wrong there), and what the conversion returns instead.\n"
    "\n"
    "      Example:\n"
    "          dexmor check scene.zelmat render.zelopt\n"
    "\n"
    "Options:\n"
    "  -h, --help   Shows this help.\n"
    "  --version    Shows the version.\n"
    "\n"
    "Exit status:\n"
    "  xml    0 when every document was written; 1 when an output could not be\n"
    "         written or a document would exceed the output budget; 2 for wrong\n"
    "         usage or a FILE that was not converted (unknown extension, missing,\n"
    "         not a regular file, or not readable in full). The other FILEs are\n"
    "         still converted.\n"
    "  check  0 when every FILE reads as binary; 1 when one does not; 2 for wrong\n"
    "         usage or a FILE with an unknown extension.\n"
    "\n"
    "More in 'man dexmor'. From Python: Dexmor.getZelmatXml, Dexmor.getZeloptXml\n"
    "and Dexmor.diagnose.\n";

namespace {

struct Command {
    std::string_view name;
    int (*run)(Args args);
};

constexpr Command commands[] = {
    {"xml", runXml},
    {"check", runCheck},
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
