#pragma once
#include <functional>
#include <string_view>

namespace OrvexKavorCore {

// Receives a document piece by piece, in order. The text a call receives is only
// valid during the call.
using TextSink = std::function<void(std::string_view)>;

} // namespace OrvexKavorCore
