#include <dexmor/materials/MaterialKind.hpp>

#include <dexmor/materials/ListReplay.hpp>
#include <dexmor/materials/SceneMaterials.hpp>

namespace OrvexKavorCore::material {

bool TextList::read(QuickArchive& ar, std::vector<std::string>& list) {
    const auto count = ar.get<std::uint32_t>();
    if (!ar.canHold(count, 4)) return ar.fail("a list of " + std::to_string(count) + " texts cannot fit in the data");
    list.clear();
    // The only such list, the object exclusion's names, shows in no asset of a
    // library: past the items a converted material may hold, it is checked only.
    const bool held = replay::holds(ar, count, true);
    if (held) list.reserve(count);
    for (std::uint32_t i = 0; i < count; ++i) {
        std::string text;
        if (!ar.readWString(text)) return false;
        if (held) list.push_back(std::move(text));
    }
    return true;
}

bool TextList::write(QuickArchive& ar, const std::vector<std::string>& list) {
    ar.write(static_cast<std::uint32_t>(list.size()));
    for (const std::string& text : list) ar.writeWString(text);
    return true;
}

bool copyMember(MaterialPtr& m, bool renamed) {
    if (!m) return true;
    m = renamed ? m->cloneRenamed() : m->clone();
    return static_cast<bool>(m);
}

bool copyMember(TexturePtr& t) {
    if (!t) return true;
    t = t->clone();
    return static_cast<bool>(t);
}

bool copyMember(BRDFPtr& b) {
    if (!b) return true;
    b = b->clone();
    return static_cast<bool>(b);
}

std::string uniqueName(const std::string& source) { return SceneMaterials::instance()->uniqueName(source); }

} // namespace OrvexKavorCore::material
