#pragma once
#include <string>

namespace OrvexKavorCore {

// A new random (version 4) identifier in lower-case 8-4-4-4-12 text form.
std::string newUuidText();

} // namespace OrvexKavorCore
