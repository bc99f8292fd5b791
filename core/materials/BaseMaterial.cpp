#include <dexmor/materials/BaseMaterial.hpp>

#include <dexmor/archive/QuickArchive.hpp>
#include <dexmor/materials/CompositeMaterials.hpp>
#include <dexmor/materials/LayeredMaterials.hpp>
#include <dexmor/materials/ReferenceMaterials.hpp>
#include <dexmor/materials/SceneMaterials.hpp>
#include <dexmor/materials/WrapperMaterials.hpp>

#include <boost/make_shared.hpp>

#include <algorithm>
#include <new>
#include <utility>

namespace OrvexKavorCore {

MaterialPtr createMaterial(std::int32_t kind) {
    switch (kind) {
    case BaseMaterial::kSingleBRDF:
        return boost::make_shared<MaterialSingleBRDF>();
    case BaseMaterial::kLayeredBRDF:
        return boost::make_shared<MaterialLayeredBRDF>();
    case BaseMaterial::kMulti:
        return boost::make_shared<MaterialMulti>();
    case BaseMaterial::kBump:
        return boost::make_shared<MaterialBump>();
    case BaseMaterial::kInstance:
        return boost::make_shared<MaterialInstance>();
    case BaseMaterial::k2Sided:
        return boost::make_shared<Material2Sided>();
    case BaseMaterial::kLinked:
        return boost::make_shared<MaterialLinked>();
    case BaseMaterial::kSkp2Sided:
        return boost::make_shared<MaterialSkp2Sided>();
    case BaseMaterial::kOverrideEnvironment:
        return boost::make_shared<MaterialOverrideEnvironment>();
    case BaseMaterial::kDisplaced:
        return boost::make_shared<MaterialDisplaced>();
    case BaseMaterial::kObjectExclusion:
        return boost::make_shared<MaterialObjectExclusion>();
    case BaseMaterial::kAlphaContribution:
        return boost::make_shared<MaterialAlphaContribution>();
    case BaseMaterial::kAngleBlend:
        return boost::make_shared<MaterialAngleBlend>();
    case BaseMaterial::kReference:
        return boost::make_shared<MaterialReference>();
    case BaseMaterial::kToon:
        return boost::make_shared<MaterialToon>();
    default:
        return {};
    }
}

std::string defaultMaterialName() { return SceneMaterials::instance()->uniqueName(BaseMaterial::kDefaultName); }

// --- BaseMaterial ---

BaseMaterial::BaseMaterial() { resetBase(); }

BaseMaterial::BaseMaterial(const BaseMaterial& other) : name(other.name) {}

BaseMaterial& BaseMaterial::operator=(const BaseMaterial& other) {
    name = other.name;
    return *this;
}

BaseMaterial::~BaseMaterial() = default;

void BaseMaterial::resetBase() {
    name = defaultMaterialName();
    identifier.clear();
}

bool BaseMaterial::writeBaseRecord(QuickArchive& ar) const {
    ar.write(VersionWord::make(0, 2));
    ar.writeWString(name);
    ar.writeWString(identifier);
    return true;
}

bool BaseMaterial::readBaseRecord(QuickArchive& ar) {
    const auto version = ar.readVersion(2, "base material record");
    if (!version || !ar.readWStringAs("name", name)) return false;
    if (version->second() == 2 && !ar.readWStringAs("identifier", identifier)) return false;
    if (name.empty()) name = defaultMaterialName();
    return true;
}

bool BaseMaterial::readNameItem(QuickArchive& ar) {
    std::string stored;
    if (!ar.readWStringAs("name", stored)) return false;
    name = SceneMaterials::instance()->uniqueName(stored.empty() ? kDefaultName : std::string_view(stored));
    return true;
}

// Each material leaving the loop has had its members taken by its last owner, so
// destroying it recurses no further.
void BaseMaterial::releaseMaterialMembers() noexcept {
    std::vector<MaterialPtr> pending;
    try {
        takeMaterialMembers(pending);
        while (!pending.empty()) {
            MaterialPtr next = std::move(pending.back());
            pending.pop_back();
            if (next.use_count() == 1) next->takeMaterialMembers(pending);
        }
    } catch (const std::bad_alloc&) {
        // Without memory for the list, the rest is released the ordinary way.
    }
}

} // namespace OrvexKavorCore
