#include <dexmor/params/AnimatedValues.hpp>

#include <algorithm>
#include <cmath>
#include <iterator>

namespace OrvexKavorCore {

namespace detail {

// Blends are (1 - f) * a + f * b with the 32-bit blend factor f.

template <>
struct AnimatedTraits<std::int32_t> {
    static constexpr bool kStoresInterpolate = true;
    static constexpr std::uint64_t kStoredSize = 4;
    static constexpr const char* kWhat = "animated integer";
    static std::int32_t defaultValue() { return 0; }
    // Computed in double precision and truncated toward zero. Rounding can carry the
    // sum a hair outside [a, b]; it is kept inside, so that two equal keys blend to
    // their own value and the conversion to 32 bits is always defined.
    static std::int32_t blend(std::int32_t a, std::int32_t b, float f) {
        const double fd = f;
        const double v = (1.0 - fd) * static_cast<double>(a) + fd * static_cast<double>(b);
        return static_cast<std::int32_t>(std::clamp(v, static_cast<double>(std::min(a, b)),
                                                    static_cast<double>(std::max(a, b))));
    }
};

inline float blendFloat(float a, float b, float f) {
    const float wa = (1.0f - f) * a;
    const float wb = f * b;
    return wa + wb;
}

template <>
struct AnimatedTraits<float> {
    static constexpr bool kStoresInterpolate = true;
    static constexpr std::uint64_t kStoredSize = 4;
    static constexpr const char* kWhat = "animated real";
    static float defaultValue() { return 0.0f; }
    static float blend(float a, float b, float f) { return blendFloat(a, b, f); }
};

template <>
struct AnimatedTraits<Transform> {
    static constexpr bool kStoresInterpolate = false;
    static constexpr std::uint64_t kStoredSize = 48;
    static constexpr const char* kWhat = "animated transform";
    static Transform defaultValue() { return Transform::identity(); }
    static Vector blend(const Vector& a, const Vector& b, float f) {
        return Vector{blendFloat(a.x, b.x, f), blendFloat(a.y, b.y, f), blendFloat(a.z, b.z, f)};
    }
    static Transform blend(const Transform& a, const Transform& b, float f) {
        Transform t;
        for (int c = 0; c < 3; ++c) t.m[c] = blend(a.m[c], b.m[c], f);
        t.offs = blend(a.offs, b.offs, f);
        return t;
    }
};

} // namespace detail

namespace {
constexpr std::uint32_t kTimeSize = 8;
}

template <class T>
AnimatedValue<T>::AnimatedValue(bool interpolate)
    : keys_{Key{0.0, detail::AnimatedTraits<T>::defaultValue()}}, interpolate_(interpolate) {}

template <class T>
T AnimatedValue<T>::valueAt(double time) const {
    using Traits = detail::AnimatedTraits<T>;
    if (keys_.empty()) return Traits::defaultValue();
    // The first key later than `time`.
    const auto later =
        std::upper_bound(keys_.begin(), keys_.end(), time, [](double t, const Key& k) { return t < k.time; });
    if (later == keys_.end()) return keys_.back().value; // at or after the last key
    if (later == keys_.begin()) return later->value;     // before the first key
    const Key& previous = *std::prev(later);
    if (previous.time == time || !interpolate_) return previous.value;
    float f = static_cast<float>((time - previous.time) / (later->time - previous.time));
    // Only infinite key times give no number here (infinity over infinity).
    if (std::isnan(f)) f = 0.0f;
    return Traits::blend(previous.value, later->value, f);
}

template <class T>
void AnimatedValue<T>::setValue(const T& value, double time) {
    if (std::isnan(time)) return;
    const auto at =
        std::lower_bound(keys_.begin(), keys_.end(), time, [](const Key& k, double t) { return k.time < t; });
    if (at != keys_.end() && at->time == time)
        at->value = value;
    else
        keys_.insert(at, Key{time, value});
}

template <class T>
double AnimatedValue<T>::keyTime(std::int32_t index) const {
    if (index < 0 || static_cast<std::size_t>(index) >= keys_.size()) return 0.0;
    return keys_[static_cast<std::size_t>(index)].time;
}

template <class T>
void AnimatedValue<T>::resetToDefaults() {
    setConstant(detail::AnimatedTraits<T>::defaultValue());
}

template <class T>
void AnimatedValue<T>::setConstant(const T& value) {
    keys_.clear();
    keys_.push_back(Key{0.0, value});
}

template <class T>
bool AnimatedValue<T>::writeRecord(QuickArchive& ar) const {
    ar.write(VersionWord::make(0, 1));
    ar.write(static_cast<std::uint32_t>(keys_.size()));
    ar.write(kTimeSize);
    if constexpr (detail::AnimatedTraits<T>::kStoresInterpolate) ar.write(interpolate_);
    for (const Key& key : keys_) {
        ar.write(key.time);
        ar.write(key.value);
    }
    return true;
}

template <class T>
void AnimatedValue<T>::setValues(std::vector<Key> keys) {
    // Sorting keeps keys of equal time in their order, so the later one wins, and an
    // existing key goes before the new ones of its time, so its time is kept.
    std::erase_if(keys, [](const Key& k) { return std::isnan(k.time); });
    const auto earlier = [](const Key& a, const Key& b) { return a.time < b.time; };
    std::stable_sort(keys.begin(), keys.end(), earlier);
    std::vector<Key> merged;
    merged.reserve(keys_.size() + keys.size());
    const auto put = [&merged](const Key& k) {
        if (!merged.empty() && merged.back().time == k.time)
            merged.back().value = k.value;
        else
            merged.push_back(k);
    };
    auto old = keys_.begin();
    for (const Key& k : keys) {
        while (old != keys_.end() && !earlier(k, *old)) put(*old++);
        put(k);
    }
    while (old != keys_.end()) put(*old++);
    keys_ = std::move(merged);
}

template <class T>
bool AnimatedValue<T>::readFromArchive(QuickArchive& ar) {
    using Traits = detail::AnimatedTraits<T>;
    const auto version = ar.get<VersionWord>();
    resetToDefaults();
    if (!version.is(0, 1)) return ar.fail(std::string("unknown ") + Traits::kWhat + " version");
    const auto count = ar.getAs<std::uint32_t>("key count");
    // The keys follow the time size (and the blending flag).
    constexpr std::uint64_t kBeforeKeys = 4 + (Traits::kStoresInterpolate ? 1 : 0);
    const std::uint64_t left = ar.remaining() > kBeforeKeys ? ar.remaining() - kBeforeKeys : 0;
    if (count > left / (kTimeSize + Traits::kStoredSize))
        return ar.fail(std::to_string(count) + " keys do not fit in the " + std::to_string(left) + " bytes left");
    const auto timeSize = ar.getAs<std::uint32_t>("key time size");
    if (timeSize != kTimeSize)
        return ar.fail(std::string(Traits::kWhat) + " key times of " + std::to_string(timeSize) + " bytes");
    if constexpr (Traits::kStoresInterpolate)
        ar.readAs("interpolate", interpolate_);
    else
        removeAllKeys();
    // Set all at once: one by one, keys stored in descending time would take
    // quadratic time.
    std::vector<Key> stored;
    stored.reserve(count);
    for (std::uint32_t i = 0; i < count; ++i) {
        const auto time = ar.getAs<double>("key time");
        if (std::isnan(time)) return ar.fail(std::string(Traits::kWhat) + " key time that is not a number");
        stored.push_back(Key{time, ar.getAs<T>("key value")});
    }
    setValues(std::move(stored));
    return true;
}

template class AnimatedValue<std::int32_t>;
template class AnimatedValue<float>;
template class AnimatedValue<Transform>;

} // namespace OrvexKavorCore
