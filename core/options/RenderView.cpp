#include <dexmor/options/RenderView.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include "options/MemberEncodings.hpp"
#include "options/RecordEncodings.hpp"
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>
#include <numbers>

namespace OrvexKavorCore {

namespace {

// The encodings of the rows below: the primitives and member encodings, and two
// of the render view's own.
namespace enc {

using namespace record::enc;

// A box as its four corners, Int32 x0, y0, x1, y1.
struct Box {
    static bool read(QuickArchive& ar, IntBox& box) {
        ar.read(box.x0);
        ar.read(box.y0);
        ar.read(box.x1);
        ar.read(box.y1);
        return true;
    }
    static bool write(QuickArchive& ar, const IntBox& box) {
        ar.write(box.x0);
        ar.write(box.y0);
        ar.write(box.x1);
        ar.write(box.y1);
        return true;
    }
    static bool equal(const IntBox& a, const IntBox& b) { return a == b; }
};

// An animated integer stored as a Bool flag: 0 stands for the constant 1,
// anything else for the constant 0.
struct InvertedFlag {
    static bool read(QuickArchive& ar, AnimatedInt& value) {
        value.setConstant(ar.get<bool>() ? 0 : 1);
        return true;
    }
    static bool write(QuickArchive& ar, const AnimatedInt& value) {
        ar.write(value.valueAt(0.0) == 0);
        return true;
    }
    static bool equal(const AnimatedInt& a, const AnimatedInt& b) { return a == b; }
};

} // namespace enc

using V = RenderView;
using record::always;
using record::between;
using record::since;

#define ROW(name, encoding, versions) record::fieldAs<enc::encoding, &V::name>(#name, versions)

// The render view's record after its VersionWord(0, V), in archive order. A record
// of version V holds the rows whose versions include V.
constexpr std::array kFields{
    //  field        encoding          versions
    ROW(transform,   AnimatedAsPlain,  between(1, 1)),
    ROW(box1,        Box,              always()),
    ROW(box2,        Box,              always()),
    ROW(anim_r1,     AnimatedAsPlain,  between(1, 2)),
    ROW(anim_r2,     AnimatedAsPlain,  between(1, 2)),
    ROW(anim_r3,     AnimatedAsPlain,  between(1, 2)),
    ROW(img_width,   Int32,            always()),
    ROW(img_height,  Int32,            always()),
    ROW(anim_i1,     InvertedFlag,     between(1, 2)),
    ROW(anim_r1,     Animated,         since(3)),
    ROW(anim_r2,     Animated,         since(3)),
    ROW(anim_r3,     Animated,         since(3)),
    ROW(anim_i1,     Animated,         since(3)),
    ROW(transform,   Animated,         since(2)),
};

#undef ROW

} // namespace

RenderView::RenderView() {
    anim_r1.setConstant(static_cast<float>(std::numbers::pi / 180.0 * 45.0));
    anim_r2.setConstant(1.0f);
    anim_r3.setConstant(1.0f);
}

bool RenderView::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, kVersion));
    return record::writeFields(ar, *this, kFields, kVersion);
}

bool RenderView::readFromArchive(QuickArchive& ar) {
    const auto version = ar.get<VersionWord>();
    resetToDefaults();
    if (version.first() != 0 || version.second() < 1 || version.second() > kVersion)
        return ar.fail("unknown render view version (" + std::to_string(version.first()) + ", " +
                       std::to_string(version.second()) + ")");
    return record::readFields(ar, *this, kFields, version.second());
}

void RenderView::resetToDefaults() { *this = RenderView(); }

void RenderView::writeXml(AssetXmlWriter& writer, std::string path) {
    const std::string url = path + "/" + pluginType();
    // The keyed values reach the XML through their holders; they write nothing.
    anim_r1.writeXml(writer, url);
    anim_r2.writeXml(writer, url);
    anim_r3.writeXml(writer, url);
    anim_i1.writeXml(writer, url);
    transform.writeXml(writer, url);
    writer.beginAsset(url, assetType(), "");
    writer.beginPlugin(pluginType(), assetType());
    writer.beginParameters();
    writer.writeInteger("img_width", img_width);
    writer.writeInteger("img_height", img_height);
    writer.endParameters();
    writer.endPlugin();
    writer.endAsset();
}

bool RenderView::isEqual(const RenderView& other) const { return record::fieldsEqual(*this, other, kFields); }

const char* RenderView::firstDifference(const RenderView& other) const {
    return record::firstDifference(*this, other, kFields);
}

std::span<const record::Field<RenderView>> RenderView::recordFields() { return kFields; }

} // namespace OrvexKavorCore
