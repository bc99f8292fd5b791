#pragma once
// The renderer's parameter interface, as this library presents it.
//
// A renderer plugin reads its inputs through KavorPluginParameter objects: typed
// queries by element index and time. Lists nest: a consumer asks for the element
// count, enters an element (getting a handle), reads the element's own elements,
// and leaves it again. The plain interface answers every query with a neutral
// value (no list, zeros, null); the classes below and the stored parameter
// classes of the model replace the answers they have.
//
// Besides their queries, renderer objects carry a list of extension interfaces
// that callers look up by a 64-bit id (PluginBase). The interpolating interface is
// the one the model uses: animated parameters answer it with their key times.
//
// The virtual operations are declared in the operation order of the renderer's
// interface; each carries the answer of the plain interface.
#include <dexmor/platform/KavorTypes.hpp>

#include <cstdint>
#include <forward_list>
#include <memory>
#include <span>
#include <string>
#include <utility>
#include <vector>

// An extension interface that a renderer object can carry. It names itself by a
// 64-bit id and a short text name.
class PluginInterface {
public:
    virtual ~PluginInterface() = default;
    // First operation: the interface's id.
    virtual std::uint64_t getInterfaceId() const = 0;
    // Third operation: the interface's name ("EXT_INTERPOLATING"). The renderer
    // interface has two more operations (second and fourth) that nothing here
    // calls; they are not reproduced.
    virtual const char* getInterfaceName() const = 0;
};

// A renderer object with its list of extension interfaces. The list is owned by
// the object: its nodes go away on unregistering and with the object. The
// interfaces themselves are not owned (an object often registers a part of itself).
class PluginBase {
public:
    PluginBase() = default;
    virtual ~PluginBase() = default;
    // A copy would share interfaces that belong to the original.
    PluginBase(const PluginBase&) = delete;
    PluginBase& operator=(const PluginBase&) = delete;

    // Operation 2: the first registered interface (latest registration first) whose
    // id equals `id`, or null.
    virtual PluginInterface* getInterface(std::uint64_t id);
    // Operation 3: has no effect.
    virtual void reserved() {}
    // Operation 4: puts the interface at the head of the list, with a value the
    // caller associates with it. False only when no node can be allocated.
    virtual bool registerInterface(PluginInterface* iface, void* data = nullptr);
    // Operation 5: removes the first node that holds the interface; false when it
    // is not registered.
    virtual bool unregisterInterface(PluginInterface* iface);

    // The value given when `iface` was registered (null when it is not registered).
    void* interfaceData(const PluginInterface* iface) const;

    // Builds the 64-bit id from the two halves callers of the renderer pass.
    static constexpr std::uint64_t interfaceId(std::uint32_t low, std::uint32_t high) {
        return (static_cast<std::uint64_t>(high) << 32) | low;
    }

private:
    struct Node {
        PluginInterface* iface;
        void* data;
    };
    std::forward_list<Node> interfaces_;
};

namespace KavorUtils {

// Type codes of parameter values and list elements.
enum ParamTypeCode : std::int32_t {
    kTypeInt = 0,
    kTypeVector = 4,
    kTypeString = 9,
    kTypeObject = 10,
    kTypeList = 12,
    kTypeUnspecified = 10000,
};

// The handle a consumer gets when entering a list element and gives back when
// leaving it.
using ListHandle = std::uint32_t;

class KavorPluginParameter : public PluginBase {
public:
    // Operation 6: the parameter's name.
    virtual const char* getName() const = 0;

    // Operation 7: number of elements at a time; -1 when the parameter is not a list.
    virtual std::int32_t elementCount(double time = 0.0) const;
    // Operation 8: enters element `index` of the list; the handle it returns is
    // given back to leaveList. Plain answer: 0.
    virtual ListHandle enterList(std::int32_t index, double time = 0.0);
    // Operation 9: leaves what enterList entered. Plain interface: no effect.
    virtual void leaveList(ListHandle handle);

    // Operations 10 to 18: element `index` at `time` in each value type. The plain
    // interface answers with zero values.
    virtual std::int32_t getInt(std::int32_t index = 0, double time = 0.0) const;
    virtual float getFloat(std::int32_t index = 0, double time = 0.0) const;
    virtual double getDouble(std::int32_t index = 0, double time = 0.0) const;
    virtual std::uint32_t getUInt(std::int32_t index = 0, double time = 0.0) const;
    virtual Vector getVector(std::int32_t index = 0, double time = 0.0) const;
    virtual Color getColor(std::int32_t index = 0, double time = 0.0) const;
    virtual AColor getAColor(std::int32_t index = 0, double time = 0.0) const;
    virtual Matrix getMatrix(std::int32_t index = 0, double time = 0.0) const;
    virtual Transform getTransform(std::int32_t index = 0, double time = 0.0) const;
    // Operation 19: a text element; null when there is none.
    virtual const char* getString(std::int32_t index = 0, double time = 0.0) const;
    // Operation 20: an object element; null when there is none. `output` selects
    // one output of an object that has several; the objects here have one.
    virtual PluginBase* getObject(std::int32_t index = 0, double time = 0.0, std::int32_t output = 0) const;

