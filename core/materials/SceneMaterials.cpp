#include <dexmor/materials/SceneMaterials.hpp>

#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/materials/LayeredMaterials.hpp>
#include <dexmor/materials/MaterialKind.hpp>
#include <dexmor/materials/ReferenceMaterials.hpp>
#include <dexmor/platform/Text.hpp>
#include <dexmor/platform/Uuid.hpp>

#include <boost/make_shared.hpp>

#include <algorithm>
#include <mutex>
#include <ostream>

namespace OrvexKavorCore {

// UTF-8 bytes already order by code point. UTF-16 code units differ from that in
// one respect: characters beyond U+FFFF (surrogate pairs, D800-DFFF) sort before
// U+E000-U+FFFF. In UTF-8 those are the sequences led by 0xF0-0xF4 and by
// 0xEE-0xEF; where two texts first differ in such lead bytes, the order turns.
bool Utf16Order::operator()(std::string_view a, std::string_view b) const {
    const std::size_t n = std::min(a.size(), b.size());
    std::size_t i = 0;
    while (i < n && a[i] == b[i]) ++i;
    if (i == n) return a.size() < b.size();
    const auto ca = static_cast<unsigned char>(a[i]), cb = static_cast<unsigned char>(b[i]);
    const auto upperBmp = [](unsigned char c) { return c == 0xEE || c == 0xEF; };
    const auto beyondBmp = [](unsigned char c) { return c >= 0xF0; };
    if (upperBmp(ca) && beyondBmp(cb)) return false;
    if (beyondBmp(ca) && upperBmp(cb)) return true;
    return ca < cb;
}

namespace {

// The layered material with one diffuse layer that default materials are copied
// from; built once, on first use.
const MaterialPtr& defaultPrototype() {
    static const MaterialPtr prototype = [] {
        auto layered = boost::make_shared<MaterialLayeredBRDF>();
        layered->name = std::string(SceneMaterials::kPrototypeName);
        if (BRDFPtr diffuse = createBRDF(Base_BRDF::kDiffuse)) {
            diffuse->name = std::string(SceneMaterials::kPrototypeLayerName);
            layered->layers.push_back(std::move(diffuse));
        }
        return MaterialPtr(std::move(layered));
    }();
    return prototype;
}

bool isAsciiDigit(char c) { return c >= '0' && c <= '9'; }

} // namespace

boost::shared_ptr<SceneMaterials> SceneMaterials::instance() {
    static const boost::shared_ptr<SceneMaterials> library = boost::make_shared<SceneMaterials>();
    return library;
}

// --- entries ---

bool SceneMaterials::add(const MaterialPtr& material) {
    if (!material || material->name.empty()) return false;
    std::unique_lock lock(mutex_);
    return addLocked(material);
}

bool SceneMaterials::addLocked(const MaterialPtr& material) {
    if (!isFreeLocked(material->name)) return false;
    std::string id = material->identifier;
    // An identifier another entry holds would take that entry's place.
    if (id.empty() || byId_.count(id) != 0) id = newUuidText();
    byName_.emplace(material->name, material);
    byId_.emplace(std::move(id), material->name);
    return true;
}

bool SceneMaterials::remove(std::string_view name) {
    std::unique_lock lock(mutex_);
    const auto entry = byName_.find(name);
    if (entry == byName_.end()) return false;
    byName_.erase(entry);
    const auto id = findIdEntry(name);
    if (id != byId_.end()) byId_.erase(id);
    return true;
}

MaterialPtr SceneMaterials::get(std::string_view name) const {
    std::shared_lock lock(mutex_);
    const auto entry = byName_.find(name);
    return entry == byName_.end() ? MaterialPtr() : entry->second;
}

MaterialPtr SceneMaterials::getById(std::string_view identifier) const {
    std::shared_lock lock(mutex_);
    const auto id = byId_.find(identifier);
    if (id == byId_.end()) return {};
    const auto entry = byName_.find(id->second);
    return entry == byName_.end() ? MaterialPtr() : entry->second;
}

std::string SceneMaterials::idOf(std::string_view name) const {
    std::shared_lock lock(mutex_);
    const auto id = findIdEntry(name);
    return id == byId_.end() ? std::string() : id->first;
}

// Names that differ only in ASCII case are distinct entries, so an exact match
// comes first.
SceneMaterials::ById::const_iterator SceneMaterials::findIdEntry(std::string_view name) const {
    const auto exact =
        std::find_if(byId_.begin(), byId_.end(), [&](const auto& entry) { return entry.second == name; });
    if (exact != byId_.end()) return exact;
    return std::find_if(byId_.begin(), byId_.end(),
                        [&](const auto& entry) { return text::equalsIgnoringAsciiCase(entry.second, name); });
}

void SceneMaterials::ensureDefault() {
    if (!isFree(kDefaultMaterialName)) return;
    // Copied without the lock: the copy consults the library for its name.
    MaterialPtr made = defaultPrototype()->cloneRenamed();
    made->name = defaultName();
    add(made);
}

// --- names ---

bool SceneMaterials::isFree(std::string_view name) const {
    std::shared_lock lock(mutex_);
    return isFreeLocked(name);
}

bool SceneMaterials::validateName(std::string_view name, std::string& message) const {
    message.clear();
    if (!isFree(name)) {
        message = "The name, \"" + std::string(name) + "\", is already in use";
        return false;
    }
    if (name.empty()) {
        message = "A name must have at least one character";
        return false;
    }
    return true;
}

std::string SceneMaterials::uniqueName(std::string_view name) const {
    std::string_view base = name;
    while (!base.empty() && isAsciiDigit(base.back())) base.remove_suffix(1);
    std::shared_lock lock(mutex_);
    // The library is finite, so some counter form is free.
    std::string candidate(base);
    for (std::uint64_t counter = 1;; ++counter) {
        if (!candidate.empty() && isFreeLocked(candidate)) {
            std::string legal = legalName(candidate);
            if (isFreeLocked(legal)) return legal;
        }
        candidate = std::string(base) + std::to_string(counter);
    }
}

std::string SceneMaterials::legalName(std::string_view name) {
    std::string legal(name);
    std::replace(legal.begin(), legal.end(), ' ', '_');
    if (!legal.empty() && isAsciiDigit(legal.front())) legal.insert(legal.begin(), 'a');
    return legal;
}

bool SceneMaterials::rename(std::string_view oldName, const MaterialPtr& material) {
    if (!material || material->name.empty()) return false;
    const std::string newName = material->name;
    std::unique_lock lock(mutex_);
    const auto entry = byName_.find(oldName);
    if (entry == byName_.end()) return false;
    const bool changed = newName != oldName;
    if (changed && !isFreeLocked(newName)) return false;
    const auto id = changed ? findIdEntry(oldName) : byId_.end();
    byName_.erase(entry);
    byName_.emplace(newName, material);
    if (id != byId_.end()) byId_[id->first] = newName;
    return true;
}

void SceneMaterials::names(std::vector<std::string>& out) const {
    std::shared_lock lock(mutex_);
    for (const auto& entry : byName_) out.push_back(entry.first);
}

void SceneMaterials::clear() {
    std::unique_lock lock(mutex_);
    byName_.clear();
    byId_.clear();
}

std::size_t SceneMaterials::size() const {
    std::shared_lock lock(mutex_);
    return byName_.size();
}

// --- copies ---

MaterialPtr SceneMaterials::makeReference(std::string_view name) const {
    std::string target = idOf(name);
    auto reference = boost::make_shared<MaterialReference>();
    reference->targetId = std::move(target);
    return reference;
}

MaterialPtr SceneMaterials::getOrCopy(std::string_view name) const {
    const MaterialPtr found = get(name);
    return found ? found->cloneRenamed() : found;
}

void SceneMaterials::dump(std::ostream& out) const {
    std::shared_lock lock(mutex_);
    for (const auto& [key, material] : byName_) out << key << ' ' << (material ? material->name : "") << '\n';
    out << "Beginning UUIDs\n";
    for (const auto& [key, value] : byId_) out << key << ' ' << value << '\n';
}

// --- record and XML ---

std::vector<std::pair<std::string, MaterialPtr>> SceneMaterials::materialsSnapshot() const {
    std::shared_lock lock(mutex_);
    return {byName_.begin(), byName_.end()};
}

bool SceneMaterials::writeToArchive(QuickArchive& ar) {
    const auto materials = materialsSnapshot();
    std::vector<std::pair<std::string, std::string>> ids;
    {
        std::shared_lock lock(mutex_);
        ids.assign(byId_.begin(), byId_.end());
    }
    ar.write(VersionWord::make(0, 2));
    ar.write(static_cast<std::uint32_t>(materials.size()));
    for (const auto& entry : materials)
        if (!writeMember(ar, entry.second)) return false;
    ar.write(static_cast<std::uint32_t>(ids.size()));
    for (const auto& [key, value] : ids) {
        ar.writeWString(key);
        ar.writeWString(value);
    }
    return true;
}

bool SceneMaterials::readFromArchive(QuickArchive& ar) {
    clear();
    const auto version = ar.readVersion(2, "material library");
    if (!version) return false;
    const bool older = version->second() == 1;

    const auto count = ar.get<std::uint32_t>();
    if (!ar.canHold(count, 8))
        return ar.fail("a library of " + std::to_string(count) + " materials cannot fit in the data");
    for (std::uint32_t i = 0; i < count; ++i) {
        MaterialPtr material;
        if (!readMember(ar, material, nullptr, i)) return false;
        // A name taken already fails the read in both versions: the later
        // material would be lost, and its identifier would name the other one.
        bool joined;
        if (older) {
            joined = add(material);
        } else {
            std::unique_lock lock(mutex_);
            joined = byName_.emplace(material->name, material).second;
        }
        if (!joined)
            return ar.fail("the material \"" + material->name + "\" cannot join the library: its name is taken");
    }
    if (older) return true;

    const auto ids = ar.get<std::uint32_t>();
    if (!ar.canHold(ids, 8)) return ar.fail("a list of " + std::to_string(ids) + " identifiers cannot fit in the data");
    for (std::uint32_t i = 0; i < ids; ++i) {
        std::string key, value;
        if (!ar.readWString(key) || !ar.readWString(value)) return false;
        std::unique_lock lock(mutex_);
        byId_.emplace(std::move(key), std::move(value));
    }
    return true;
}

void SceneMaterials::writeXml(AssetXmlWriter& writer) {
    for (const auto& entry : materialsSnapshot())
        if (entry.second) entry.second->writeXml(writer, std::string());
}

} // namespace OrvexKavorCore

