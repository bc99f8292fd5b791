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
        ar.readAs("x0", box.x0);
        ar.readAs("y0", box.y0);
        ar.readAs("x1", box.x1);
        ar.readAs("y1", box.y1);
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


// The render view's record after its VersionWord(0, V), in archive order. A record
// of version V holds the rows whose versions include V.
constexpr std::array kFields{
    record::fieldAs<enc::AnimatedAsPlain, &V::transform>("transform", between(1, 1)),
    record::fieldAs<enc::Box, &V::box1>("box1", always()),
    record::fieldAs<enc::Box, &V::box2>("box2", always()),
    record::fieldAs<enc::AnimatedAsPlain, &V::anim_r1>("anim_r1", between(1, 2)),
    record::fieldAs<enc::AnimatedAsPlain, &V::anim_r2>("anim_r2", between(1, 2)),
    record::fieldAs<enc::AnimatedAsPlain, &V::anim_r3>("anim_r3", between(1, 2)),
    record::fieldAs<enc::Int32, &V::img_width>("img_width", always()),
    record::fieldAs<enc::Int32, &V::img_height>("img_height", always()),
    record::fieldAs<enc::InvertedFlag, &V::anim_i1>("anim_i1", between(1, 2)),
    record::fieldAs<enc::Animated, &V::anim_r1>("anim_r1", since(3)),
    record::fieldAs<enc::Animated, &V::anim_r2>("anim_r2", since(3)),
    record::fieldAs<enc::Animated, &V::anim_r3>("anim_r3", since(3)),
    record::fieldAs<enc::Animated, &V::anim_i1>("anim_i1", since(3)),
    record::fieldAs<enc::Animated, &V::transform>("transform", since(2)),
};


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
    if (!ar.checkVersion(version, kVersion, "render view")) return false;
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