    // Operations 21 to 24: the whole list at a time, as a view of its elements.
    // Empty unless the parameter holds such a list.
    virtual std::span<const std::int32_t> getIntList(double time = 0.0) const;
    virtual std::span<const float> getFloatList(double time = 0.0) const;
    virtual std::span<const Vector> getVectorList(double time = 0.0) const;
    virtual std::span<const Color> getColorList(double time = 0.0) const;

    // Operation 25: the type code of the parameter, or for a list of the element at
    // `index`. Plain answer: kTypeUnspecified.
    virtual std::int32_t elementType(std::int32_t index = 0, double time = 0.0) const;

    // Setters used by the parameter's owner: set the value at `time`. False when
    // the parameter does not hold a value of that type (the plain answer).
    virtual bool setInt(std::int32_t value, std::int32_t index = 0, double time = 0.0);
    virtual bool setFloat(float value, std::int32_t index = 0, double time = 0.0);
    virtual bool setDouble(double value, std::int32_t index = 0, double time = 0.0);
    virtual bool setTransform(const Transform& value, std::int32_t index = 0, double time = 0.0);
};

// A parameter with a name.
class DefParamBase : public KavorPluginParameter {
public:
    explicit DefParamBase(std::string name) : name_(std::move(name)) {}

    const char* getName() const override { return name_.c_str(); }
    const std::string& name() const { return name_; }
    void setName(std::string name) { name_ = std::move(name); }

private:
    std::string name_;
};

// A list parameter: entering and leaving an element only counts the depth.
class DefListParamBase : public DefParamBase {
public:
    explicit DefListParamBase(std::string name) : DefParamBase(std::move(name)) {}

    ListHandle enterList(std::int32_t index, double time = 0.0) override;
    // Leaving with nothing entered does nothing.
    void leaveList(ListHandle handle) override;

    std::int32_t depth() const { return counter_; }

private:
    std::int32_t counter_ = 0;
};

// A list of values of type T.
template <class T>
class DefListParamBaseTyped : public DefListParamBase {
public:
    static constexpr std::size_t kInitialCapacity = 100;

    explicit DefListParamBaseTyped(std::string name) : DefListParamBase(std::move(name)) {
        values_.reserve(kInitialCapacity);
    }

    std::int32_t elementCount(double = 0.0) const override { return static_cast<std::int32_t>(values_.size()); }

    std::vector<T>& values() { return values_; }
    const std::vector<T>& values() const { return values_; }
    void setValues(std::span<const T> values) { values_.assign(values.begin(), values.end()); }

protected:
    // The element at `index`, or null when there is none.
    const T* at(std::int32_t index) const {
        if (index < 0 || static_cast<std::size_t>(index) >= values_.size()) return nullptr;
        return &values_[static_cast<std::size_t>(index)];
    }

private:
    std::vector<T> values_;
};

class DefIntListParam : public DefListParamBaseTyped<std::int32_t> {
public:
    using DefListParamBaseTyped::DefListParamBaseTyped;

    // The element at `index`; 0 past the end.
    std::int32_t getInt(std::int32_t index = 0, double time = 0.0) const override;
    std::span<const std::int32_t> getIntList(double time = 0.0) const override;
    std::int32_t elementType(std::int32_t index = 0, double time = 0.0) const override;
};

class DefVectorListParam : public DefListParamBaseTyped<Vector> {
public:
    using DefListParamBaseTyped::DefListParamBaseTyped;

    // The element at `index`; (0, 0, 0) past the end.
    Vector getVector(std::int32_t index = 0, double time = 0.0) const override;
    std::span<const Vector> getVectorList(double time = 0.0) const override;
    std::int32_t elementType(std::int32_t index = 0, double time = 0.0) const override;
};

// The extension interface through which the renderer asks an animated parameter
// for its keys.
class MyInterpolatingInterface : public PluginInterface {
public:
    static constexpr std::uint64_t kId = 0xBABADED00001ull;
    static constexpr const char* kName = "EXT_INTERPOLATING";

    std::uint64_t getInterfaceId() const override { return kId; }
    const char* getInterfaceName() const override { return kName; }

    virtual std::int32_t keyCount() const = 0;
    virtual double keyTime(std::int32_t index) const = 0;
    // 0 when the value blends between keys, 1 when it holds each key's value.
    virtual std::int32_t interpolationType() const = 0;
};

} // namespace KavorUtils

namespace OrvexKavorCore {

using KavorUtils::KavorPluginParameter;

// Owns the parameter objects of a plugin; they are released with the tracker or
// when it is cleared.
class KavorPluginParamTracker {
public:
    KavorPluginParamTracker() = default;
    KavorPluginParamTracker(const KavorPluginParamTracker&) = delete;
    KavorPluginParamTracker& operator=(const KavorPluginParamTracker&) = delete;

    // Takes ownership and returns the parameter for the caller's own use.
    template <class P>
    P* add(std::unique_ptr<P> param) {
        P* raw = param.get();
        if (raw) params_.push_back(std::move(param));
        return raw;
    }
    // Releases every parameter.
    void clear() { params_.clear(); }
    std::size_t size() const { return params_.size(); }
    bool empty() const { return params_.empty(); }
    bool owns(const KavorPluginParameter* param) const;

private:
    std::vector<std::unique_ptr<KavorPluginParameter>> params_;
};

} // namespace OrvexKavorCore
