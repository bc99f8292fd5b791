#pragma once
// An asset writer whose text goes to a DocumentSink: straight into the sink's
// string when the sink holds the whole document there, else in pieces of about
// kPieceSize bytes as it is written. Either way the sink's checkpoint is called
// between pieces, and the document is held to the output budget as it grows.
#include "files/DocumentSurvey.hpp"

#include <dexmor/dexmor.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {
class BaseMaterial;
}

namespace OrvexKavorCore {

// Thrown when a document would exceed its output budget; convert() reports it.
struct OutputBudgetExceeded {
    std::uint64_t budget;
};

class SinkWriter final : private OutputWatch {
public:
    static constexpr std::size_t kPieceSize = 64 * 1024;

    // `budget`: the most bytes the document may have; 0 for no limit. A survey,
    // when given, sees the text as it goes out.
    SinkWriter(DocumentSink& sink, std::uint64_t budget, DocumentSurvey* survey = nullptr);
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
    std::string pieces_;
    AssetXmlWriter writer_;
};

} // namespace OrvexKavorCore
