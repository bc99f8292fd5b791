#pragma once
// Keyed values: an integer, a real or a transform per key time.
//
// Keys are kept unique and in ascending time. A container holds the key at time 0
// from construction and from every reset on. Between two keys a container either
// blends (linearly, with the blend factor rounded to a 32-bit float) or holds the
// earlier key's value; before the first key it gives the first key's value, after
// the last key the last key's value.
//
// Record of every container:
//   VersionWord (0, 1)
//   UInt32      number of keys
//   UInt32      8, the byte size of a key time
//   Bool        interpolate            (integer and real only)
//   per key in ascending time: Float64 time, then the value (Int32, Float32 or Transform)
//
// An integer or real record is read on top of the reset container, so a record
// without a key at time 0 reads back with the default key at time 0 as well; a
// transform record reads back with exactly the keys it holds (possibly none: the
// container then answers the identity).
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace OrvexKavorCore {

namespace detail {
// Per value type: the default value, the stored size and the blend.
template <class T>
struct AnimatedTraits;
} // namespace detail

template <class T>
class AnimatedValue : public OrvexSerializable {
public:
    using value_type = T;
    struct Key {
        double time;
        T value;
        friend bool operator==(const Key&, const Key&) = default;
    };

    bool writeToArchive(QuickArchive& ar) override { return writeRecord(ar); }
    bool readFromArchive(QuickArchive& ar) override;

    // The value at `time`: the key's value at an exact key time; between two keys
    // the blend or the earlier value; outside the keys the nearest end key's value.
    // A container without keys answers the default value.
    virtual T valueAt(double time) const;
    // Sets the key at `time` (inserted, or overwritten when a key has exactly this
    // time). A time that is not a number cannot be ordered and is ignored.
    virtual void setValue(const T& value, double time);
    virtual std::int32_t keyCount() const { return static_cast<std::int32_t>(keys_.size()); }
    // Time of the key at `index` in ascending order; 0 for an index without a key.
    virtual double keyTime(std::int32_t index) const;
    // Only the default value at time 0.
    virtual void resetToDefaults();

    // Appends the record; always succeeds.
    bool writeRecord(QuickArchive& ar) const;

    // Sets every key of `keys` as setValue would one after the other (a later key of
    // the same time wins), in n log n time.
    void setValues(std::vector<Key> keys);
    // Only `value` at time 0.
    void setConstant(const T& value);
    std::span<const Key> keys() const { return keys_; }
    // True when the container blends between keys.
    bool blends() const { return interpolate_; }

    // Same number of keys, same blending, and key by key the same time and value
    // (exact comparison).
    friend bool operator==(const AnimatedValue& a, const AnimatedValue& b) {
        return a.interpolate_ == b.interpolate_ && a.keys_ == b.keys_;
    }

protected:
    explicit AnimatedValue(bool interpolate);
    void setBlending(bool interpolate) { interpolate_ = interpolate; }
    void removeAllKeys() { keys_.clear(); }

private:
    std::vector<Key> keys_;
    bool interpolate_;
};

extern template class AnimatedValue<std::int32_t>;
extern template class AnimatedValue<float>;
extern template class AnimatedValue<Transform>;

// An integer per key time. A blended value is truncated toward zero.
class AnimatedInt : public AnimatedValue<std::int32_t>, public OrvexXMLSerializable {
public:
    explicit AnimatedInt(bool interpolate = true) : AnimatedValue(interpolate) {}

    bool interpolates() const { return blends(); }
    void setInterpolate(bool interpolate) { setBlending(interpolate); }

    // The value reaches the XML through the object that holds it.
    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return {}; }
};

// A 32-bit float per key time.
class AnimatedReal : public AnimatedValue<float>, public OrvexXMLSerializable {
public:
    explicit AnimatedReal(bool interpolate = true) : AnimatedValue(interpolate) {}

    bool interpolates() const { return blends(); }
    void setInterpolate(bool interpolate) { setBlending(interpolate); }

    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return {}; }
};

// A transform per key time; always blended, component by component. The default
// value is the identity.
class AnimatedTransform : public AnimatedValue<Transform> {
public:
    AnimatedTransform() : AnimatedValue(true) {}

    virtual std::string pluginType() const { return {}; }
    virtual std::string assetType() const { return {}; }
    virtual void writeXml(AssetXmlWriter&, std::string) {}
};

// Record-table encodings (archive/Record.hpp).
namespace record {

// A container as its own record; equal by the keyed comparison.
template <class A>
struct AnimatedRecordCodec {
    static bool read(QuickArchive& ar, A& value) { return value.readFromArchive(ar); }
    static bool write(QuickArchive& ar, const A& value) { return value.writeRecord(ar); }
    static bool equal(const A& a, const A& b) { return a == b; }
};

template <>
struct Codec<AnimatedInt> : AnimatedRecordCodec<AnimatedInt> {};
template <>
struct Codec<AnimatedReal> : AnimatedRecordCodec<AnimatedReal> {};
template <>
struct Codec<AnimatedTransform> : AnimatedRecordCodec<AnimatedTransform> {};

// A container stored as one plain value (Int32, Float32 or Transform), as older
// records did: reading sets the key at time 0 (a value cut off by the end of the
// data keeps the earlier value at time 0), writing stores the value at time 0.
//   record::fieldAs<record::AnimatedPlainValue, &SunLight::transform>("transform", record::between(2, 2))
struct AnimatedPlainValue {
    template <class A>
    static bool read(QuickArchive& ar, A& value) {
        typename A::value_type plain = value.valueAt(0.0);
        ar.read(plain);
        value.setValue(plain, 0.0);
        return true;
    }
    template <class A>
    static bool write(QuickArchive& ar, const A& value) {
        ar.write(value.valueAt(0.0));
        return true;
    }
    template <class A>
    static bool equal(const A& a, const A& b) {
        return a == b;
    }
};

} // namespace record

} // namespace OrvexKavorCore
