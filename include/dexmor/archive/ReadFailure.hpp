#pragma once
#include <cstdint>
#include <string>
#include <vector>

namespace OrvexKavorCore {

// Why a read failed: a short reason, the read offset at that moment, and the path
// of records the reader was in, one entry per level, outermost first:
// {"material 3 \"Oak\"", "BRDF layer 2 \"Reflection\"", "texture \"color_tex\""}.
// Fields are named as the XML names them where the XML shows them.
struct ReadFailure {
    std::string reason;
    std::uint64_t offset = 0;
    std::vector<std::string> recordPath;

    // The levels joined by " / ".
    std::string recordPathText() const;
    // "material 3 \"Oak\" / BRDF layer 2: unknown texture kind 41 at offset 1834"
    std::string describe() const;
};

} // namespace OrvexKavorCore
