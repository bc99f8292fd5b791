#include "Inputs.hpp"

#include "Output.hpp"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <set>
#include <system_error>

#include <sys/stat.h>
#include <unistd.h>

namespace dexmor {

namespace {

namespace core = OrvexKavorCore;
namespace fs = std::filesystem;

// Standard input, read whole the first time it is asked for.
const std::string& standardInput() {
    static const std::string bytes = [] {
        std::string read;
        char buffer[1 << 16];
        for (;;) {
            const ssize_t n = ::read(STDIN_FILENO, buffer, sizeof buffer);
            if (n < 0 && errno == EINTR) continue;
            if (n <= 0) break;
            read.append(buffer, static_cast<std::size_t>(n));
        }
        return read;
    }();
    return bytes;
}

// Why `path` cannot be read as a file, or nullopt when it can.
std::optional<std::string> unreadable(const fs::path& path) {
    struct stat info {};
    if (::stat(path.c_str(), &info) != 0) return std::strerror(errno);
    if (!S_ISREG(info.st_mode)) return "is not a regular file";
    if (::access(path.c_str(), R_OK) != 0) return std::strerror(errno);
    return std::nullopt;
}

fs::path withXml(fs::path name) {
    name += ".xml";
    return name;
}

// The files of both kinds beneath `folder`, by path.
std::vector<Source> folderSources(std::string_view argument, const fs::path& folder, Taking taking,
                                  bool& rejected) {
    std::vector<Source> found;
    std::error_code error;
    fs::recursive_directory_iterator walk(folder, fs::directory_options::skip_permission_denied, error);
    for (; !error && walk != fs::recursive_directory_iterator(); walk.increment(error)) {
        const fs::directory_entry& entry = *walk;
        std::error_code ignored;
        if (!entry.is_regular_file(ignored)) continue;
        const std::optional<core::FileKind> kind = core::fileKindOf(entry.path().native());
        if (!kind) continue;
        const fs::path relative = entry.path().lexically_relative(folder);
        found.push_back(Source{entry.path().native(), entry.path(), *kind, withXml(relative)});
    }
    if (error) {
        complain({shownName(argument), ": not read in full, ", error.message()});
        rejected = true;
    } else if (found.empty()) {
        complain({shownName(argument), ": not ", taking.done, ", it holds no .zelmat or .zelopt file"});
        rejected = true;
    }
    std::sort(found.begin(), found.end(), [](const Source& a, const Source& b) { return a.file < b.file; });
    return found;
}

} // namespace

core::Input Source::input() const {
    if (isStandardInput()) return core::Input::ofBytes(standardInput());
    return file;
}

std::vector<Source> sourcesOf(const std::vector<std::string_view>& arguments, std::optional<core::FileKind> kind,
                              Taking taking, bool& rejected) {
    std::vector<Source> sources;
    std::set<fs::path> seen;
    const auto add = [&](Source source) {
        std::error_code ignored;
        const fs::path canonical = fs::weakly_canonical(source.file, ignored);
        if (source.isStandardInput() || seen.insert(canonical.empty() ? source.file : canonical).second)
            sources.push_back(std::move(source));
    };
    for (const std::string_view argument : arguments) {
        const fs::path path{std::string(argument)};
        std::error_code error;
        if (argument == "-") {
            if (!kind) {
                complain({"-: not ", taking.done, ", standard input needs --kind zelmat or --kind zelopt"});
                rejected = true;
            } else {
                add(Source{"-", {}, *kind, "stdin." + std::string(core::extensionOf(*kind)) + ".xml"});
            }
        } else if (fs::is_directory(path, error)) {
            for (Source& source : folderSources(argument, path, taking, rejected)) add(std::move(source));
        } else if (const std::optional<core::FileKind> named = kind ? kind : core::fileKindOf(argument); !named) {
            complain({shownName(argument), ": not ", taking.done,
                      ", the name ends in neither .zelmat nor .zelopt (--kind names it)"});
            rejected = true;
        } else if (const std::optional<std::string> why = taking.refuseUnreadable ? unreadable(path) : std::nullopt) {
            complain({shownName(argument), ": not ", taking.done, ", ", *why});
            rejected = true;
        } else {
            add(Source{std::string(argument), path, *named, withXml(path.filename())});
        }
    }
    return sources;
}

} // namespace dexmor
