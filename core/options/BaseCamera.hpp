#pragma once
// The camera family. The options set holds one physical camera.
#include "archive/Serializable.hpp"

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class BaseCamera : public OrvexSerializable, public OrvexXMLSerializable {
public:
    virtual std::int32_t kindId() const = 0;
    virtual boost::shared_ptr<BaseCamera> clone() const = 0;
    virtual void resetToDefaults() = 0;
};

using CameraPtr = boost::shared_ptr<BaseCamera>;

} // namespace OrvexKavorCore
