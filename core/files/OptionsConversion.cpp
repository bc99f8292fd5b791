#include "files/OptionsConversion.hpp"

#include "files/SinkWriter.hpp"

#include <dexmor/files/ZelOptFile.hpp>
#include <dexmor/options/AllOptions.hpp>

#include <algorithm>
#include <cstring>

namespace OrvexKavorCore {

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
    SinkWriter out(sink, budget_, survey_, wrap_ ? std::optional(FileKind::RenderOptions) : std::nullopt);
    out.writer().beginDocument();
    options.writeXml(out.writer(), "");
    out.writer().endDocument();
    out.finish();
    return result;
}

} // namespace OrvexKavorCore
