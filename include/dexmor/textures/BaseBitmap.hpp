#pragma once
// The bitmap family: references to image files and how they are filtered.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class BaseBitmap : public OrvexSerializable, public OrvexXMLSerializable {
public:
    enum Kind : std::int32_t { kBuffer = 0 };

    virtual void resetToDefaults() = 0;
    virtual std::int32_t kindId() const = 0;
    virtual boost::shared_ptr<BaseBitmap> clone() const = 0;
    virtual bool isEqual(const boost::shared_ptr<BaseBitmap>& other) const = 0;

    std::string assetType() const override { return "bitmap"; }
};

using BitmapPtr = boost::shared_ptr<BaseBitmap>;

BitmapPtr createBitmap(std::int32_t kind);

template <>
struct Family<BaseBitmap> {
    static constexpr const char* word = "bitmap";
    static BitmapPtr create(std::int32_t kind) { return createBitmap(kind); }
};

} // namespace OrvexKavorCore
