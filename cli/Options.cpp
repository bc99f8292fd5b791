#include "Options.hpp"

#include <charconv>

namespace dexmor {

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

std::optional<OrvexKavorCore::FileKind> parseKind(std::string_view text) {
    using OrvexKavorCore::FileKind;
    for (const FileKind kind : {FileKind::MaterialLibrary, FileKind::RenderOptions})
        if (text == OrvexKavorCore::extensionOf(kind)) return kind;
    return std::nullopt;
}

std::optional<std::uint64_t> parseBytes(std::string_view text) {
    std::uint64_t bytes = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), bytes);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return bytes;
}

} // namespace dexmor
