#include <dexmor/params/SerialListParams.hpp>

#include <dexmor/archive/QuickArchive.hpp>

#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

namespace OrvexKavorCore {

namespace {

// The elements are moved as one block in their in-memory form, which for these
// types is exactly the stored form.
static_assert(sizeof(std::int32_t) == 4);
static_assert(sizeof(Vector) == 12 && std::is_trivially_copyable_v<Vector>);

template <class T>
bool writeList(QuickArchive& ar, const std::vector<T>& values, const std::string& name) {
    const std::uint64_t bytes = static_cast<std::uint64_t>(values.size()) * sizeof(T);
    if (bytes > std::numeric_limits<std::uint32_t>::max()) return false;
    ar.write(VersionWord::make(0, 1));
    ar.write(static_cast<std::uint32_t>(values.size()));
    ar.write(static_cast<std::uint32_t>(sizeof(T)));
    ar.writeBytes(values.data(), static_cast<std::uint32_t>(bytes));
    ar.writeString(name);
    return true;
}

template <class T>
bool readList(QuickArchive& ar, std::vector<T>& values, std::string& name, const char* what) {
    const auto version = ar.get<VersionWord>();
    if (!version.is(0, 1)) return ar.fail(std::string("unknown ") + what + " version");
    const auto count = ar.get<std::uint32_t>();
    // The element size, then the block (its count and count × size bytes) must fit
    // in what is left; this also keeps count × size within 32 bits, as archives are
    // smaller than 4 GiB.
    if (static_cast<std::uint64_t>(count) * sizeof(T) + 8 > ar.remaining())
        return ar.fail(std::string(what) + " of " + std::to_string(count) + " elements does not fit in the " +
                       std::to_string(ar.remaining()) + " bytes left");
    const auto elementSize = ar.getAs<std::uint32_t>("element size");
    if (elementSize != sizeof(T))
        return ar.fail(std::string(what) + " elements of " + std::to_string(elementSize) + " bytes, expected " +
                       std::to_string(sizeof(T)));
    const auto capacity = static_cast<std::uint32_t>(count * sizeof(T));
    values.resize(count);
    const auto stored = ar.readBytes(values.data(), capacity, false);
    if (!stored) return false;
    if (*stored != capacity)
        return ar.fail(std::string(what) + " block of " + std::to_string(*stored) + " bytes, expected " +
                       std::to_string(capacity));
    return ar.readString(name);
}

} // namespace

bool DefSerialIntListParam::writeToArchive(QuickArchive& ar) { return writeList(ar, values(), name()); }

bool DefSerialIntListParam::readFromArchive(QuickArchive& ar) {
    std::string storedName = name();
    const bool ok = readList(ar, values(), storedName, "integer list");
    setName(std::move(storedName));
    return ok;
}

bool DefSerialVectorListParam::writeToArchive(QuickArchive& ar) { return writeList(ar, values(), name()); }

bool DefSerialVectorListParam::readFromArchive(QuickArchive& ar) {
    std::string storedName = name();
    const bool ok = readList(ar, values(), storedName, "vector list");
    setName(std::move(storedName));
    return ok;
}

} // namespace OrvexKavorCore
