#pragma once
// Long lists of members, read again when they are written.
//
// A material's tree is held whole between reading it and writing its assets. For
// lists of members that is fine at the lengths real libraries use (a few BRDF
// layers), but a small file can hold one material with hundreds of thousands of
// cheap items whose objects take several times their bytes. So while a library
// is converted (ListReplay::enabled), a material holds at most kHeldItems items
// of lists: a list that would go beyond is read through once to check it and to
// reach the fields after it, and its items are then forgotten. The list keeps
// where its items are stored (ReplayedList), and the writer reads them again
// from there, one item at a time.
//
// Reading an item again repeats what reading it did, and sky records write into
// the conversion's default sun: the sun's state from the end of the material's
// reading is put back after each item, as the writer of a held list sees it.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/model/PerConversion.hpp>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace OrvexKavorCore {

// Whether the conversion on this thread reads long lists again when it writes
// them; never outside the conversion of a library.
struct ListReplay {
    bool enabled = false;
    std::uint64_t heldItems = 0; // by the material being read
    static constexpr std::uint32_t kHeldItems = 4096;
};

// Where a list's items are stored, for reading them again.
struct ReplayedList {
    QuickArchive* archive = nullptr; // the archive the list was read from (alive while the material is written)
    std::uint64_t position = 0;      // the archive position of its first item
    std::uint32_t count = 0;         // the items that read

    explicit operator bool() const { return archive != nullptr; }
};

namespace replay {

// Whether a list of `count` items that starts empty is held (counted against
// the material's items), or only checked (the conversion replays lists and it
// would take the material beyond the items it may hold).
inline bool holds(const QuickArchive& ar, std::uint32_t count, bool startsEmpty) {
    ListReplay& state = PerConversion<ListReplay>::current();
    const bool forget =
        state.enabled && startsEmpty && !ar.observer() && state.heldItems + count > ListReplay::kHeldItems;
    if (!forget) state.heldItems += count;
    return !forget;
}

// Reads a list of required members (UInt32 count, then the items), appending
// each item that reads to `list`. A list that may be replayed (`replayed` given)
// and is not held (see holds) has its items checked only, and where they are
// noted in `replayed`. A member record takes at least its kind id and a version
// word, so a count that cannot fit in the remaining bytes fails at once. False
// when an item fails.
template <class Ptr>
bool readList(QuickArchive& ar, std::vector<Ptr>& list, ReplayedList* replayed) {
    const auto count = ar.get<std::uint32_t>();
    if (!ar.canHold(count, 8)) return ar.fail("a list of " + std::to_string(count) + " cannot fit in the data");
    const bool forget = replayed && !holds(ar, count, list.empty());
    if (replayed) *replayed = forget ? ReplayedList{&ar, ar.readPosition(), 0} : ReplayedList{};
    for (std::uint32_t i = 0; i < count; ++i) {
        Ptr item;
        if (!readMember(ar, item, nullptr, i)) return false;
        if (forget)
            ++replayed->count;
        else
            list.push_back(std::move(item));
    }
    return true;
}

// A record table's row for the list member `List`, which a conversion may
// replay through the member `Replayed`; written and compared as a held list.
template <auto List, auto Replayed>
constexpr auto listRow(const char* name) {
    using Obj = typename record::MemberTraits<decltype(List)>::Class;
    const auto held = record::field<List>(name);
    return record::Field<Obj>{
        name,
        record::always(),
        [](QuickArchive& ar, Obj& object) { return readList(ar, object.*List, &(object.*Replayed)); },
        held.write,
        held.equal,
    };
}

// Reads the items of `replayed` again, in order, each with `readItem` (given the
// archive at the item and its index; false stops). The reading position and the
// default sun are as they were before, afterwards.
void readAgain(const ReplayedList& replayed, const std::function<bool(QuickArchive&, std::uint32_t)>& readItem);

// Calls `visit` with each item of `replayed`, read again, in order.
template <class Ptr>
void forEach(const ReplayedList& replayed, const std::function<void(const Ptr&)>& visit) {
    readAgain(replayed, [&visit](QuickArchive& ar, std::uint32_t index) {
        Ptr item;
        if (!readMember(ar, item, nullptr, index)) return false;
        visit(item);
        return true;
    });
}

} // namespace replay

} // namespace OrvexKavorCore
