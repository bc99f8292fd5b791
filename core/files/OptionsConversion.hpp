#pragma once
// The conversion of a render-options file: one document holding the options set.
#include <dexmor/dexmor.hpp>
#include <dexmor/platform/SharedBytes.hpp>

#include "files/DocumentSurvey.hpp"

#include <cstdint>

namespace OrvexKavorCore {

class AllOptions;

class OptionsConversion {
public:
    // `budget`: the most bytes the document may have (0: no limit).
    // A survey, when given, sees the document as it is written. `wrap`: the
    // wrapped form (see SinkWriter).
    explicit OptionsConversion(const SharedBytes& bytes, std::uint64_t budget = 0, DocumentSurvey* survey = nullptr,
                               bool wrap = false)
        : bytes_(bytes), budget_(budget), survey_(survey), wrap_(wrap) {}

    Diagnosis readThrough();
    // Writes the document to `sink`; nothing when the bytes do not read as an
    // options file (the result then says why). Throws OutputBudgetExceeded when
    // the document would exceed the budget.
    Diagnosis writeTo(DocumentSink& sink);

private:
    bool read(AllOptions& options, Diagnosis& result);

    const SharedBytes& bytes_;
    std::uint64_t budget_;
    DocumentSurvey* survey_;
    bool wrap_;
};

} // namespace OrvexKavorCore
