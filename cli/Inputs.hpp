#pragma once
// What the command line names to read: files, folders (every .zelmat and .zelopt
// file beneath them), and "-" for standard input.
#include <dexmor/dexmor.hpp>

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace dexmor {

struct Source {
    std::string name;                // as messages show it: the argument, or the path of a file found in a folder
    std::filesystem::path file;      // empty for standard input
    OrvexKavorCore::FileKind kind;
    std::filesystem::path outputName; // where "-o DIR" puts the document, relative to DIR

    bool isStandardInput() const { return file.empty(); }
    // The input of the conversion: the file, or the bytes read from standard input.
    OrvexKavorCore::Input input() const;
};

// How a command takes the arguments: the word its messages use for what it
// does ("converted"), and whether a FILE that cannot be read is refused at once
// (else the command reports it as its reading finds it).
struct Taking {
    std::string_view done;
    bool refuseUnreadable;
};

// The sources the arguments name, in order (a folder's files sorted by path).
// `kind`, when given, is the kind of standard input and of every FILE named
// (files found in folders go by their extension). Each argument that gives
// nothing to read is reported ("dexmor: x.txt: not converted, ..."), and
// `rejected` set; a FILE named twice is read once.
std::vector<Source> sourcesOf(const std::vector<std::string_view>& arguments,
                              std::optional<OrvexKavorCore::FileKind> kind, Taking taking, bool& rejected);

} // namespace dexmor
