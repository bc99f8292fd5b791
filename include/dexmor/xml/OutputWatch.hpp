#pragma once
#include <cstddef>
#include <string>

namespace OrvexKavorCore {

// Watches an AssetXmlWriter's output grow. The writer calls grown() whenever its
// output holds at least the threshold the watch last returned; the watch may send
// the text on and empty the output, leave it where it is, or throw to stop the
// writing (the writer is then left as it was at the call).
class OutputWatch {
public:
    virtual ~OutputWatch() = default;
    // Returns the output size at which to be called next.
    virtual std::size_t grown(std::string& output) = 0;
};

} // namespace OrvexKavorCore
