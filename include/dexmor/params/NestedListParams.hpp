#pragma once
// List parameters that are handed to the renderer but never stored: a list of
// strings, a list of (name, object) pairs and the slots of a multi-material.
//
// A consumer walks them through the nested-list operations of the parameter
// interface: elementCount() at the top level, enterList(i) to go into element i,
// the typed getters for the parts of that element, leaveList(handle) to come back.
// Every query outside the list (a bad index, nothing entered, leaving more often
// than entering) gives a neutral answer: -1 or 0, null, no change.
#include <dexmor/params/PluginParameter.hpp>

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace OrvexKavorCore {

// A flat list of strings. Entering only counts the depth; at the top level the
// element count is the number of strings, deeper there are no elements.
class DefStringListParam : public KavorPluginParameter {
public:
    explicit DefStringListParam(std::string name) : name_(std::move(name)) {}
    DefStringListParam(std::string name, std::vector<std::string> strings)
        : name_(std::move(name)), strings_(std::move(strings)) {}

    void append(std::string text) { strings_.push_back(std::move(text)); }
    const std::vector<std::string>& strings() const { return strings_; }

    const char* getName() const override { return name_.c_str(); }
    std::int32_t elementCount(double time = 0.0) const override;
    KavorUtils::ListHandle enterList(std::int32_t index, double time = 0.0) override;
    void leaveList(KavorUtils::ListHandle handle) override;
    // The string at `index`; null past the end.
    const char* getString(std::int32_t index = 0, double time = 0.0) const override;
    // Always kTypeString.
    std::int32_t elementType(std::int32_t index = 0, double time = 0.0) const override;

private:
    std::string name_;
    std::vector<std::string> strings_;
    std::int32_t depth_ = 0;
};

// A list of (name, object) pairs. Each pair is a list of two elements: the name
// (a string at index 0) and the object (at index 1). The objects are not owned.
class DefPluginPairListParam : public KavorPluginParameter {
public:
    explicit DefPluginPairListParam(std::string name) : name_(std::move(name)) {}

    void addPair(std::string name, PluginBase* object) { pairs_.emplace_back(std::move(name), object); }
    // The object of the first pair whose name equals `name`, ignoring the case of
    // ASCII letters; null when there is none.
    PluginBase* findByName(std::string_view name) const;
    const std::vector<std::pair<std::string, PluginBase*>>& pairs() const { return pairs_; }

    const char* getName() const override { return name_.c_str(); }
    // Top level: the number of pairs; inside a pair: 2; deeper: -1.
    std::int32_t elementCount(double time = 0.0) const override;
    // Entering from the top level selects pair `index` and returns 1; entering
    // deeper returns 0.
    KavorUtils::ListHandle enterList(std::int32_t index, double time = 0.0) override;
    void leaveList(KavorUtils::ListHandle handle) override;
    // Inside a pair, index 0: its name.
    const char* getString(std::int32_t index = 0, double time = 0.0) const override;
    // Inside a pair, index 1: its object.
    PluginBase* getObject(std::int32_t index = 0, double time = 0.0, std::int32_t output = 0) const override;
    // Top level: kTypeList; inside a pair: kTypeString for index 0, kTypeObject for
    // index 1; anything else kTypeUnspecified.
    std::int32_t elementType(std::int32_t index = 0, double time = 0.0) const override;

private:
    const std::pair<std::string, PluginBase*>* currentPair() const;

    std::string name_;
    std::vector<std::pair<std::string, PluginBase*>> pairs_;
    std::int32_t depth_ = 0;
    std::int32_t current_ = 0;
};

// The slots of a multi-material: (id, material object) entries. Each entry is a
// list of two elements: the id (an integer at index 0) and the object (at index 1).
class DefMultiMtlParam : public KavorPluginParameter {
public:
    // The handle of an entered entry.
    static constexpr KavorUtils::ListHandle kEntryHandle = 0xDEADBEEF;

    explicit DefMultiMtlParam(std::string name) : name_(std::move(name)) {}

    // Appends (id, object) when the object is present and the id is not negative.
    bool addEntry(PluginBase* object, std::int32_t id);
    const std::vector<std::pair<std::int32_t, PluginBase*>>& entries() const { return entries_; }

    const char* getName() const override { return name_.c_str(); }
    // Top level: the number of entries; inside an entry: 2; deeper: -1.
    std::int32_t elementCount(double time = 0.0) const override;
    // Entering from the top level selects entry `index` and returns kEntryHandle;
    // entering deeper returns 0.
    KavorUtils::ListHandle enterList(std::int32_t index, double time = 0.0) override;
    // Leaving with kEntryHandle deselects the entry.
    void leaveList(KavorUtils::ListHandle handle) override;
    // Index 0: the id of the selected entry; -1 otherwise.
    std::int32_t getInt(std::int32_t index = 0, double time = 0.0) const override;
    // Index 1: the object of the selected entry; null otherwise.
    PluginBase* getObject(std::int32_t index = 0, double time = 0.0, std::int32_t output = 0) const override;

private:
    const std::pair<std::int32_t, PluginBase*>* currentEntry() const;

    std::vector<std::pair<std::int32_t, PluginBase*>> entries_;
    std::vector<std::int32_t> openStack_;
    std::string name_;
    std::int32_t current_ = -1;
};

} // namespace OrvexKavorCore
