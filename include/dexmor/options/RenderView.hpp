#pragma once
// RenderView: a view description with a record and an asset of its own (the view
// transform, two integer boxes, three animated reals, an animated integer and the
// output size). The options set does not hold one.
//
// Record, version 3 (after VersionWord(0, 3)): box1 and box2, each four Int32
// x0, y0, x1, y1; Int32 img_width, img_height; then the records of anim_r1,
// anim_r2, anim_r3, anim_i1 and transform. Older versions store the keyed values
// as plain values at time 0:
//   version 2: box1, box2; three Float32 for anim_r1..anim_r3; img_width,
//              img_height; a Bool whose 0 stands for anim_i1 = 1 and anything
//              else for anim_i1 = 0; then the transform's record;
//   version 1: as version 2, but a plain Transform before box1 and no transform
//              record at the end.
// The table in RenderView.cpp is that layout, row by row.
#include <dexmor/archive/Record.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>
#include <dexmor/params/AnimatedValues.hpp>

#include <cstdint>
#include <span>
#include <string>

namespace OrvexKavorCore {

// An integer rectangle given by two corners. Width and height follow from the
// corners, as 32-bit differences (wrapping around for corners that lie further
// apart than 32 bits can tell). The empty box has every corner at -1.
struct IntBox {
    std::int32_t x0 = -1;
    std::int32_t y0 = -1;
    std::int32_t x1 = -1;
    std::int32_t y1 = -1;

    std::int32_t width() const { return difference(x1, x0); }
    std::int32_t height() const { return difference(y1, y0); }

    friend bool operator==(const IntBox&, const IntBox&) = default;

private:
    static std::int32_t difference(std::int32_t a, std::int32_t b) {
        return static_cast<std::int32_t>(static_cast<std::uint32_t>(a) - static_cast<std::uint32_t>(b));
    }
};

class RenderView : public OrvexSerializable, public OrvexXMLSerializable {
public:
    static constexpr std::uint16_t kVersion = 3;

    AnimatedTransform transform; // the identity at time 0
    IntBox box1;
    IntBox box2;
    AnimatedReal anim_r1; // constant: 45 degrees in radians
    AnimatedReal anim_r2; // constant 1
    AnimatedReal anim_r3; // constant 1
    std::int32_t img_width = 320;
    std::int32_t img_height = 240;
    AnimatedInt anim_i1; // constant 0

    RenderView();

    // Writes version 3; false when a keyed value fails to write.
    bool writeToArchive(QuickArchive& ar) override;
    // Reads version 1, 2 or 3 on top of the defaults; any other version word, or a
    // keyed value that does not read, fails.
    bool readFromArchive(QuickArchive& ar) override;
    virtual void resetToDefaults();

    // The asset `path`/RenderView: a "RenderView" settings plugin with img_width and
    // img_height. Not enclosed in an "Assets" element.
    void writeXml(AssetXmlWriter& writer, std::string path) override;
    std::string pluginType() const override { return "RenderView"; }
    std::string assetType() const override { return "settings"; }

    // Every field equal (exact comparison; keyed values key by key).
    bool isEqual(const RenderView& other) const;
    // The name of the first field that differs, or nullptr.
    const char* firstDifference(const RenderView& other) const;

    // The record as a table, one row per stored value in archive order.
    static std::span<const record::Field<RenderView>> recordFields();
};

} // namespace OrvexKavorCore
