#pragma once
// An asset writer whose text goes to a DocumentSink: straight into the sink's
// string when the sink holds the whole document there, else in pieces of about
// kPieceSize bytes as it is written. Either way the sink's checkpoint is called
// between pieces, and the document is held to the output budget as it grows.
//
// In the wrapped form the document is framed by an XML declaration and one root
// element (written as the writer begins and as it finishes, like any other text),
// and the text goes out as XmlCarrier turns it (U+FFFD for each character XML 1.0
// cannot carry); the survey still sees the text as the writer made it, so its
// lint names them.
#include "files/DocumentSurvey.hpp"
#include "xml/XmlCharacters.hpp"

#include <dexmor/dexmor.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace OrvexKavorCore {
class BaseMaterial;
}

namespace OrvexKavorCore {

// Thrown when a document would exceed its output budget; convert() reports it.
struct OutputBudgetExceeded {
    std::uint64_t budget;
};

// The wrapped form's frame: the declaration and the root element, whose `kind`
// names the kind of file the document comes from ("zelmat" or "zelopt").
std::string wrappedDocumentStart(FileKind kind);
inline constexpr std::string_view kWrappedDocumentEnd = "</AssetDocument>\n";

class SinkWriter final : private OutputWatch {
public:
    static constexpr std::size_t kPieceSize = 64 * 1024;

    // `budget`: the most bytes the document may have; 0 for no limit. A survey,
    // when given, sees the text as it goes out. `wrapAs`: the wrapped form of a
    // document of that kind, else the plain form.
    SinkWriter(DocumentSink& sink, std::uint64_t budget, DocumentSurvey* survey = nullptr,
               std::optional<FileKind> wrapAs = std::nullopt);
    SinkWriter(const SinkWriter&) = delete;
    SinkWriter& operator=(const SinkWriter&) = delete;

    AssetXmlWriter& writer() { return writer_; }

    // The block of the next material begins: the survey, if any, attributes what
    // follows to it.
    void beginMaterial(const BaseMaterial& material);

    // Sends what is still held back. Throws OutputBudgetExceeded when the whole
    // document exceeds the budget.
    void finish();

private:
    std::size_t grown(std::string& output) override;
    // Shows the survey the output it has not seen yet.
    void survey(const std::string& output);
    // The wrapped form: replaces what XML cannot carry in the whole text from
    // `carried_` on (a character cut at the end waits for the rest unless `complete`).
    void carryWhole(bool complete);
    // Throws when `size` bytes of document exceed the budget.
    void spend(std::uint64_t size) const {
        if (budget_ != 0 && size > budget_) throw OutputBudgetExceeded{budget_};
    }

    DocumentSink& sink_;
    std::uint64_t budget_;
    std::string* whole_;
    std::size_t wholeStart_ = 0; // where this document starts in *whole_
    std::uint64_t sent_ = 0;     // bytes sent as pieces
    DocumentSurvey* survey_;
    std::size_t surveyed_ = 0; // how much of the output the survey has seen
    bool wrap_;
    XmlCarrier carrier_;
    std::size_t carried_ = 0; // the whole text before this is in its wrapped form
    std::string carriable_;   // a piece in its wrapped form
    std::string pieces_;
    AssetXmlWriter writer_;
};

} // namespace OrvexKavorCore
