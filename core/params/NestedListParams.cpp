#include <dexmor/params/NestedListParams.hpp>

#include <dexmor/platform/Text.hpp>

namespace OrvexKavorCore {

using KavorUtils::ListHandle;

namespace {

template <class V>
const typename V::value_type* elementAt(const V& values, std::int32_t index) {
    if (index < 0 || static_cast<std::size_t>(index) >= values.size()) return nullptr;
    return &values[static_cast<std::size_t>(index)];
}

} // namespace

// --- strings ---

std::int32_t DefStringListParam::elementCount(double) const {
    return depth_ == 0 ? static_cast<std::int32_t>(strings_.size()) : -1;
}

ListHandle DefStringListParam::enterList(std::int32_t, double) {
    ++depth_;
    return 0;
}

void DefStringListParam::leaveList(ListHandle) {
    if (depth_ > 0) --depth_;
}

const char* DefStringListParam::getString(std::int32_t index, double) const {
    const std::string* s = elementAt(strings_, index);
    return s ? s->c_str() : nullptr;
}

std::int32_t DefStringListParam::elementType(std::int32_t, double) const { return KavorUtils::kTypeString; }

// --- (name, object) pairs ---

PluginBase* DefPluginPairListParam::findByName(std::string_view name) const {
    for (const auto& [pairName, object] : pairs_)
        if (text::equalsIgnoringAsciiCase(pairName, name)) return object;
    return nullptr;
}

std::int32_t DefPluginPairListParam::elementCount(double) const {
    if (depth_ == 0) return static_cast<std::int32_t>(pairs_.size());
    return depth_ == 1 ? 2 : -1;
}

ListHandle DefPluginPairListParam::enterList(std::int32_t index, double) {
    ++depth_;
    if (depth_ != 1) return 0;
    current_ = index;
    return 1;
}

void DefPluginPairListParam::leaveList(ListHandle) {
    if (depth_ > 0) --depth_;
}

const std::pair<std::string, PluginBase*>* DefPluginPairListParam::currentPair() const {
    return depth_ == 1 ? elementAt(pairs_, current_) : nullptr;
}

const char* DefPluginPairListParam::getString(std::int32_t index, double) const {
    const auto* pair = currentPair();
    return pair && index == 0 ? pair->first.c_str() : nullptr;
}

PluginBase* DefPluginPairListParam::getObject(std::int32_t index, double, std::int32_t) const {
    const auto* pair = currentPair();
    return pair && index == 1 ? pair->second : nullptr;
}

std::int32_t DefPluginPairListParam::elementType(std::int32_t index, double) const {
    if (depth_ == 0) return KavorUtils::kTypeList;
    if (depth_ == 1 && index == 0) return KavorUtils::kTypeString;
    if (depth_ == 1 && index == 1) return KavorUtils::kTypeObject;
    return KavorUtils::kTypeUnspecified;
}

// --- multi-material slots ---

bool DefMultiMtlParam::addEntry(PluginBase* object, std::int32_t id) {
    if (!object || id < 0) return false;
    entries_.emplace_back(id, object);
    return true;
}

std::int32_t DefMultiMtlParam::elementCount(double) const {
    if (openStack_.empty()) return static_cast<std::int32_t>(entries_.size());
    return openStack_.size() == 1 ? 2 : -1;
}

ListHandle DefMultiMtlParam::enterList(std::int32_t index, double) {
    ListHandle handle = 0;
    if (openStack_.empty()) {
        current_ = index;
        handle = kEntryHandle;
    }
    openStack_.push_back(index);
    return handle;
}

void DefMultiMtlParam::leaveList(ListHandle handle) {
    if (openStack_.empty()) return;
    openStack_.pop_back();
    if (handle == kEntryHandle) current_ = -1;
}

const std::pair<std::int32_t, PluginBase*>* DefMultiMtlParam::currentEntry() const {
    return elementAt(entries_, current_);
}

std::int32_t DefMultiMtlParam::getInt(std::int32_t index, double) const {
    const auto* entry = currentEntry();
    return entry && index == 0 ? entry->first : -1;
}

PluginBase* DefMultiMtlParam::getObject(std::int32_t index, double, std::int32_t) const {
    const auto* entry = currentEntry();
    return entry && index == 1 ? entry->second : nullptr;
}

} // namespace OrvexKavorCore
