#pragma once
// The renderer's small value types: colours, vectors, 3x3 matrices (three column
// vectors) and affine transforms (a matrix and an offset). Plain aggregates of
// 32-bit floats with exact (bitwise-value) equality, as the stored model compares them.

namespace KavorUtils {

struct Vector {
    float x = 0.0f, y = 0.0f, z = 0.0f;
    friend bool operator==(const Vector&, const Vector&) = default;
};

struct Color {
    float r = 0.0f, g = 0.0f, b = 0.0f;
    friend bool operator==(const Color&, const Color&) = default;
};

struct AColor {
    float r = 0.0f, g = 0.0f, b = 0.0f, a = 0.0f;
    friend bool operator==(const AColor&, const AColor&) = default;
};

// Three column vectors: m[0] is column 0.
struct Matrix {
    Vector m[3];
    static Matrix identity() { return Matrix{{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}}; }
    static Matrix zero() { return Matrix{}; }
    Vector& operator[](int column) { return m[column]; }
    const Vector& operator[](int column) const { return m[column]; }
    friend bool operator==(const Matrix& a, const Matrix& b) {
        return a.m[0] == b.m[0] && a.m[1] == b.m[1] && a.m[2] == b.m[2];
    }
};

struct Transform {
    Matrix m;
    Vector offs;
    static Transform identity() { return Transform{Matrix::identity(), Vector{}}; }
    static Transform zero() { return Transform{}; }
    friend bool operator==(const Transform& a, const Transform& b) { return a.m == b.m && a.offs == b.offs; }
};

} // namespace KavorUtils

namespace OrvexKavorCore {
using KavorUtils::AColor;
using KavorUtils::Color;
using KavorUtils::Matrix;
using KavorUtils::Transform;
using KavorUtils::Vector;
} // namespace OrvexKavorCore
