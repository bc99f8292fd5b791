#pragma once
// The conversion of a material library: its document is one "<Assets>" block
// per material that gives an asset, streamed to the sink as it is written.
#include <dexmor/dexmor.hpp>
#include <dexmor/files/ConversionContext.hpp>
#include <dexmor/files/ZelMatFile.hpp>

#include "files/DocumentSurvey.hpp"

#include <cstdint>
#include <optional>

namespace OrvexKavorCore {

class LibraryConversion {
public:
    // `budget`: the most bytes the document may have (0: no limit).
    // A survey, when given, sees the document as it is written. `wrap`: the
    // wrapped form (see SinkWriter).
    LibraryConversion(ConversionContext& context, const SharedBytes& bytes, std::uint64_t budget = 0,
                      DocumentSurvey* survey = nullptr, bool wrap = false)
        : context_(context), bytes_(bytes), budget_(budget), survey_(survey), wrap_(wrap) {}

    // Reads every material, each dropped as soon as it has read.
    Diagnosis readThrough();
    // Writes the document to `sink`; when the bytes do not read as a library,
    // nothing stays in the sink and the result says why. Throws
    // OutputBudgetExceeded when the document would exceed the budget.
    Diagnosis writeTo(DocumentSink& sink);

private:
    // How a single reading of a library ended.
    enum class SingleReading {
        Written,     // the whole document was written
        NotALibrary, // the bytes do not read as a library
        SunChanged,  // a sky record after the first material changed the default sun
    };
    SingleReading writeReadingOnce(DocumentSink& sink, Diagnosis& result);
    // Reads the library through, then again writing each material: nothing is
    // sent for bytes that do not read.
    void writeReadingTwice(DocumentSink& sink, Diagnosis& result);
    // Frames the bytes and reads every material, handing each to `take`; false,
    // with the failure in `result`, at the first that does not read.
    bool readMaterials(Diagnosis& result, const std::function<void(MaterialPtr&&)>& take);
    std::optional<FileKind> form() const {
        return wrap_ ? std::optional(FileKind::MaterialLibrary) : std::nullopt;
    }

    ConversionContext& context_;
    const SharedBytes& bytes_;
    std::uint64_t budget_;
    DocumentSurvey* survey_;
    bool wrap_;
};

} // namespace OrvexKavorCore
