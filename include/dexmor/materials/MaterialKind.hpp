#pragma once
// What the material kinds share.
//
// A material kind is described beside its class by
//   - kInfo (a KindInfo): its kind id, the record version it writes (readers
//     accept 1 to that version), its plugin type, whether its reader keeps the
//     current fields (otherwise it resets the object first), and whether its
//     reset takes a new default name;
//   - fields(): its record as a table (archive/Record.hpp), each item stored from
//     some record version on. Besides plain values the items can be optional
//     members (record::field), required ones (material::Required), lists of
//     members or texts, the base record and the name item of older records
//     (kind::baseRecord, material::nameItem);
//   - parameters(), for a kind with an unfolded asset of its own: the parameters
//     of that asset in emission order (kind::ParameterRow). A sub-material
//     parameter (material::subMaterial) names the material; a texture parameter
//     (kind::reference) refers to the texture's asset.
// From these follow, once for all kinds:
//   record:     VersionWord (0, version), then the items of that version in table
//               order. Writing is refused, before anything is written, while a
//               member the record requires is missing (canBeWritten()).
//   reading:    the version word, a reset unless kInfo keeps the fields (then
//               the record is read over the current fields, and lists append),
//               then the items the stored version holds.
//   XML:        url = owner's url + "/" + name. The assets the parameters refer
//               to, in row order: a sub-material's under url (it adds its own
//               name), a texture's under url + "/" + its child name; then the
//               kind's own asset of type "material" with an empty layout.
//   comparison: same kind, then every item of the table equal: members by their
//               own comparison (both absent counts as equal), values exactly; the
//               name and identifier are never compared.
//   copies:     the copy constructor shares the members; clone() and
//               cloneRenamed() then let the kind separate what it deep-copies
//               (separate(renamed)); a copy that cannot be completed (a tree
//               deeper than the walk limit) is empty. cloneRenamed() gives the
//               copy the library's unique name for the source's name.
// Kinds with irregular old records hide readVersion(); the reference material,
// which looks its target up while writing, writes its record by hand.
#include <dexmor/archive/Members.hpp>
#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/archive/Record.hpp>
#include <dexmor/brdfs/Base_BRDF.hpp>
#include <dexmor/materials/BaseMaterial.hpp>
#include <dexmor/materials/ListReplay.hpp>
#include <dexmor/model/Kind.hpp>
#include <dexmor/textures/BaseTexture.hpp>

#include <boost/make_shared.hpp>
#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

namespace material {

// A member stored as its kind id and record, without a flag.
template <class Ptr>
struct Required {
    static bool read(QuickArchive& ar, Ptr& p) { return readMember(ar, p); }
    static bool write(QuickArchive& ar, const Ptr& p) { return writeMember(ar, p); }
    static bool equal(const Ptr& a, const Ptr& b) { return membersEqual(a, b); }
};

// A list of required members: UInt32 count, then the items, all held (see
// replay::readList; replay::listRow for a list a conversion may replay).
template <class Ptr>
struct List {
    static bool read(QuickArchive& ar, std::vector<Ptr>& list) { return replay::readList(ar, list, nullptr); }
    static bool write(QuickArchive& ar, const std::vector<Ptr>& list) {
        ar.write(static_cast<std::uint32_t>(list.size()));
        for (const Ptr& item : list)
            if (!writeMember(ar, item)) return false;
        return true;
    }
    static bool equal(const std::vector<Ptr>& a, const std::vector<Ptr>& b) {
        if (a.size() != b.size()) return false;
        for (std::size_t i = 0; i < a.size(); ++i)
            if (!membersEqual(a[i], b[i])) return false;
        return true;
    }
};

// A list of texts: UInt32 count, then that many WStrings. Reading replaces the list.
struct TextList {
    static bool read(QuickArchive& ar, std::vector<std::string>& list);
    static bool write(QuickArchive& ar, const std::vector<std::string>& list);
    static bool equal(const std::vector<std::string>& a, const std::vector<std::string>& b) { return a == b; }
};

// The name item of older records (see BaseMaterial::readNameItem). Never compared.
template <class Obj>
constexpr record::Field<Obj> nameItem(record::Versions versions) {
    return record::Field<Obj>{
        "name",
        versions,
        [](QuickArchive& ar, Obj& o) { return o.readNameItem(ar); },
        [](QuickArchive& ar, Obj& o) {
            ar.writeWString(o.name);
            return true;
        },
        [](const Obj&, const Obj&) { return true; },
    };
}

// Replace a member by its own copy: a sub-material by its clone() or (renamed)
// cloneRenamed(), a texture or BRDF layer by its clone(). False when a present
// member could not be copied (a tree deeper than the walk limit).
bool copyMember(MaterialPtr& m, bool renamed);
bool copyMember(TexturePtr& t);
bool copyMember(BRDFPtr& b);

// The library's unique name for `source`.
std::string uniqueName(const std::string& source);

// A "plugin" parameter naming the sub-material M (an absent one gives the
// parameter without a value); the sub-material's own asset is written under the
// url of the material that holds it.
template <auto M>
constexpr kind::ParameterRow<kind::ClassOf<M>> subMaterial(const char* name) {
    using Obj = kind::ClassOf<M>;
    return {
        name,
        nullptr,
        [](const Obj& o) { return static_cast<bool>(o.*M); },
        [](AssetXmlWriter& w, const Obj& o, const std::string& url) { (o.*M)->writeXml(w, url); },
        [](AssetXmlWriter& w, const char* n, const Obj& o, const std::string& url) {
            w.writePluginByName(n, url, nameOf(o.*M));
        },
    };
}

// Writes the assets the rows refer to, in row order: a present sub-material's
// under `url`, a present texture's under url + "/" + its child name.
template <class Obj, class Rows>
void writeMemberAssets(AssetXmlWriter& writer, const Obj& object, const std::string& url, const Rows& rows) {
    for (const kind::ParameterRow<Obj>& p : rows)
        if (p.writeChild && p.isSet(object)) p.writeChild(writer, object, p.child ? url + "/" + p.child : url);
}

// Moves a sub-material into `out` when there is one.
inline void take(MaterialPtr& m, std::vector<MaterialPtr>& out) {
    if (m) out.push_back(std::move(m));
}

} // namespace material

