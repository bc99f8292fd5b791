// dexmor xml [-o DIR] [-j N] FILE...
//
// Converts each FILE and writes its document to standard output (in argument
// order) or, with -o, to DIR/<file name>.xml. With -o the files are converted on
// N threads at once; each document is streamed into a temporary file beside its
// target and renamed over it when complete, so no reader ever sees half a document.
#include "Commands.hpp"
#include "Progress.hpp"

#include <dexmor/dexmor.hpp>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <exception>
#include <filesystem>
#include <map>
#include <new>
#include <optional>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

#include <sys/stat.h>
#include <unistd.h>

namespace dexmor {

namespace {

namespace core = OrvexKavorCore;
namespace fs = std::filesystem;

struct XmlArgs {
    std::optional<fs::path> outputDir;
    unsigned jobs = 0; // 0: one per core
    std::vector<std::string_view> files;
};

unsigned coreCount() { return std::max(1u, std::thread::hardware_concurrency()); }

std::optional<unsigned> parseJobs(std::string_view text) {
    unsigned jobs = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), jobs);
    if (error != std::errc() || end != text.data() + text.size() || jobs == 0 || jobs > 1024) return std::nullopt;
    return jobs;
}

enum class Match { No, Missing, Found };

// Whether args[i] is the option with these names, given as "-o DIR", "-oDIR",
// "--output DIR" or "--output=DIR"; `value` receives its value.
Match optionValue(Args args, std::size_t& i, std::string_view shortName, std::string_view longName,
                  std::string_view& value) {
    const std::string_view arg = args[i];
    if (arg == shortName || arg == longName) {
        if (i + 1 == args.size()) return Match::Missing;
        value = args[++i];
        return Match::Found;
    }
    if (arg.starts_with(longName) && arg.size() > longName.size() && arg[longName.size()] == '=') {
        value = arg.substr(longName.size() + 1);
        return Match::Found;
    }
    if (!arg.starts_with("--") && arg.starts_with(shortName)) {
        value = arg.substr(shortName.size());
        return Match::Found;
    }
    return Match::No;
}

std::nullopt_t refuse(std::initializer_list<std::string_view> pieces) {
    usageError(pieces);
    return std::nullopt;
}

