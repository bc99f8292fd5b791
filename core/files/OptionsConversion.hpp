#pragma once
// The conversion of a render-options file: one document holding the options set.
#include <dexmor/dexmor.hpp>
#include <dexmor/platform/SharedBytes.hpp>

namespace OrvexKavorCore {

class AllOptions;

class OptionsConversion {
public:
    explicit OptionsConversion(const SharedBytes& bytes) : bytes_(bytes) {}

    Diagnosis readThrough();
    // Writes the document to `sink`; nothing when the bytes do not read as an
    // options file (the result then says why).
    Diagnosis writeTo(DocumentSink& sink);

private:
    bool read(AllOptions& options, Diagnosis& result);

    const SharedBytes& bytes_;
};

} // namespace OrvexKavorCore
