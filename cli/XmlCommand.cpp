// dexmor xml [-o DIR] [-j N] [--max-output BYTES] [--kind KIND] [--strict] [--wrap] [-q] [--no-progress] FILE...
//
// Converts each FILE (a folder: every file of both kinds beneath it; "-": standard
// input) and writes its document to standard output (in argument order) or, with
// -o, to DIR/<file name>.xml (files found in a folder: DIR/<path beneath it>.xml).
// With -o the files are converted on N threads at once; each document is
// streamed into a file that takes the target's place only when complete, so no
// reader ever sees half a document, and a file that cannot be read or whose XML
// would exceed the output budget leaves its target as it was. Every file that
// does not read as binary is reported on standard error with the reason.
#include "Commands.hpp"
#include "Inputs.hpp"
#include "Options.hpp"
#include "OutputSink.hpp"
#include "Progress.hpp"

#include <dexmor/dexmor.hpp>

#include <algorithm>
#include <atomic>
#include <charconv>
#include <exception>
#include <filesystem>
#include <map>
#include <new>
#include <optional>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

namespace dexmor {

namespace {

namespace core = OrvexKavorCore;
namespace fs = std::filesystem;

struct XmlArgs {
    std::optional<fs::path> outputDir;
    unsigned jobs = 0; // 0: one per core
    bool jobsGiven = false;
    std::optional<core::FileKind> kind;
    bool strict = false;
    bool quiet = false;
    bool progress = true;
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
        } else if (arg == "--strict") {
            parsed.strict = true;
        } else if (arg == "--wrap") {
            parsed.options.wrap = true;
        } else if (arg == "-q" || arg == "--quiet") {
            parsed.quiet = true;
        } else if (arg == "--no-progress") {
            parsed.progress = false;
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
            parsed.jobsGiven = true;
        } else if (const Match budget = optionValue(args, i, "", "--max-output", value); budget != Match::No) {
            if (budget == Match::Missing) return refuse({"xml: option ", arg, " needs a number of bytes"});
            const std::optional<std::uint64_t> bytes = parseBytes(value);
            if (!bytes) return refuse({"xml: the output budget must be a number of bytes (0: no limit), not '", value, "'"});
            parsed.options.maxOutput = *bytes;
        } else if (const Match kind = optionValue(args, i, "", "--kind", value); kind != Match::No) {
            if (kind == Match::Missing) return refuse({"xml: option ", arg, " needs zelmat or zelopt"});
            parsed.kind = parseKind(value);
            if (!parsed.kind) return refuse({"xml: the kind must be zelmat or zelopt, not '", value, "'"});
        } else {
            return refuse({"xml: unknown option '", arg, "'"});
        }
    }
    if (parsed.files.empty()) return refuse({"xml: no FILE given"});
    parsed.options.passThrough = !parsed.strict;
    return parsed;
}

// A source to convert, and with -o where its document goes.
struct Job {
    Source source;
    fs::path target;
};

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

// How one source's conversion ended.
struct Outcome {
    enum Kind { Converted, PassedThrough, NotConverted } kind = Converted;
    int status = Success; // Success, Failed, Rejected or Strict
    std::string message;  // for the user; empty when there is nothing to say
};

std::string_view whatItIsNot(core::FileKind kind) {
    return kind == core::FileKind::MaterialLibrary ? "not a readable material library"
                                                   : "not a readable render-options file";
}

// What a finished conversion tells the user, from its result.
Outcome outcomeOf(const Source& source, const core::Diagnosis& result, bool strict) {
    const std::string name = shownName(source.name);
    if (!result.opened) return {Outcome::NotConverted, Rejected, name + ": not converted, " + result.reason()};
    if (result.exceededBudget)
        return {Outcome::NotConverted, Failed,
                name + ": the XML would exceed " + std::to_string(*result.exceededBudget) +
                    " bytes (the output budget; --max-output to change it)"};
    if (result.readsAsBinary) return {};
    std::string message = name + ": " + std::string(whatItIsNot(source.kind)) + " (" + result.reason() + "); ";
    if (strict) return {Outcome::NotConverted, Strict, message + "not written (--strict)"};
    return {Outcome::PassedThrough, Success,
            message + "wrote its text instead (" + std::to_string(result.fallbackLength) + " bytes)"};
}

// Converts one source into its target under -o, counting the bytes written.
Outcome convertToFile(const Job& job, const XmlArgs& args, std::uint64_t& bytesWritten) {
    // The document goes to a file that has not taken the target's place yet, so a
    // library can be read once: what it sent before failing is taken back, and
    // the pass-through text follows.
    if (std::error_code error; !fs::create_directories(job.target.parent_path(), error) && error)
        return {Outcome::NotConverted, Failed,
                "cannot create directory " + shownName(job.target.parent_path().native()) + ": " + error.message()};
    core::AtomicFileSink output(job.target);
    bytesWritten = 0;
    Outcome outcome;
    try {
        UpToFirstNul cut(output);
        outcome = outcomeOf(job.source, core::convert(job.source.kind, job.source.input(), cut, args.options), args.strict);
    } catch (const std::bad_alloc&) {
        return {Outcome::NotConverted, Failed, shownName(job.source.name) + ": conversion failed: out of memory"};
    } catch (const std::exception& error) {
        return {Outcome::NotConverted, Failed, shownName(job.source.name) + ": conversion failed: " + error.what()};
    }
    if (outcome.kind == Outcome::NotConverted) return outcome; // the target stays as it was
    std::string error;
    if (!output.commit(&error)) return {Outcome::NotConverted, Failed, error};
    bytesWritten = output.bytesWritten();
    return outcome;
}

