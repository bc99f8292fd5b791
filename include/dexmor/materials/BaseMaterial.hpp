#pragma once
// The material family: every material of a library derives from BaseMaterial.
//
// The base carries the material's name and identifier and the base record that
// every material record holds somewhere in its layout:
//   VersionWord (0, 2)
//   WString     name
//   WString     identifier        (version 2 on)
// An empty stored name reads as a fresh default name.
//
// Default names. A new material, and every reset that takes a new name, is named
// after "DefaultMaterial" by the scene library's unique-name rule: the name is
// "DefaultMaterial" while the library holds no material of that name, and the
// next free counter form ("DefaultMaterial1", ...) otherwise. The name is not
// entered into the library, so a default name depends on the library's content
// only, never on other materials made (or files converted) before.
//
// Walks over material trees (search, comparison, copy, writing, XML) are bounded
// by MaterialWalk: materials reached through the library by identifier can form
// cycles in memory, and trees built in memory can be deeper than any file allows.
#include <dexmor/archive/Members.hpp>
#include <dexmor/model/WalkGuard.hpp>
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/xml/XmlSerializable.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

class BaseMaterial : public OrvexSerializable, public OrvexXMLSerializable {
public:
    // "plugin" parameters refer to a material by its name, not its plugin type.
    static constexpr bool kReferencedByName = true;

    // Material kind ids, stored in front of every material record.
    enum Kind : std::int32_t {
        kSingleBRDF = 0,
        kLayeredBRDF = 1,
        kMulti = 2,
        kBump = 3,
        kInstance = 4,
        k2Sided = 5,
        kLinked = 6,
        kSkp2Sided = 7,
        kOverrideEnvironment = 8,
        kDisplaced = 9,
        kObjectExclusion = 10,
        kAlphaContribution = 11,
        kAngleBlend = 12,
        kReference = 13,
        kToon = 14,
    };
    static constexpr std::int32_t kKindCount = 15;

    // The name that default names are derived from.
    static constexpr std::string_view kDefaultName = "DefaultMaterial";

    // The material's name: also the last part of its asset url.
    std::string name;
    // The identifier (UUID text) under which the scene library maps the material.
    std::string identifier;

    // A material with a fresh default name and no identifier.
    BaseMaterial();
    // Copies take the name only: a copy starts without an identifier, so that the
    // library gives it one of its own when it is added.
    BaseMaterial(const BaseMaterial& other);
    BaseMaterial& operator=(const BaseMaterial& other);
    ~BaseMaterial() override;

    // The base record alone. Each kind writes and reads it at the place its own
    // layout names it.
    bool writeToArchive(QuickArchive& ar) override { return writeBaseRecord(ar); }
    bool readFromArchive(QuickArchive& ar) override { return readBaseRecord(ar); }

    virtual std::int32_t kindId() const = 0;
    // The kind in words ("layered material").
    virtual const char* kindName() const { return "material"; }
    virtual void resetToDefaults() = 0;
    // Deep copy that receives a new unique name.
    virtual boost::shared_ptr<BaseMaterial> cloneRenamed() const = 0;
    // Deep copy that keeps the name.
    virtual boost::shared_ptr<BaseMaterial> clone() const = 0;
    // Same kind and same content; names and identifiers are not compared.
    virtual bool isEqual(const boost::shared_ptr<BaseMaterial>& other) const = 0;

    // The material's own (unfolded) asset: nothing for the base.
    void writeXml(AssetXmlWriter&, std::string) override {}
    std::string pluginType() const override { return {}; }
    std::string assetType() const override { return "material"; }

    // The base record: VersionWord (0, 2), name, identifier. Always succeeds.
    bool writeBaseRecord(QuickArchive& ar) const;
    // Versions 1 (name) and 2 (name, identifier); an empty name becomes a fresh
    // default name. Does not reset the material.
    bool readBaseRecord(QuickArchive& ar);
    // The name item of older records: a WString name; an empty one counts as
    // "DefaultMaterial", and the result always goes through the library's
    // unique-name rule.
    bool readNameItem(QuickArchive& ar);

protected:
    // Constructs without naming: for the fresh field values of a reset.
    struct Unnamed {};
    explicit BaseMaterial(Unnamed) {}

    // The base reset: a fresh default name, no identifier.
    void resetBase();

    // Moves the sub-materials this material owns into `out`. Kinds that hold
    // materials override it and call releaseMaterialMembers() from their
    // destructor, so that destroying a tree of any depth takes constant stack.
    virtual void takeMaterialMembers(std::vector<boost::shared_ptr<BaseMaterial>>& out) { (void)out; }
    void releaseMaterialMembers() noexcept;
};

using MaterialPtr = boost::shared_ptr<BaseMaterial>;

// The name a "plugin" parameter refers to a material by; none for an absent one.
inline const std::string* nameOf(const MaterialPtr& material) { return material ? &material->name : nullptr; }

// A fresh default name: the library's unique name for "DefaultMaterial".
std::string defaultMaterialName();

// A new material of the kind with its defaults, or an empty pointer for an id
// outside the table.
MaterialPtr createMaterial(std::int32_t kind);

template <>
struct Family<BaseMaterial> {
    static constexpr const char* word = "material";
    static MaterialPtr create(std::int32_t kind) { return createMaterial(kind); }
};

// One level of a recursive walk over materials (see WalkGuard): a search that
// comes back to a material it is inside contributes nothing, a write fails, a
// copy is empty, an XML asset is not written; a comparison that comes back to the
// pair it is comparing counts as equal, one too deep as unequal.
class MaterialWalk : public WalkGuard {
public:
    MaterialWalk(Purpose purpose, const void* material, const void* other = nullptr)
        : WalkGuard(kMaterials, purpose, material, other) {}
    static bool isInside(Purpose purpose, const void* material) {
        return WalkGuard::isInside(kMaterials, purpose, material);
    }
};

} // namespace OrvexKavorCore
