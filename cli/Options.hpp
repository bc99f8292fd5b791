#pragma once
// Command-line options shared by the subcommands: the forms an option with a
// value may take, and the options naming what to read.
#include "Output.hpp"

#include <dexmor/dexmor.hpp>

#include <cstdint>
#include <optional>
#include <string_view>

namespace dexmor {

enum class Match { No, Missing, Found };

// Whether args[i] is the option with these names, given as "-o DIR", "-oDIR",
// "--output DIR" or "--output=DIR" (an empty short name: the long forms only);
// `value` receives its value, and `i` moves past it.
Match optionValue(Args args, std::size_t& i, std::string_view shortName, std::string_view longName,
                  std::string_view& value);

// "zelmat" or "zelopt".
std::optional<OrvexKavorCore::FileKind> parseKind(std::string_view text);
// A decimal count of bytes.
std::optional<std::uint64_t> parseBytes(std::string_view text);

} // namespace dexmor