bool sameFile(const fs::path& a, const fs::path& b) {
    std::error_code ignored;
    return a == b || fs::equivalent(a, b, ignored);
}

// Gives each source its target beneath `dir`; two sources whose documents would
// land in the same target are refused after the first.
std::vector<Job> jobsWithTargets(std::vector<Source> sources, const fs::path& dir, bool& failed) {
    std::vector<Job> jobs;
    std::map<fs::path, const Source*> claimed; // target -> the source it is for
    jobs.reserve(sources.size());
    for (Source& source : sources) {
        fs::path target = dir / source.outputName;
        const auto earlier = claimed.find(target);
        if (earlier == claimed.end()) {
            jobs.push_back(Job{std::move(source), std::move(target)});
            claimed.emplace(jobs.back().target, &jobs.back().source);
        } else if (!sameFile(earlier->second->file, source.file)) {
            complain({shownName(source.name), ": not written, ", shownName(target.native()),
                      " already holds the document of ", shownName(earlier->second->name)});
            failed = true;
        }
    }
    return jobs;
}

// The line after a batch: "304 converted, 3 passed through as text, 1 not converted".
std::string summaryOf(const std::vector<Outcome>& outcomes, std::size_t refused) {
    std::size_t counts[3] = {0, 0, refused};
    for (const Outcome& outcome : outcomes) ++counts[outcome.kind];
    return std::to_string(counts[Outcome::Converted]) + " converted, " + std::to_string(counts[Outcome::PassedThrough]) +
           " passed through as text, " + std::to_string(counts[Outcome::NotConverted]) + " not converted";
}

// Converts the jobs on up to `threads` threads, showing progress; the exit status.
int convertAll(const std::vector<Job>& jobs, const XmlArgs& args, unsigned threads, std::size_t refused) {
    std::vector<Outcome> outcomes(jobs.size());
    std::atomic<std::size_t> next{0};
    std::atomic<std::size_t> done{0};
    std::atomic<std::uint64_t> written{0};
    const auto work = [&] {
        for (std::size_t i; (i = next.fetch_add(1)) < jobs.size();) {
            std::uint64_t bytes = 0;
            outcomes[i] = convertToFile(jobs[i], args, bytes);
            written += bytes;
            ++done;
        }
    };

    ProgressLine progress(jobs.size(), args.progress && !args.quiet);
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
    for (const Outcome& outcome : outcomes) {
        if (!outcome.message.empty() && (!args.quiet || outcome.status != Success)) complain({outcome.message});
        status = worse(status, outcome.status);
    }
    if (!args.quiet) complain({summaryOf(outcomes, refused)});
    return status;
}

// Streams each document to standard output in argument order; the exit status.
// A document that would exceed the output budget ends the output: nothing more
// follows, and what was written of it stays unless the output could take it back.
int writeAllToStandardOutput(const std::vector<Source>& sources, const XmlArgs& args) {
    StandardOutputSink out;
    int status = Success;
    for (const Source& source : sources) {
        out.beginDocument();
        UpToFirstNul cut(out);
        try {
            const Outcome outcome =
                outcomeOf(source, core::convert(source.kind, source.input(), cut, args.options), args.strict);
            if (!outcome.message.empty() && (!args.quiet || outcome.status != Success)) complain({outcome.message});
            status = worse(status, outcome.status);
            if (outcome.status == Failed) break;
        } catch (const std::exception& error) {
            complain({shownName(source.name), ": conversion failed: ", error.what()});
            status = Failed;
        }
        if (out.gone()) break; // standard output is gone; the other documents have nowhere to go
    }
    if (!out.finish()) status = Failed;
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
    std::vector<Source> sources = sourcesOf(parsed->files, parsed->kind, {"converted", true}, rejected);
    int status = Success;
    if (!parsed->outputDir) {
        if (parsed->jobsGiven && !parsed->quiet)
            complain({"xml: -j applies with -o only; the files are converted one at a time"});
        status = writeAllToStandardOutput(sources, *parsed);
    } else {
        std::error_code error;
        fs::create_directories(*parsed->outputDir, error);
        if (error || !fs::is_directory(*parsed->outputDir, error)) {
            complain({"cannot create directory ", shownName(parsed->outputDir->native()), ": ",
                      error ? error.message() : std::string("it is not a directory")});
            return Failed;
        }
        const std::size_t named = sources.size();
        std::vector<Job> jobs = jobsWithTargets(std::move(sources), *parsed->outputDir, failed);
        const unsigned threads = std::clamp<std::size_t>(parsed->jobs ? parsed->jobs : coreCount(), 1,
                                                          std::max<std::size_t>(jobs.size(), 1));
        status = convertAll(jobs, *parsed, threads, named - jobs.size());
    }
    if (failed) status = worse(status, Failed);
    if (rejected) status = worse(status, Rejected);
    return status;
}

} // namespace dexmor
