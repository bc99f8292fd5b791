#pragma once
#include <cstdint>
#include <string>

namespace OrvexKavorCore {

// Why a read failed: a short reason, the read offset at that moment, and the path
// of records the reader was in ("material 3 / BRDF layer 2 / texture color_tex").
struct ReadFailure {
    std::string reason;
    std::uint64_t offset = 0;
    std::string recordPath;

    // "material 3 / BRDF layer 2: unknown texture kind 41 at offset 1834"
    std::string describe() const;
};

} // namespace OrvexKavorCore
