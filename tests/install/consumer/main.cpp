// consumer FILE: writes the XML of FILE (kind by its extension) to standard output.
// It includes the front header only, as a program converting files does.
#include <dexmor/dexmor.hpp>

#include <cstdio>
#include <optional>
#include <string>

int main(int argc, char** argv) {
    if (argc != 2) return 2;
    const std::optional<OrvexKavorCore::FileKind> kind = OrvexKavorCore::fileKindOf(argv[1]);
    if (!kind) return 2;
    bool written = true;
    OrvexKavorCore::CallbackSink out([&written](std::string_view piece) {
        written = written && std::fwrite(piece.data(), 1, piece.size(), stdout) == piece.size();
    });
    OrvexKavorCore::convert(*kind, argv[1], out);
    return written ? 0 : 1;
}
