#pragma once
// The documents of `dexmor xml` without -o, on standard output.
#include "Output.hpp"

#include <dexmor/dexmor.hpp>

#include <cstdint>
#include <string>
#include <string_view>

namespace dexmor {

// Standard output as the destination of documents, one after another, in writes
// of up to a quarter megabyte. Where what was written can be taken back (a
// regular file, truncated back to where the document began, or /dev/null), the
// conversion reads each library once, and a document that fails is withdrawn
// before the next begins; a pipe or a terminal cannot take back, so a library is
// read through before its first byte goes out. Once a write fails nothing more
// is written.
class StandardOutputSink final : public OrvexKavorCore::DocumentSink {
public:
    StandardOutputSink();
    // Marks where the next document begins.
    void beginDocument() { documentStart_ = accepted_; }
    void write(std::string_view piece) override;
    bool canTakeBack() const override { return canTakeBack_; }
    void takeBack() override;
    // Whether the output is gone (a write failed): later documents have nowhere to go.
    bool gone() const { return gone_; }
    // Writes what is pending and closes; false when anything failed.
    bool finish();

private:
    void flush();

    StandardOutput out_;
    bool canTakeBack_ = false;
    bool isNull_ = false;
    bool gone_ = false;
    std::string pending_;
    std::uint64_t accepted_ = 0;      // bytes taken in, written or pending
    std::uint64_t documentStart_ = 0; // accepted_ when the document began
};

} // namespace dexmor