// Lists of members and of texts have one encoding each.
template <>
struct record::Codec<std::vector<MaterialPtr>> : material::List<MaterialPtr> {};
template <>
struct record::Codec<std::vector<BRDFPtr>> : material::List<BRDFPtr> {};
template <>
struct record::Codec<std::vector<std::string>> : material::TextList {};

// The shared implementation of a material kind. `Derived` provides
//   static constexpr KindInfo kInfo;
//   static std::span<const record::Field<Derived>> fields();
//   static std::span<const kind::ParameterRow<Derived>> parameters(); // when it has an asset
// declares its fields with their defaults as member initialisers, inherits the
// constructors (`using MaterialKind::MaterialKind;`), and may hide
//   bool canBeWritten() const;                 // the members the record requires
//   bool readVersion(QuickArchive&, unsigned); // irregular older records
//   bool separate(bool renamed);               // what clone() deep-copies
// A kind that holds materials overrides takeMaterialMembers() and calls
// releaseMaterialMembers() from its destructor.
template <class Derived>
class MaterialKind : public BaseMaterial {
public:
    MaterialKind() = default;
    explicit MaterialKind(Unnamed tag) : BaseMaterial(tag) {}

    std::int32_t kindId() const override { return Derived::kInfo.kind; }
    const char* kindName() const override { return Derived::kInfo.what; }
    std::string pluginType() const override { return Derived::kInfo.pluginType; }

    void resetToDefaults() override {
        std::string kept = std::move(name);
        self() = Derived(Unnamed{}); // the base part takes the (empty) name only
        if constexpr (Derived::kInfo.resetTakesName)
            resetBase();
        else
            name = std::move(kept);
    }

    MaterialPtr clone() const override { return copy(false); }
    MaterialPtr cloneRenamed() const override { return copy(true); }

    bool isEqual(const MaterialPtr& other) const override {
        if (!other || other->kindId() != kindId()) return false;
        const auto* that = dynamic_cast<const Derived*>(other.get());
        if (!that) return false;
        MaterialWalk walk(MaterialWalk::kCompare, this, that);
        if (walk.cycle()) return true;
        if (!walk) return false;
        return self().equalContent(*that);
    }

    bool writeToArchive(QuickArchive& ar) override {
        MaterialWalk walk(MaterialWalk::kWrite, this);
        if (!walk || !self().canBeWritten()) return false;
        ar.write(VersionWord::make(0, Derived::kInfo.version));
        return record::writeFields(ar, self(), Derived::fields(), Derived::kInfo.version);
    }

    bool readFromArchive(QuickArchive& ar) override {
        const auto version = ar.get<VersionWord>();
        // A refused version leaves the material reset.
        if constexpr (!Derived::kInfo.keepsFieldsOnRead) resetToDefaults();
        if (!ar.checkVersion(version, Derived::kInfo.version, Derived::kInfo.what)) return false;
        return self().readVersion(ar, version.second());
    }

    // The unfolded asset of a kind with parameters(); nothing for the others.
    void writeXml(AssetXmlWriter& writer, std::string urlPrefix) override {
        if constexpr (requires { Derived::parameters(); }) {
            MaterialWalk walk(MaterialWalk::kXml, this);
            if (!walk) return;
            const std::string url = urlPrefix + "/" + name;
            material::writeMemberAssets(writer, self(), url, Derived::parameters());
            kind::beginAsset(writer, url, "material", Derived::kInfo.pluginType);
            kind::writeParameters(writer, self(), url, Derived::parameters());
            kind::endAsset(writer);
        }
    }

    // --- the parts a kind may hide ---
    bool canBeWritten() const { return true; }
    bool readVersion(QuickArchive& ar, unsigned version) {
        return record::readFields(ar, self(), Derived::fields(), version);
    }
    bool separate(bool) { return true; }
    bool equalContent(const Derived& that) const { return record::fieldsEqual(self(), that, Derived::fields()); }

protected:
    MaterialPtr copy(bool renamed) const {
        MaterialWalk walk(MaterialWalk::kCopy, this);
        if (!walk) return {};
        auto made = boost::make_shared<Derived>(self());
        if (!made->separate(renamed)) return {};
        if (renamed) made->name = material::uniqueName(name);
        return made;
    }

    Derived& self() { return static_cast<Derived&>(*this); }
    const Derived& self() const { return static_cast<const Derived&>(*this); }
};

} // namespace OrvexKavorCore
