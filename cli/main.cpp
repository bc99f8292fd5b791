// dexmor: the command-line tool over the conversion that the Python module offers.
//
//   dexmor xml [-o DIR] FILE...
//
// Each subcommand is one entry in `commands` below: a name and a function that
// receives the arguments after the name. The tool itself holds no conversion
// logic; it calls OrvexKavorCore::convertToXml and writes what comes back.
#include "archive/Conversion.hpp"
#include "platform/FileIo.hpp"
#include "platform/Text.hpp"

#include <cerrno>
#include <cstring>
#include <exception>
#include <filesystem>
#include <map>
#include <new>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <sys/stat.h>
#include <unistd.h>

namespace {

namespace core = OrvexKavorCore;
namespace fs = std::filesystem;

using Args = std::span<const std::string_view>;

// Exit statuses. When several things go wrong, OutputFailed wins over Rejected.
constexpr int Success = 0;
constexpr int OutputFailed = 1; // an output could not be written, or a conversion failed
constexpr int Rejected = 2;     // bad usage, or a FILE that cannot be converted

constexpr std::string_view helpText =
    "Usage: dexmor COMMAND [OPTIONS] FILE...\n"
    "       dexmor --help | --version\n"
    "\n"
    "Turns material libraries (.zelmat) and render-options files (.zelopt) into\n"
    "XML asset documents.\n"
    "\n"
    "Commands:\n"
    "  xml [-o DIR] FILE...\n"
    "      Converts each FILE by its extension (.zelmat or .zelopt, in any letter\n"
    "      case) and writes the documents to standard output one after the other,\n"
    "      adding nothing between them. A file that is not in the binary format\n"
    "      is taken to be XML text already and is written as it stands.\n"
    "\n"
    "      -o DIR, --output DIR\n"
    "          Writes each document to DIR/<file name>.xml instead (scene.zelmat\n"
    "          gives DIR/scene.zelmat.xml). DIR is created if it is missing.\n"
    "      --  Takes every later argument as a FILE, even one starting with '-'.\n"
    "\n"
    "      Examples:\n"
    "          dexmor xml scene.zelmat > scene.xml\n"
    "          dexmor xml -o converted/ scene.zelmat render.zelopt\n"
    "\n"
    "Options:\n"
    "  -h, --help   Shows this help.\n"
    "  --version    Shows the version.\n"
    "\n"
    "Exit status: 0 when every document was written; 1 when an output could not\n"
    "be written; 2 for wrong usage or a FILE that was not converted (unknown\n"
    "extension, missing or not a regular file). The other FILEs are still\n"
    "converted.\n";

// Writes all of `data` to a file descriptor. False, with errno set, on failure.
bool writeAll(int fd, std::string_view data) {
    while (!data.empty()) {
        const ssize_t n = ::write(fd, data.data(), data.size());
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) {
            if (n == 0) errno = EIO;
            return false;
        }
        data.remove_prefix(static_cast<std::size_t>(n));
    }
    return true;
}

// One line on standard error: "dexmor: " and the pieces.
void complain(std::initializer_list<std::string_view> pieces) {
    std::string line = "dexmor: ";
    for (std::string_view piece : pieces) line += piece;
    line += '\n';
    writeAll(STDERR_FILENO, line);
}

int usageError(std::initializer_list<std::string_view> pieces) {
    complain(pieces);
    writeAll(STDERR_FILENO, "Try 'dexmor --help' for more information.\n");
    return Rejected;
}

// Standard output, written unbuffered so that a failure shows at the write that
// meets it; finish() also checks the close.
class StandardOutput {
public:
    bool write(std::string_view data) {
        used_ = true;
        if (writeAll(STDOUT_FILENO, data)) return true;
        complain({"cannot write to standard output: ", std::strerror(errno)});
        return false;
    }
    bool finish() {
        if (!used_ || ::close(STDOUT_FILENO) == 0 || errno == EINTR) return true;
        complain({"cannot write to standard output: ", std::strerror(errno)});
        return false;
    }

private:
    bool used_ = false;
};

int showText(std::string_view text) {
    StandardOutput out;
    const bool written = out.write(text);
    return out.finish() && written ? Success : OutputFailed;
}

// Why `path` cannot be read as a file, or nullopt when it can.
std::optional<std::string> unreadable(const fs::path& path) {
    struct stat info {};
    if (::stat(path.c_str(), &info) != 0) return std::strerror(errno);
    if (S_ISDIR(info.st_mode)) return "is a directory";
    if (!S_ISREG(info.st_mode)) return "is not a regular file";
    if (::access(path.c_str(), R_OK) != 0) return std::strerror(errno);
    return std::nullopt;
}

// ---- dexmor xml ----------------------------------------------------------

struct XmlArgs {
    std::optional<fs::path> outputDir;
    std::vector<std::string_view> files;
};

