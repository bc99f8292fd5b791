// consumer FILE: writes the XML of FILE (kind by its extension) to standard output.
#include "archive/Conversion.hpp"

#include <cstdio>
#include <optional>
#include <string>

int main(int argc, char** argv) {
    if (argc != 2) return 2;
    const std::optional<OrvexKavorCore::FileKind> kind = OrvexKavorCore::fileKindOf(argv[1]);
    if (!kind) return 2;
    const std::string xml = OrvexKavorCore::convertToXml(*kind, argv[1]);
    return std::fwrite(xml.data(), 1, xml.size(), stdout) == xml.size() ? 0 : 1;
}
