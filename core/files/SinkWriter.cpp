#include "files/SinkWriter.hpp"

#include <dexmor/materials/BaseMaterial.hpp>

namespace OrvexKavorCore {

SinkWriter::SinkWriter(DocumentSink& sink, std::uint64_t budget, DocumentSurvey* survey)
    : sink_(sink), budget_(budget), whole_(sink.wholeText()), survey_(survey), writer_(whole_ ? *whole_ : pieces_) {
    if (whole_) wholeStart_ = surveyed_ = whole_->size();
    writer_.watchOutput(this, (whole_ ? wholeStart_ : 0) + kPieceSize);
}

void SinkWriter::survey(const std::string& output) {
    if (!survey_) return;
    survey_->take(std::string_view(output).substr(surveyed_));
    surveyed_ = output.size();
}

void SinkWriter::beginMaterial(const BaseMaterial& material) {
    if (!survey_) return;
    survey(writer_.output());
    survey_->beginMaterial(material.name, material.kindName());
}

std::size_t SinkWriter::grown(std::string& output) {
    if (whole_) {
        spend(output.size() - wholeStart_);
        survey(output);
        sink_.checkpoint();
        return output.size() + kPieceSize;
    }
    // A piece goes out only when the whole document still fits the budget with it.
    spend(sent_ + output.size());
    survey(output);
    sink_.write(output);
    sent_ += output.size();
    output.clear();
    surveyed_ = 0;
    sink_.checkpoint();
    return kPieceSize;
}

void SinkWriter::finish() {
    writer_.watchOutput(nullptr, 0);
    if (whole_) {
        spend(whole_->size() - wholeStart_);
        return survey(*whole_);
    }
    spend(sent_ + pieces_.size());
    survey(pieces_);
    if (!pieces_.empty()) sink_.write(pieces_);
    sent_ += pieces_.size();
    pieces_.clear();
    surveyed_ = 0;
}

} // namespace OrvexKavorCore
