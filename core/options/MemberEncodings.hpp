#pragma once
// Stored encodings of record-table rows whose value is not one primitive: blocks
// and keyed values that carry records of their own, keyed values that older
// records stored as one plain value, and text. They sit beside the primitives of
// options/RecordEncodings.hpp, so that a table row states its encoding the way a
// record layout reads:
//
//   record::fieldAs<record::enc::Record, &AllOptions::frameData>("frameData")
//   record::fieldAs<record::enc::Animated, &PhysicalCamera::focal_length>("focal_length", record::since(2))
//   record::fieldAs<record::enc::AnimatedAsPlain, &PhysicalCamera::focal_length>("focal_length", record::between(1, 1))
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/params/AnimatedValues.hpp>

#include <string>

namespace OrvexKavorCore::record::enc {

// A block stored as its own record (its readFromArchive / writeToArchive, each of
// which may fail), compared by its own isEqual.
struct Record {
    template <class Block>
    static bool read(QuickArchive& ar, Block& block) {
        return block.readFromArchive(ar);
    }
    template <class Block>
    static bool write(QuickArchive& ar, Block& block) {
        return block.writeToArchive(ar);
    }
    template <class Block>
    static bool equal(const Block& a, const Block& b) {
        return a.isEqual(b);
    }
};

// A keyed value (AnimatedInt, AnimatedReal, AnimatedTransform) stored as its own
// record; equal when keys and blending are equal.
struct Animated {
    template <class A>
    static bool read(QuickArchive& ar, A& value) {
        return value.readFromArchive(ar);
    }
    template <class A>
    static bool write(QuickArchive& ar, const A& value) {
        return value.writeRecord(ar);
    }
    template <class A>
    static bool equal(const A& a, const A& b) {
        return a == b;
    }
};

// A keyed value stored as one plain Int32, Float32 or Transform: its value at
// time 0 (the layout of older records).
using AnimatedAsPlain = record::AnimatedPlainValue;

// UTF-8 text stored as a WString; a stored empty text reads as the empty text.
struct WString {
    static bool read(QuickArchive& ar, std::string& value) { return ar.readWString(value); }
    static bool write(QuickArchive& ar, const std::string& value) {
        ar.writeWString(value);
        return true;
    }
    static bool equal(const std::string& a, const std::string& b) { return a == b; }
};

} // namespace OrvexKavorCore::record::enc
