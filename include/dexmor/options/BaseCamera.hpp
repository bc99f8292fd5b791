#pragma once
// The camera family. Its one kind is the physical camera (kind 0), which the
// options set holds by value; the family has no creation function, because no
// record stores a camera behind a kind id.
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class BaseCamera : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // The camera kind (0 for the physical camera).
    virtual std::int32_t kindId() const = 0;
    // A new camera that is a copy of this one.
    virtual boost::shared_ptr<BaseCamera> clone() const = 0;
    // Sets every field to its default.
    virtual void resetToDefaults() = 0;
};

using CameraPtr = boost::shared_ptr<BaseCamera>;

} // namespace OrvexKavorCore
