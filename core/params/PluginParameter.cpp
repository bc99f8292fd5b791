#include <dexmor/params/PluginParameter.hpp>

#include <algorithm>
#include <new>

// --- PluginBase ---

PluginInterface* PluginBase::getInterface(std::uint64_t id) {
    for (const Node& node : interfaces_)
        if (node.iface && node.iface->getInterfaceId() == id) return node.iface;
    return nullptr;
}

bool PluginBase::registerInterface(PluginInterface* iface, void* data) {
    try {
        interfaces_.push_front(Node{iface, data});
    } catch (const std::bad_alloc&) {
        return false;
    }
    return true;
}

bool PluginBase::unregisterInterface(PluginInterface* iface) {
    auto before = interfaces_.before_begin();
    for (auto it = interfaces_.begin(); it != interfaces_.end(); before = it, ++it) {
        if (it->iface == iface) {
            interfaces_.erase_after(before);
            return true;
        }
    }
    return false;
}

void* PluginBase::interfaceData(const PluginInterface* iface) const {
    for (const Node& node : interfaces_)
        if (node.iface == iface) return node.data;
    return nullptr;
}

namespace KavorUtils {

// --- KavorPluginParameter: the plain answers ---

std::int32_t KavorPluginParameter::elementCount(double) const { return -1; }
ListHandle KavorPluginParameter::enterList(std::int32_t, double) { return 0; }
void KavorPluginParameter::leaveList(ListHandle) {}

std::int32_t KavorPluginParameter::getInt(std::int32_t, double) const { return 0; }
float KavorPluginParameter::getFloat(std::int32_t, double) const { return 0.0f; }
double KavorPluginParameter::getDouble(std::int32_t, double) const { return 0.0; }
std::uint32_t KavorPluginParameter::getUInt(std::int32_t, double) const { return 0; }
Vector KavorPluginParameter::getVector(std::int32_t, double) const { return Vector{}; }
Color KavorPluginParameter::getColor(std::int32_t, double) const { return Color{}; }
AColor KavorPluginParameter::getAColor(std::int32_t, double) const { return AColor{}; }
Matrix KavorPluginParameter::getMatrix(std::int32_t, double) const { return Matrix::zero(); }
Transform KavorPluginParameter::getTransform(std::int32_t, double) const { return Transform::zero(); }
const char* KavorPluginParameter::getString(std::int32_t, double) const { return nullptr; }
PluginBase* KavorPluginParameter::getObject(std::int32_t, double, std::int32_t) const { return nullptr; }

std::span<const std::int32_t> KavorPluginParameter::getIntList(double) const { return {}; }
std::span<const float> KavorPluginParameter::getFloatList(double) const { return {}; }
std::span<const Vector> KavorPluginParameter::getVectorList(double) const { return {}; }
std::span<const Color> KavorPluginParameter::getColorList(double) const { return {}; }

std::int32_t KavorPluginParameter::elementType(std::int32_t, double) const { return kTypeUnspecified; }

bool KavorPluginParameter::setInt(std::int32_t, std::int32_t, double) { return false; }
bool KavorPluginParameter::setFloat(float, std::int32_t, double) { return false; }
bool KavorPluginParameter::setDouble(double, std::int32_t, double) { return false; }
bool KavorPluginParameter::setTransform(const Transform&, std::int32_t, double) { return false; }

// --- lists ---

ListHandle DefListParamBase::enterList(std::int32_t, double) {
    ++counter_;
    return 0;
}

void DefListParamBase::leaveList(ListHandle) {
    if (counter_ > 0) --counter_;
}

std::int32_t DefIntListParam::getInt(std::int32_t index, double) const {
    const std::int32_t* v = at(index);
    return v ? *v : 0;
}

std::span<const std::int32_t> DefIntListParam::getIntList(double) const { return values(); }

std::int32_t DefIntListParam::elementType(std::int32_t, double) const { return kTypeInt; }

Vector DefVectorListParam::getVector(std::int32_t index, double) const {
    const Vector* v = at(index);
    return v ? *v : Vector{};
}

std::span<const Vector> DefVectorListParam::getVectorList(double) const { return values(); }

std::int32_t DefVectorListParam::elementType(std::int32_t, double) const { return kTypeVector; }

} // namespace KavorUtils

namespace OrvexKavorCore {

bool KavorPluginParamTracker::owns(const KavorPluginParameter* param) const {
    return std::any_of(params_.begin(), params_.end(), [param](const auto& p) { return p.get() == param; });
}

} // namespace OrvexKavorCore
