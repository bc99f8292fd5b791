#pragma once
// An asset writer whose text goes to a DocumentSink: straight into the sink's
// string when the sink holds the whole document there, else in pieces of about
// kPieceSize bytes as it is written.
#include <dexmor/dexmor.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <string>

namespace OrvexKavorCore {

class SinkWriter {
public:
    static constexpr std::size_t kPieceSize = 64 * 1024;

    explicit SinkWriter(DocumentSink& sink)
        : whole_(sink.wholeText()), send_([&sink](std::string_view piece) { sink.write(piece); }),
          writer_(whole_ ? *whole_ : pieces_) {
        if (!whole_) writer_.streamTo(&send_, kPieceSize);
    }
    SinkWriter(const SinkWriter&) = delete;
    SinkWriter& operator=(const SinkWriter&) = delete;

    AssetXmlWriter& writer() { return writer_; }

    // Sends what is still held back.
    void finish() {
        if (whole_) return;
        writer_.streamTo(nullptr, 0);
        if (!pieces_.empty()) send_(pieces_);
        pieces_.clear();
    }

private:
    std::string* whole_;
    TextSink send_;
    std::string pieces_;
    AssetXmlWriter writer_;
};

} // namespace OrvexKavorCore
