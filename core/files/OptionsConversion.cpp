#include "files/OptionsConversion.hpp"

#include <dexmor/files/ZelOptFile.hpp>
#include <dexmor/options/AllOptions.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <algorithm>
#include <cstring>

namespace OrvexKavorCore {

namespace {
constexpr std::size_t kPieceSize = 64 * 1024;
} // namespace

bool OptionsConversion::read(AllOptions& options, Diagnosis& result) {
    ZelOptFile file;
    if (!file.readBytes(options, bytes_.view())) {
        result.failure = file.lastReadFailure();
        return false;
    }
    // The archive pads a short file with zero bytes, and so does this.
    VersionWord version{};
    std::memcpy(&version.raw, bytes_.data(), std::min(bytes_.size(), sizeof version.raw));
    result.readsAsBinary = true;
    result.description = "render options, version " + std::to_string(version.second());
    return true;
}

Diagnosis OptionsConversion::readThrough() {
    Diagnosis result;
    AllOptions options;
    read(options, result);
    return result;
}

Diagnosis OptionsConversion::writeTo(DocumentSink& sink) {
    Diagnosis result;
    AllOptions options;
    if (!read(options, result)) return result;
    const TextSink send = [&sink](std::string_view piece) { sink.write(piece); };
    std::string text;
    AssetXmlWriter writer(text);
    writer.streamTo(&send, kPieceSize);
    writer.beginDocument();
    options.writeXml(writer, "");
    writer.endDocument();
    writer.streamTo(nullptr, 0);
    if (!text.empty()) send(text);
    return result;
}

} // namespace OrvexKavorCore
