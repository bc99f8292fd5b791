#pragma once
// The UVW generator family: where a texture's mapping coordinates come from.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

class BaseUVW : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // There is no kind 2.
    enum Kind : std::int32_t {
        kPlanarWorld = 0,
        kObject = 1,
        kEnvironment = 3,
        kChannel = 4,
    };

    virtual void resetToDefaults() = 0;
    virtual std::int32_t kindId() const = 0;
    // Rebuilds the transform and matrix fields from the transform components.
    virtual void updateTransforms() = 0;
    virtual boost::shared_ptr<BaseUVW> clone() const = 0;
    virtual bool isEqual(const boost::shared_ptr<BaseUVW>& other) const = 0;

    std::string assetType() const override { return "uvw"; }
};

using UVWPtr = boost::shared_ptr<BaseUVW>;

UVWPtr createUVW(std::int32_t kind);

template <>
struct Family<BaseUVW> {
    static constexpr const char* word = "UVW generator";
    static UVWPtr create(std::int32_t kind) { return createUVW(kind); }
};

} // namespace OrvexKavorCore
