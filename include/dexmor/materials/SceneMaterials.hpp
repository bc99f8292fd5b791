#pragma once
// SceneMaterials: the process-wide library of named materials.
//
// It maps every material name to its material and every material identifier (a
// UUID text) to a material name, so that materials that stand for others
// (references, links) can find them. It enforces the naming rules, makes unique
// names, keeps a default material, and stores the whole library in a record:
//   VersionWord (0, 2)
//   UInt32      number of materials, then for each in name order:
//                 Int32 material kind id, the material's record
//   UInt32      number of identifiers, then for each in identifier order:
//                 WString identifier, WString name
// Version 1 records hold only the first list; their materials are added one by
// one, each under its own identifier or, lacking one, a fresh UUID text.
//
// Names are ordered as the host orders its wide strings: by UTF-16 code units,
// case-sensitively.
//
// Threads. Conversions run in parallel and only read the library (the unique-name
// rule for default names, look-ups by identifier); the host may change it now and
// then. Every operation is atomic under a reader-writer lock. The lock guards the
// maps, not the materials in them, and is never held while a material's own code
// runs (copies, records, XML), because that code may consult the library again.
// Reading a library record is therefore a sequence of atomic steps: a reader on
// another thread may see it half-filled.
#include <dexmor/materials/BaseMaterial.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <functional>
#include <iosfwd>
#include <map>
#include <shared_mutex>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace OrvexKavorCore {

class AssetXmlWriter;

// Orders UTF-8 text by its UTF-16 code units (characters U+E000 to U+FFFF after
// those beyond U+FFFF), as the host's wide strings compare.
struct Utf16Order {
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const;
};

class SceneMaterials : public OrvexSerializable {
public:
    static constexpr std::string_view kDefaultMaterialName = "Default_Kavor_Material";
    static constexpr std::string_view kPrototypeName = "Default_Kavor_Material_Actual";
    static constexpr std::string_view kPrototypeLayerName = "Diffuse";

    // The single library, created on first use.
    static boost::shared_ptr<SceneMaterials> instance();

    SceneMaterials() = default;
    SceneMaterials(const SceneMaterials&) = delete;
    SceneMaterials& operator=(const SceneMaterials&) = delete;

    // Enters the material under its name, and its identifier (a fresh UUID text
    // when it has none, or when another entry already uses it) under the same
    // name. False for an empty pointer, an empty name or a name already taken.
    bool add(const MaterialPtr& material);
    // Removes the name and its identifier entry. False when the name is unknown.
    bool remove(std::string_view name);
    // The material under exactly this name, or an empty pointer.
    MaterialPtr get(std::string_view name) const;
    // The material whose identifier this is, or an empty pointer.
    MaterialPtr getById(std::string_view identifier) const;
    // The identifier of the name (an entry of that exact name first, otherwise
    // the first that equals it ignoring ASCII case), or the empty text.
    std::string idOf(std::string_view name) const;

    static std::string defaultName() { return std::string(kDefaultMaterialName); }
    MaterialPtr getDefault() const { return get(kDefaultMaterialName); }
    // Adds a copy of the default prototype (a layered material with one diffuse
    // layer named "Diffuse") under the default name, unless that name is taken.
    void ensureDefault();

    bool isFree(std::string_view name) const;
    // True for an acceptable name; otherwise false with the reason in `message`
    // (empty when the name is acceptable).
    bool validateName(std::string_view name, std::string& message) const;
    // The name without its trailing digits (ASCII 0-9), then that followed by 1,
    // 2, 3, ...: the first candidate that is free, made legal. A candidate is
    // taken only when its legal form is free too, and never empty.
    std::string uniqueName(std::string_view name) const;
    // Spaces become underscores; a name that begins with a digit gets an "a" in front.
    static std::string legalName(std::string_view name);
    // Moves a material, whose name field already holds its new name, from the
    // entry `oldName` to that new name; its identifier entry follows. False, with
    // nothing changed, for an empty pointer, an empty new name, an unknown old
    // name, or a new name that another entry holds.
    bool rename(std::string_view oldName, const MaterialPtr& material);
    // Appends every name in library order.
    void names(std::vector<std::string>& out) const;
    void clear();
    std::size_t size() const;

    // A new reference material whose target is the identifier of `name`.
    MaterialPtr makeReference(std::string_view name) const;
    // A renamed deep copy of the material under `name`, or an empty pointer.
    MaterialPtr getOrCopy(std::string_view name) const;
    // "name material-name" per material, "Beginning UUIDs", "identifier name" per
    // identifier, one per line.
    void dump(std::ostream& out) const;

    bool writeToArchive(QuickArchive& ar) override;
    // Replaces the content. A record that fails part-way leaves what was read
    // before the failure.
    bool readFromArchive(QuickArchive& ar) override;
    // Every material's own asset, in name order.
    void writeXml(AssetXmlWriter& writer);

private:
    using ByName = std::map<std::string, MaterialPtr, Utf16Order>;
    using ById = std::map<std::string, std::string, Utf16Order>;

    // Callers hold the lock.
    bool isFreeLocked(std::string_view name) const { return byName_.find(name) == byName_.end(); }
    ById::const_iterator findIdEntry(std::string_view name) const;
    bool addLocked(const MaterialPtr& material);
    std::vector<std::pair<std::string, MaterialPtr>> materialsSnapshot() const;

    mutable std::shared_mutex mutex_;
    ByName byName_;
    ById byId_;
};

} // namespace OrvexKavorCore
