#pragma once
// The interface every stored class implements: moving itself through a
// QuickArchive. (Writing itself as XML assets is OrvexXMLSerializable.)
#include <string>

namespace OrvexKavorCore {

class QuickArchive;

class OrvexSerializable {
public:
    virtual ~OrvexSerializable() = default;
    // Appends the object's record; false abandons the whole save.
    virtual bool writeToArchive(QuickArchive& ar) = 0;
    // Fills the object from its record; false means the data is not acceptable and
    // the whole load is abandoned (the reason is recorded in the archive).
    virtual bool readFromArchive(QuickArchive& ar) = 0;
};

} // namespace OrvexKavorCore
