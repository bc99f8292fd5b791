#pragma once
// Animated parameters: a named keyed value presented to the renderer. The getter
// of the value's type answers the value at the time asked; the setter sets the key
// at that time. The renderer finds the keys through the interpolating interface
// (MyInterpolatingInterface::kId), which every animated parameter answers itself.
//
// Records:
//   integer, real:  VersionWord (0, 1); String name; the container's record
//   transform:      VersionWord (0, 2); String name; the container's record
//   transform, version (0, 1), read only:
//                   String name; UInt32 key count; UInt32 8 (time size);
//                   per key Float64 time and Transform value (set on top of the
//                   reset container, so the identity at time 0 stays unless a key
//                   at time 0 replaces it)
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/params/AnimatedValues.hpp>
#include <dexmor/params/PluginParameter.hpp>

#include <cstdint>
#include <string>

namespace OrvexKavorCore {

// The parts every animated parameter shares: name, interface lookup, keys.
template <class Container>
class DefAnimParam : public KavorUtils::KavorPluginParameter,
                     public KavorUtils::MyInterpolatingInterface,
                     public OrvexSerializable {
public:
    const char* getName() const override { return name_.c_str(); }
    const std::string& name() const { return name_; }
    void setName(std::string name) { name_ = std::move(name); }

    Container& value() { return value_; }
    const Container& value() const { return value_; }

    // The interpolating interface for its id, else the registered interfaces.
    PluginInterface* getInterface(std::uint64_t id) override {
        if (id == MyInterpolatingInterface::kId) return static_cast<MyInterpolatingInterface*>(this);
        return PluginBase::getInterface(id);
    }

    std::int32_t keyCount() const override { return value_.keyCount(); }
    double keyTime(std::int32_t index) const override { return value_.keyTime(index); }
    std::int32_t interpolationType() const override { return value_.blends() ? 0 : 1; }

protected:
    DefAnimParam(std::string name, const Container& value) : name_(std::move(name)), value_(value) {}
    // The name and the container's record behind the version word.
    bool readNameAndValue(QuickArchive& ar);
    bool writeRecord(QuickArchive& ar, VersionWord version) const;

    std::string name_;
    Container value_;
};

class DefAnimIntParam : public DefAnimParam<AnimatedInt> {
public:
    explicit DefAnimIntParam(std::string name) : DefAnimParam(std::move(name), AnimatedInt(true)) {}
    DefAnimIntParam(std::string name, const AnimatedInt& value) : DefAnimParam(std::move(name), value) {}

    std::int32_t getInt(std::int32_t index = 0, double time = 0.0) const override;
    bool setInt(std::int32_t value, std::int32_t index = 0, double time = 0.0) override;

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;
};

class DefAnimRealParam : public DefAnimParam<AnimatedReal> {
public:
    explicit DefAnimRealParam(std::string name) : DefAnimParam(std::move(name), AnimatedReal(true)) {}
    DefAnimRealParam(std::string name, const AnimatedReal& value) : DefAnimParam(std::move(name), value) {}

    float getFloat(std::int32_t index = 0, double time = 0.0) const override;
    double getDouble(std::int32_t index = 0, double time = 0.0) const override;
    bool setFloat(float value, std::int32_t index = 0, double time = 0.0) override;
    bool setDouble(double value, std::int32_t index = 0, double time = 0.0) override;

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;
};

class DefAnimTransformParam : public DefAnimParam<AnimatedTransform> {
public:
    explicit DefAnimTransformParam(std::string name) : DefAnimParam(std::move(name), AnimatedTransform()) {}
    DefAnimTransformParam(std::string name, const AnimatedTransform& value) : DefAnimParam(std::move(name), value) {}

    Transform getTransform(std::int32_t index = 0, double time = 0.0) const override;
    bool setTransform(const Transform& value, std::int32_t index = 0, double time = 0.0) override;

    bool writeToArchive(QuickArchive& ar) override;
    bool readFromArchive(QuickArchive& ar) override;
};

} // namespace OrvexKavorCore
