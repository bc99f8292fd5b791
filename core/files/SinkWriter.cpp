#include "files/SinkWriter.hpp"

namespace OrvexKavorCore {

SinkWriter::SinkWriter(DocumentSink& sink, std::uint64_t budget)
    : sink_(sink), budget_(budget), whole_(sink.wholeText()), writer_(whole_ ? *whole_ : pieces_) {
    if (whole_) wholeStart_ = whole_->size();
    writer_.watchOutput(this, (whole_ ? wholeStart_ : 0) + kPieceSize);
}

std::size_t SinkWriter::grown(std::string& output) {
    if (whole_) {
        spend(output.size() - wholeStart_);
        sink_.checkpoint();
        return output.size() + kPieceSize;
    }
    // A piece goes out only when the whole document still fits the budget with it.
    spend(sent_ + output.size());
    sink_.write(output);
    sent_ += output.size();
    output.clear();
    sink_.checkpoint();
    return kPieceSize;
}

void SinkWriter::finish() {
    writer_.watchOutput(nullptr, 0);
    if (whole_) return spend(whole_->size() - wholeStart_);
    spend(sent_ + pieces_.size());
    if (!pieces_.empty()) sink_.write(pieces_);
    sent_ += pieces_.size();
    pieces_.clear();
}

} // namespace OrvexKavorCore
