#pragma once
// Stored list parameters: a list of integers ("faces" of a map channel) and a list
// of vectors ("tverts").
//
// Record of both:
//   VersionWord (0, 1)
//   UInt32      number of elements
//   UInt32      element size: 4 for integers, 12 for vectors
//   Bytes       the elements in order, each integer as Int32, each vector as three
//               Float32 x, y, z; the block's count is elements × element size
//   String      the parameter's name
//
// A record with another element size or block size fails to read; the list then
// keeps what was read so far.
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/params/PluginParameter.hpp>

#include <string>

namespace OrvexKavorCore {

class DefSerialIntListParam : public KavorUtils::DefIntListParam, public OrvexSerializable {
public:
    explicit DefSerialIntListParam(std::string name) : DefIntListParam(std::move(name)) {}

    // False only for a list too long for a Bytes block (4 GiB).
    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;
};

class DefSerialVectorListParam : public KavorUtils::DefVectorListParam, public OrvexSerializable {
public:
    explicit DefSerialVectorListParam(std::string name) : DefVectorListParam(std::move(name)) {}

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;
};

} // namespace OrvexKavorCore
