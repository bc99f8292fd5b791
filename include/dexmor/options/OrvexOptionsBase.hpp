#pragma once
// Common base of the options set and the blocks it owns (renderer parameters,
// frame data, frame-buffer stamp). It adds the reset to defaults to the two
// serializable interfaces; the archive and XML operations stay with each block.
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

namespace OrvexKavorCore {

class OrvexOptionsBase : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // Sets every field to its default. The base has no fields.
    virtual void resetToDefaults() {}
};

} // namespace OrvexKavorCore
