#include "files/SinkWriter.hpp"

#include <dexmor/materials/BaseMaterial.hpp>

#include "xml/XmlCharacters.hpp"

namespace OrvexKavorCore {

std::string wrappedDocumentStart(FileKind kind) {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<AssetDocument kind=\"" + std::string(extensionOf(kind)) +
           "\">\n";
}

SinkWriter::SinkWriter(DocumentSink& sink, std::uint64_t budget, DocumentSurvey* survey,
                       std::optional<FileKind> wrapAs)
    : sink_(sink), budget_(budget), whole_(sink.wholeText()), survey_(survey), wrap_(wrapAs.has_value()),
      writer_(whole_ ? *whole_ : pieces_) {
    if (whole_) wholeStart_ = surveyed_ = carried_ = whole_->size();
    writer_.watchOutput(this, (whole_ ? wholeStart_ : 0) + kPieceSize);
    if (wrapAs) writer_.writeText(wrappedDocumentStart(*wrapAs));
}

void SinkWriter::survey(const std::string& output) {
    if (!survey_) return;
    survey_->take(std::string_view(output).substr(surveyed_));
    surveyed_ = output.size();
}

void SinkWriter::carryWhole(bool complete) {
    if (!wrap_) return;
    const std::string_view rest = std::string_view(*whole_).substr(carried_);
    carriable_.clear();
    const std::size_t cut = carrier_.append(carriable_, rest, complete);
    whole_->replace(carried_, rest.size() - cut, carriable_);
    carried_ = whole_->size() - cut;
    surveyed_ = whole_->size();
}

void SinkWriter::beginMaterial(const BaseMaterial& material) {
    if (!survey_) return;
    survey(writer_.output());
    survey_->beginMaterial(material.name, material.kindName());
}

std::size_t SinkWriter::grown(std::string& output) {
    if (whole_) {
        survey(output);
        carryWhole(false);
        spend(output.size() - wholeStart_);
        sink_.checkpoint();
        return output.size() + kPieceSize;
    }
    survey(output);
    // The piece to send, and the bytes of a character cut at its end that stay.
    std::string_view piece = output;
    std::size_t cut = 0;
    if (wrap_) {
        carriable_.clear();
        cut = carrier_.append(carriable_, output, false);
        piece = carriable_;
    }
    // A piece goes out only when the whole document still fits the budget with it.
    spend(sent_ + piece.size());
    sink_.write(piece);
    sent_ += piece.size();
    output.erase(0, output.size() - cut);
    surveyed_ = output.size();
    sink_.checkpoint();
    return kPieceSize;
}

void SinkWriter::finish() {
    if (wrap_) writer_.writeText(kWrappedDocumentEnd);
    writer_.watchOutput(nullptr, 0);
    if (whole_) {
        survey(*whole_);
        carryWhole(true);
        return spend(whole_->size() - wholeStart_);
    }
    survey(pieces_);
    std::string_view piece = pieces_;
    if (wrap_) {
        carriable_.clear();
        carrier_.append(carriable_, pieces_, true);
        piece = carriable_;
    }
    spend(sent_ + piece.size());
    if (!piece.empty()) sink_.write(piece);
    sent_ += piece.size();
    pieces_.clear();
    surveyed_ = 0;
}

} // namespace OrvexKavorCore