// Parses the arguments of `xml`; nullopt after a usage message. `help` is set
// when the arguments ask for the help text.
std::optional<XmlArgs> parseXmlArgs(Args args, bool& help) {
    XmlArgs parsed;
    bool optionsEnd = false;
    for (std::size_t i = 0; i < args.size(); ++i) {
        const std::string_view arg = args[i];
        if (optionsEnd || arg.size() < 2 || arg[0] != '-') {
            parsed.files.push_back(arg);
            continue;
        }
        std::optional<std::string_view> dir;
        if (arg == "--") {
            optionsEnd = true;
        } else if (arg == "-h" || arg == "--help") {
            help = true;
            return parsed;
        } else if (arg == "-o" || arg == "--output") {
            if (i + 1 == args.size()) {
                usageError({"xml: option ", arg, " needs a directory"});
                return std::nullopt;
            }
            dir = args[++i];
        } else if (arg.starts_with("--output=")) {
            dir = arg.substr(9);
        } else if (arg.starts_with("-o")) {
            dir = arg.substr(2);
        } else {
            usageError({"xml: unknown option '", arg, "'"});
            return std::nullopt;
        }
        if (dir) {
            if (parsed.outputDir) {
                usageError({"xml: the output directory is given more than once"});
                return std::nullopt;
            }
            if (dir->empty()) {
                usageError({"xml: the output directory is empty"});
                return std::nullopt;
            }
            parsed.outputDir = fs::path(*dir);
        }
    }
    if (parsed.files.empty()) {
        usageError({"xml: no FILE given"});
        return std::nullopt;
    }
    return parsed;
}

// Where -o DIR puts the document of `file`: DIR/<file name>.xml.
fs::path outputPathOf(const fs::path& dir, const fs::path& file) {
    fs::path target = dir / file.filename();
    target += ".xml";
    return target;
}

bool sameFile(const fs::path& a, const fs::path& b) {
    std::error_code ignored;
    return a == b || fs::equivalent(a, b, ignored);
}

int runXml(Args args) {
    bool help = false;
    const std::optional<XmlArgs> parsed = parseXmlArgs(args, help);
    if (help) return showText(helpText);
    if (!parsed) return Rejected;

    if (parsed->outputDir) {
        std::error_code error;
        fs::create_directories(*parsed->outputDir, error);
        if (error || !fs::is_directory(*parsed->outputDir, error)) {
            complain({"cannot create directory ", parsed->outputDir->native(), ": ",
                      error ? error.message() : std::string("it is not a directory")});
            return OutputFailed;
        }
    }

    StandardOutput out;
    std::map<fs::path, fs::path> written; // output path -> the FILE it came from
    bool rejected = false;
    bool failed = false;
    for (const std::string_view name : parsed->files) {
        const fs::path file{std::string(name)};
        const std::optional<core::FileKind> kind = core::fileKindOf(name);
        if (!kind) {
            complain({name, ": not converted, the name ends in neither .zelmat nor .zelopt"});
            rejected = true;
            continue;
        }
        if (const std::optional<std::string> why = unreadable(file)) {
            complain({name, ": not converted, ", *why});
            rejected = true;
            continue;
        }

        std::string xml;
        try {
            xml = core::convertToXml(*kind, file);
        } catch (const std::exception& error) {
            complain({name, ": conversion failed: ", error.what()});
            failed = true;
            continue;
        }
        const std::string_view text = core::text::upToFirstNul(xml);

        if (!parsed->outputDir) {
            if (!out.write(text)) {
                failed = true;
                break; // standard output is gone; the other documents have nowhere to go
            }
            continue;
        }
        const fs::path target = outputPathOf(*parsed->outputDir, file);
        if (const auto earlier = written.find(target); earlier != written.end() && !sameFile(earlier->second, file)) {
            complain({name, ": not written, ", target.native(), " already holds the document of ",
                      earlier->second.native()});
            failed = true;
            continue;
        }
        std::string error;
        if (!core::writeFileAtomically(target, text, &error)) {
            complain({error});
            failed = true;
            continue;
        }
        written.emplace(target, file);
    }
    if (!out.finish()) failed = true;
    return failed ? OutputFailed : rejected ? Rejected : Success;
}

// ---- command table -------------------------------------------------------

struct Command {
    std::string_view name;
    int (*run)(Args args);
};

constexpr Command commands[] = {
    {"xml", runXml},
};

int run(Args args) {
    if (args.empty()) return usageError({"no command given"});
    const std::string_view first = args.front();
    if (first == "-h" || first == "--help") return showText(helpText);
    if (first == "--version") return showText("dexmor " DEXMOR_VERSION "\n");
    for (const Command& command : commands)
        if (command.name == first) return command.run(args.subspan(1));
    if (first.starts_with('-')) return usageError({"unknown option '", first, "'"});
    return usageError({"unknown command '", first, "'"});
}

} // namespace

int main(int argc, char** argv) {
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
    return OutputFailed;
}
