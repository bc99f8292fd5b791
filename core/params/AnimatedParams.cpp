#include <dexmor/params/AnimatedParams.hpp>

#include <dexmor/archive/QuickArchive.hpp>

#include <cmath>
#include <vector>

namespace OrvexKavorCore {

template <class Container>
bool DefAnimParam<Container>::readNameAndValue(QuickArchive& ar) {
    if (!ar.readString(name_)) return false;
    return value_.readFromArchive(ar);
}

template <class Container>
bool DefAnimParam<Container>::writeRecord(QuickArchive& ar, VersionWord version) const {
    ar.write(version);
    ar.writeString(name_);
    return value_.writeRecord(ar);
}

template class DefAnimParam<AnimatedInt>;
template class DefAnimParam<AnimatedReal>;
template class DefAnimParam<AnimatedTransform>;

// --- integer ---

std::int32_t DefAnimIntParam::getInt(std::int32_t, double time) const { return value_.valueAt(time); }

bool DefAnimIntParam::setInt(std::int32_t value, std::int32_t, double time) {
    value_.setValue(value, time);
    return true;
}

bool DefAnimIntParam::writeToArchive(QuickArchive& ar) { return writeRecord(ar, VersionWord::make(0, 1)); }

bool DefAnimIntParam::readFromArchive(QuickArchive& ar) {
    const auto version = ar.get<VersionWord>();
    value_.resetToDefaults();
    if (!version.is(0, 1)) return ar.fail("unknown animated integer parameter version");
    return readNameAndValue(ar);
}

// --- real ---

float DefAnimRealParam::getFloat(std::int32_t, double time) const { return value_.valueAt(time); }
double DefAnimRealParam::getDouble(std::int32_t, double time) const { return value_.valueAt(time); }

bool DefAnimRealParam::setFloat(float value, std::int32_t, double time) {
    value_.setValue(value, time);
    return true;
}

bool DefAnimRealParam::setDouble(double value, std::int32_t, double time) {
    value_.setValue(static_cast<float>(value), time);
    return true;
}

bool DefAnimRealParam::writeToArchive(QuickArchive& ar) { return writeRecord(ar, VersionWord::make(0, 1)); }

bool DefAnimRealParam::readFromArchive(QuickArchive& ar) {
    const auto version = ar.get<VersionWord>();
    value_.resetToDefaults();
    if (!version.is(0, 1)) return ar.fail("unknown animated real parameter version");
    return readNameAndValue(ar);
}

// --- transform ---

Transform DefAnimTransformParam::getTransform(std::int32_t, double time) const { return value_.valueAt(time); }

bool DefAnimTransformParam::setTransform(const Transform& value, std::int32_t, double time) {
    value_.setValue(value, time);
    return true;
}

bool DefAnimTransformParam::writeToArchive(QuickArchive& ar) { return writeRecord(ar, VersionWord::make(0, 2)); }

bool DefAnimTransformParam::readFromArchive(QuickArchive& ar) {
    const auto version = ar.get<VersionWord>();
    value_.resetToDefaults();
    if (version.is(0, 2)) return readNameAndValue(ar);
    if (!version.is(0, 1)) return ar.fail("unknown animated transform parameter version");

    // Version 1 stored the keys directly, without a record of their own.
    if (!ar.readString(name_)) return false;
    const auto count = ar.getAs<std::uint32_t>("key count");
    constexpr std::uint64_t kKeySize = 8 + 48;
    const std::uint64_t left = ar.remaining() > 4 ? ar.remaining() - 4 : 0; // after the time size
    if (count > left / kKeySize)
        return ar.fail(std::to_string(count) + " keys do not fit in the " + std::to_string(left) + " bytes left");
    const auto timeSize = ar.getAs<std::uint32_t>("key time size");
    if (timeSize != 8) return ar.fail("animated transform key times of " + std::to_string(timeSize) + " bytes");
    std::vector<AnimatedTransform::Key> keys;
    keys.reserve(count);
    for (std::uint32_t i = 0; i < count; ++i) {
        const auto time = ar.getAs<double>("key time");
        if (std::isnan(time)) return ar.fail("animated transform key time that is not a number");
        keys.push_back({time, ar.getAs<Transform>("key value")});
    }
    value_.setValues(std::move(keys));
    return true;
}

} // namespace OrvexKavorCore
