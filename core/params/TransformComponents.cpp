#include <dexmor/params/TransformComponents.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/xml/AssetXmlWriter.hpp>

#include <array>
#include <utility>

#include <cmath>

namespace OrvexKavorCore {

namespace {

// pi as the 32-bit float 3.1415927; degrees to radians with one float division.
constexpr float kPi = 3.1415927f;
constexpr float kDegreesToRadians = kPi / 180.0f;

// The matrix of one axis: the rotation about it, then its own column mirrored and
// scaled. The angle is a 32-bit product; cosine and sine are taken in double
// precision and rounded to 32 bits.
Matrix axisMatrix(int axis, float degrees, float scale, bool mirror) {
    const float r = degrees * kDegreesToRadians;
    const float c = static_cast<float>(std::cos(static_cast<double>(r)));
    const float s = static_cast<float>(std::sin(static_cast<double>(r)));
    Matrix m = Matrix::identity();
    switch (axis) {
    case 0:
        m[1] = {0, c, s};
        m[2] = {0, -s, c};
        break;
    case 1:
        m[0] = {c, 0, -s};
        m[2] = {s, 0, c};
        break;
    default:
        m[0] = {c, s, 0};
        m[1] = {-s, c, 0};
        break;
    }
    Vector& own = m[axis];
    if (mirror) own = {-own.x, -own.y, -own.z};
    own = {own.x * scale, own.y * scale, own.z * scale};
    return m;
}

// a0 * b0 + a1 * b1 + a2 * b2, summed left to right. Each product is rounded to
// 32 bits on its own (separate statements: no fused multiply-add), so the result
// is the same with every compiler.
float dot(float a0, float b0, float a1, float b1, float a2, float b2) {
    const float p0 = a0 * b0;
    const float p1 = a1 * b1;
    const float p2 = a2 * b2;
    const float sum = p0 + p1;
    return sum + p2;
}

Vector apply(const Matrix& a, const Vector& v) {
    return {dot(a[0].x, v.x, a[1].x, v.y, a[2].x, v.z), dot(a[0].y, v.x, a[1].y, v.y, a[2].y, v.z),
            dot(a[0].z, v.x, a[1].z, v.y, a[2].z, v.z)};
}

// Column j of A·B is A applied to column j of B.
Matrix multiply(const Matrix& a, const Matrix& b) { return Matrix{{apply(a, b[0]), apply(a, b[1]), apply(a, b[2])}}; }

} // namespace

bool TransformComponents::writeRecord(QuickArchive& ar) const {
    ar.write(VersionWord::make(0, 1));
    for (float v : {x_rotation, y_rotation, z_rotation, x_scale, y_scale, z_scale, x_offset, y_offset, z_offset})
        ar.write(v);
    for (std::int32_t v : {x_mirror, y_mirror, z_mirror}) ar.write(v);
    return true;
}

bool TransformComponents::readFromArchive(QuickArchive& ar) {
    resetToDefaults();
    const auto version = ar.get<VersionWord>();
    if (!version.is(0, 1)) return ar.fail("unknown transform components version");
    const std::pair<const char*, float*> numbers[] = {
        {"x_rotation", &x_rotation}, {"y_rotation", &y_rotation}, {"z_rotation", &z_rotation},
        {"x_scale", &x_scale},       {"y_scale", &y_scale},       {"z_scale", &z_scale},
        {"x_offset", &x_offset},     {"y_offset", &y_offset},     {"z_offset", &z_offset},
    };
    for (const auto& [name, v] : numbers) ar.readAs(name, *v);
    const std::pair<const char*, std::int32_t*> mirrors[] = {
        {"x_mirror", &x_mirror}, {"y_mirror", &y_mirror}, {"z_mirror", &z_mirror}};
    for (const auto& [name, v] : mirrors) ar.readAs(name, *v);
    return true;
}

Matrix TransformComponents::buildMatrix() const {
    const Matrix mx = axisMatrix(0, x_rotation, x_scale, x_mirror != 0);
    const Matrix my = axisMatrix(1, y_rotation, y_scale, y_mirror != 0);
    const Matrix mz = axisMatrix(2, z_rotation, z_scale, z_mirror != 0);
    return multiply(multiply(mx, my), mz);
}

Transform TransformComponents::buildTransform() const {
    return Transform{buildMatrix(), Vector{x_offset, y_offset, z_offset}};
}

bool operator==(const TransformComponents& a, const TransformComponents& b) {
    return a.x_rotation == b.x_rotation && a.y_rotation == b.y_rotation && a.z_rotation == b.z_rotation &&
           a.x_scale == b.x_scale && a.y_scale == b.y_scale && a.z_scale == b.z_scale && a.x_offset == b.x_offset &&
           a.y_offset == b.y_offset && a.z_offset == b.z_offset && a.x_mirror == b.x_mirror &&
           a.y_mirror == b.y_mirror && a.z_mirror == b.z_mirror;
}

namespace {

void writeComponents(AssetXmlWriter& writer, std::string_view name, std::string_view type,
                     const TransformComponents& c, std::string_view label) {
    const std::array<AssetXmlWriter::NumberLine, 12> lines{{
        {"x_rotation", c.x_rotation}, {"y_rotation", c.y_rotation}, {"z_rotation", c.z_rotation},
        {"x_scale", c.x_scale},       {"y_scale", c.y_scale},       {"z_scale", c.z_scale},
        {"x_offset", c.x_offset},     {"y_offset", c.y_offset},     {"z_offset", c.z_offset},
        {"x_mirror", static_cast<double>(c.x_mirror), true},
        {"y_mirror", static_cast<double>(c.y_mirror), true},
        {"z_mirror", static_cast<double>(c.z_mirror), true},
    }};
    writer.writeNumberBlock(name, type, lines, label);
}

} // namespace

void writeComponentMatrix(AssetXmlWriter& writer, std::string_view name, const TransformComponents& value,
                          std::string_view label) {
    writeComponents(writer, name, "componentMatrix", value, label);
}

void writeComponentTransform(AssetXmlWriter& writer, std::string_view name, const TransformComponents& value,
                             std::string_view label) {
    writeComponents(writer, name, "componentTransform", value, label);
}

} // namespace OrvexKavorCore