// Parses the arguments of `xml`; nullopt after a usage message. `help` is set when
// the arguments ask for the help text.
std::optional<XmlArgs> parseXmlArgs(Args args, bool& help) {
    XmlArgs parsed;
    bool optionsEnd = false;
    for (std::size_t i = 0; i < args.size(); ++i) {
        const std::string_view arg = args[i];
        std::string_view value;
        if (optionsEnd || arg.size() < 2 || arg[0] != '-') {
            parsed.files.push_back(arg);
        } else if (arg == "--") {
            optionsEnd = true;
        } else if (arg == "-h" || arg == "--help") {
            help = true;
            return parsed;
        } else if (const Match output = optionValue(args, i, "-o", "--output", value); output != Match::No) {
            if (output == Match::Missing) return refuse({"xml: option ", arg, " needs a directory"});
            if (parsed.outputDir) return refuse({"xml: the output directory is given more than once"});
            if (value.empty()) return refuse({"xml: the output directory is empty"});
            parsed.outputDir = fs::path(value);
        } else if (const Match jobs = optionValue(args, i, "-j", "--jobs", value); jobs != Match::No) {
            if (jobs == Match::Missing) return refuse({"xml: option ", arg, " needs a number of jobs"});
            const std::optional<unsigned> count = parseJobs(value);
            if (!count) return refuse({"xml: the number of jobs must be from 1 to 1024, not '", value, "'"});
            parsed.jobs = *count;
        } else {
            return refuse({"xml: unknown option '", arg, "'"});
        }
    }
    if (parsed.files.empty()) return refuse({"xml: no FILE given"});
    return parsed;
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

// A FILE to convert: what the command line named, and what it will be converted as.
struct Job {
    std::string_view name;
    fs::path file;
    core::FileKind kind;
    fs::path target; // with -o
};

// The jobs of the FILEs that can be converted; each one that cannot is reported.
std::vector<Job> jobsOf(const std::vector<std::string_view>& files, bool& rejected) {
    std::vector<Job> jobs;
    for (const std::string_view name : files) {
        const fs::path file{std::string(name)};
        const std::optional<core::FileKind> kind = core::fileKindOf(name);
        if (!kind) {
            complain({name, ": not converted, the name ends in neither .zelmat nor .zelopt"});
            rejected = true;
        } else if (const std::optional<std::string> why = unreadable(file)) {
            complain({name, ": not converted, ", *why});
            rejected = true;
        } else {
            jobs.push_back(Job{name, file, *kind, {}});
        }
    }
    return jobs;
}

// Sends a document on up to its first NUL, as the Python module's text ends there.
class UpToFirstNul final : public core::DocumentSink {
public:
    explicit UpToFirstNul(core::DocumentSink& next) : next_(next) {}
    void write(std::string_view piece) override {
        if (ended_) return;
        if (const auto nul = piece.find('\0'); nul != std::string_view::npos) {
            piece = piece.substr(0, nul);
            ended_ = true;
        }
        if (!piece.empty()) next_.write(piece);
    }
    bool canTakeBack() const override { return next_.canTakeBack(); }
    void takeBack() override {
        next_.takeBack();
        ended_ = false;
    }

private:
    core::DocumentSink& next_;
    bool ended_ = false;
};

// Converts one FILE into its target under -o, counting the bytes written. The
// message is empty on success.
std::string convertToFile(const Job& job, std::uint64_t& bytesWritten) {
    // The document goes to a temporary file, so a library can be read once: what
    // it sent before failing is taken back, and the pass-through text follows.
    core::AtomicFileSink output(job.target);
    bytesWritten = 0;
    try {
        UpToFirstNul cut(output);
        core::convert(job.kind, job.file, cut);
    } catch (const std::bad_alloc&) {
        return std::string(job.name) + ": conversion failed: out of memory";
    } catch (const std::exception& error) {
        return std::string(job.name) + ": conversion failed: " + error.what();
    }
    std::string error;
    if (!output.commit(&error)) return error;
    bytesWritten = output.bytesWritten();
    return {};
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

// Gives each job its target. A FILE named twice is converted once; two FILEs whose
// documents would land in the same target are refused after the first.
std::vector<Job> assignTargets(std::vector<Job> jobs, const fs::path& dir, bool& failed) {
    std::vector<Job> kept;
    std::map<fs::path, fs::path> claimed; // target -> the FILE it is for
    for (Job& job : jobs) {
        job.target = outputPathOf(dir, job.file);
        const auto [earlier, fresh] = claimed.emplace(job.target, job.file);
        if (fresh) {
            kept.push_back(std::move(job));
        } else if (!sameFile(earlier->second, job.file)) {
            complain({job.name, ": not written, ", job.target.native(), " already holds the document of ",
                      earlier->second.native()});
            failed = true;
        }
    }
    return kept;
}

// Converts the jobs on `threads` threads, showing progress; true when all succeeded.
bool convertAll(const std::vector<Job>& jobs, unsigned threads) {
    std::vector<std::string> messages(jobs.size());
    std::atomic<std::size_t> next{0};
    std::atomic<std::size_t> done{0};
    std::atomic<std::uint64_t> written{0};
    const auto work = [&] {
        for (std::size_t i; (i = next.fetch_add(1)) < jobs.size();) {
            std::uint64_t bytes = 0;
            messages[i] = convertToFile(jobs[i], bytes);
            written += bytes;
            ++done;
        }
    };

    ProgressLine progress(jobs.size());
    {
        std::vector<std::jthread> workers;
        for (unsigned t = 1; t < threads; ++t) workers.emplace_back(work);
        if (!progress.shown()) {
            work();
        } else {
            // The main thread draws the progress line while the workers convert.
            if (workers.empty()) workers.emplace_back(work);
            while (done < jobs.size()) {
                progress.update(done, written);
                std::this_thread::sleep_for(std::chrono::milliseconds(200));
            }
        }
    }
    progress.finish(done, written);

    bool allWritten = true;
    for (const std::string& message : messages)
        if (!message.empty()) {
            complain({message});
            allWritten = false;
        }
    return allWritten;
}

// Streams each document to standard output in argument order, in writes of up
// to a quarter megabyte.
bool writeAllToStandardOutput(const std::vector<Job>& jobs) {
    constexpr std::size_t kWriteSize = std::size_t{1} << 18;
    StandardOutput out;
    std::string pending;
    bool outputGone = false;
    const auto send = [&](std::string_view text) {
        pending.append(text);
        if (pending.size() >= kWriteSize) {
            outputGone = outputGone || !out.write(pending);
            pending.clear();
        }
    };
    core::CallbackSink toOutput([&](std::string_view piece) {
        if (!outputGone) send(piece);
    });
    bool ok = true;
    for (const Job& job : jobs) {
        UpToFirstNul cut(toOutput);
        try {
            core::convert(job.kind, job.file, cut);
        } catch (const std::exception& error) {
            complain({job.name, ": conversion failed: ", error.what()});
            ok = false;
        }
        if (outputGone) break; // standard output is gone; the other documents have nowhere to go
    }
    if (!pending.empty() && !outputGone) outputGone = !out.write(pending);
    return out.finish() && ok && !outputGone;
}

} // namespace

int runXml(Args args) {
    bool help = false;
    const std::optional<XmlArgs> parsed = parseXmlArgs(args, help);
    if (help) return showText(helpText);
    if (!parsed) return Rejected;

    bool rejected = false;
    bool failed = false;
    std::vector<Job> jobs = jobsOf(parsed->files, rejected);
    if (!parsed->outputDir) {
        failed = !writeAllToStandardOutput(jobs);
    } else {
        std::error_code error;
        fs::create_directories(*parsed->outputDir, error);
        if (error || !fs::is_directory(*parsed->outputDir, error)) {
            complain({"cannot create directory ", parsed->outputDir->native(), ": ",
                      error ? error.message() : std::string("it is not a directory")});
            return Failed;
        }
        jobs = assignTargets(std::move(jobs), *parsed->outputDir, failed);
        const unsigned threads = std::clamp<std::size_t>(parsed->jobs ? parsed->jobs : coreCount(), 1,
                                                          std::max<std::size_t>(jobs.size(), 1));
        if (!convertAll(jobs, threads)) failed = true;
    }
    return failed ? Failed : rejected ? Rejected : Success;
}

} // namespace dexmor
