// dexmor xml [-o DIR] [-j N] [--max-output BYTES] FILE...
//
// Converts each FILE and writes its document to standard output (in argument
// order) or, with -o, to DIR/<file name>.xml. With -o the files are converted on
// N threads at once; each document is streamed into a file that takes the
// target's place only when complete, so no reader ever sees half a document, and
// a file that cannot be read or whose XML would exceed the output budget leaves
// its target as it was.
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
    core::ConversionOptions options;
    std::vector<std::string_view> files;
};

unsigned coreCount() { return std::max(1u, std::thread::hardware_concurrency()); }

std::optional<unsigned> parseJobs(std::string_view text) {
    unsigned jobs = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), jobs);
    if (error != std::errc() || end != text.data() + text.size() || jobs == 0 || jobs > 1024) return std::nullopt;
    return jobs;
}

std::optional<std::uint64_t> parseBytes(std::string_view text) {
    std::uint64_t bytes = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), bytes);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return bytes;
}

enum class Match { No, Missing, Found };

// Whether args[i] is the option with these names, given as "-o DIR", "-oDIR",
// "--output DIR" or "--output=DIR"; `value` receives its value.
Match optionValue(Args args, std::size_t& i, std::string_view shortName, std::string_view longName,
                  std::string_view& value) {
    const std::string_view arg = args[i];
    if ((!shortName.empty() && arg == shortName) || arg == longName) {
        if (i + 1 == args.size()) return Match::Missing;
        value = args[++i];
        return Match::Found;
    }
    if (arg.starts_with(longName) && arg.size() > longName.size() && arg[longName.size()] == '=') {
        value = arg.substr(longName.size() + 1);
        return Match::Found;
    }
    if (!shortName.empty() && !arg.starts_with("--") && arg.starts_with(shortName)) {
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
        } else if (const Match budget = optionValue(args, i, "", "--max-output", value); budget != Match::No) {
            if (budget == Match::Missing) return refuse({"xml: option ", arg, " needs a number of bytes"});
            const std::optional<std::uint64_t> bytes = parseBytes(value);
            if (!bytes) return refuse({"xml: the output budget must be a number of bytes (0: no limit), not '", value, "'"});
            parsed.options.maxOutput = *bytes;
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
            complain({shownName(name), ": not converted, the name ends in neither .zelmat nor .zelopt"});
            rejected = true;
        } else if (const std::optional<std::string> why = unreadable(file)) {
            complain({shownName(name), ": not converted, ", *why});
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

// How one FILE's conversion ended, with the message for the user when it failed.
struct Outcome {
    int status = Success; // Success, Failed or Rejected
    std::string message;
};

// The outcome of a conversion that did not give a whole document, or nullopt
// when it did.
std::optional<Outcome> incomplete(const Job& job, const core::Diagnosis& result) {
    if (!result.opened) return Outcome{Rejected, shownName(job.name) + ": not converted, " + result.reason()};
    if (result.exceededBudget)
        return Outcome{Failed, shownName(job.name) + ": the XML would exceed " + std::to_string(*result.exceededBudget) +
                                   " bytes (the output budget; --max-output to change it)"};
    return std::nullopt;
}

// Converts one FILE into its target under -o, counting the bytes written.
Outcome convertToFile(const Job& job, const core::ConversionOptions& options, std::uint64_t& bytesWritten) {
    // The document goes to a file that has not taken the target's place yet, so a
    // library can be read once: what it sent before failing is taken back, and
    // the pass-through text follows.
    core::AtomicFileSink output(job.target);
    bytesWritten = 0;
    try {
        UpToFirstNul cut(output);
        if (std::optional<Outcome> failed = incomplete(job, core::convert(job.kind, job.file, cut, options)))
            return *failed; // the target stays as it was
    } catch (const std::bad_alloc&) {
        return {Failed, shownName(job.name) + ": conversion failed: out of memory"};
    } catch (const std::exception& error) {
        return {Failed, shownName(job.name) + ": conversion failed: " + error.what()};
    }
    std::string error;
    if (!output.commit(&error)) return {Failed, error};
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
            complain({shownName(job.name), ": not written, ", shownName(job.target.native()),
                      " already holds the document of ", shownName(earlier->second.native())});
            failed = true;
        }
    }
    return kept;
}

// Converts the jobs on up to `threads` threads, showing progress; the exit status.
int convertAll(const std::vector<Job>& jobs, const core::ConversionOptions& options, unsigned threads) {
    std::vector<Outcome> outcomes(jobs.size());
    std::atomic<std::size_t> next{0};
    std::atomic<std::size_t> done{0};
    std::atomic<std::uint64_t> written{0};
    const auto work = [&] {
        for (std::size_t i; (i = next.fetch_add(1)) < jobs.size();) {
            std::uint64_t bytes = 0;
            outcomes[i] = convertToFile(jobs[i], options, bytes);
            written += bytes;
            ++done;
        }
    };

    ProgressLine progress(jobs.size());
    {
        std::vector<std::jthread> workers;
        // When the system gives fewer threads than asked for, those it gave do the work.
        const auto startWorker = [&] {
            try {
                workers.emplace_back(work);
                return true;
            } catch (const std::system_error&) {
                return false;
            }
        };
        for (unsigned t = 1; t < threads && startWorker();) ++t;
        if (!progress.shown() || (workers.empty() && !startWorker())) {
            work();
        } else {
            // The main thread draws the progress line while the workers convert.
            while (done < jobs.size()) {
                progress.update(done, written);
                std::this_thread::sleep_for(std::chrono::milliseconds(200));
            }
        }
    }
    progress.finish(done, written);

    int status = Success;
    for (const Outcome& outcome : outcomes)
        if (outcome.status != Success) {
            complain({outcome.message});
            status = worse(status, outcome.status);
        }
    return status;
}

// Streams each document to standard output in argument order, in writes of up
// to a quarter megabyte; the exit status. A document that would exceed the
// output budget ends the output: what was written of it stays, and nothing
// more follows.
int writeAllToStandardOutput(const std::vector<Job>& jobs, const core::ConversionOptions& options) {
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
    int status = Success;
    for (const Job& job : jobs) {
        UpToFirstNul cut(toOutput);
        try {
            if (const std::optional<Outcome> failed = incomplete(job, core::convert(job.kind, job.file, cut, options))) {
                complain({failed->message});
                status = worse(status, failed->status);
                if (failed->status == Failed) break;
            }
        } catch (const std::exception& error) {
            complain({shownName(job.name), ": conversion failed: ", error.what()});
            status = Failed;
        }
        if (outputGone) break; // standard output is gone; the other documents have nowhere to go
    }
    if (!pending.empty() && !outputGone) outputGone = !out.write(pending);
    if (!out.finish() || outputGone) status = Failed;
    return status;
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
    int status = Success;
    if (!parsed->outputDir) {
        status = writeAllToStandardOutput(jobs, parsed->options);
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
        status = convertAll(jobs, parsed->options, threads);
    }
    if (failed) status = worse(status, Failed);
    if (rejected) status = worse(status, Rejected);
    return status;
}

} // namespace dexmor
