#include <dexmor/materials/ReferenceMaterials.hpp>

#include <dexmor/materials/SceneMaterials.hpp>
#include <dexmor/platform/Text.hpp>

#include <array>

namespace OrvexKavorCore {

// The identifier record inside a linked material's record.
template <>
struct record::Codec<MaterialLinked::IdData> {
    static bool read(QuickArchive& ar, MaterialLinked::IdData& id) { return id.readFromArchive(ar); }
    static bool write(QuickArchive& ar, MaterialLinked::IdData& id) { return id.writeToArchive(ar); }
    static bool equal(const MaterialLinked::IdData& a, const MaterialLinked::IdData& b) { return a.isEqual(b); }
};

namespace {

using kind::baseRecord;
using record::field;
using record::since;

constexpr std::array kLinkedFields = {
    field<&MaterialLinked::idData>("idData"),
    record::fieldAs<material::Required<MaterialPtr>, &MaterialLinked::linkedMaterial>("linkedMaterial"),
    baseRecord<MaterialLinked>(),
};

constexpr std::array kInstanceFields = {baseRecord<MaterialInstance>()};

// The reading order; writing is by hand (see writeToArchive).
constexpr std::array kReferenceFields = {
    baseRecord<MaterialReference>(),
    field<&MaterialReference::targetId>("targetId"),
    field<&MaterialReference::heldMaterial>("heldMaterial", since(2)),
};

} // namespace

// --- MaterialLinked::IdData ---

void MaterialLinked::IdData::setText(std::string_view text, std::int32_t textTag) {
    tag_ = textTag == 0 ? 0 : kTextTag;
    text_ = std::string(text);
}

void MaterialLinked::IdData::setInteger(std::int32_t value) {
    tag_ = kIntegerTag;
    integer_ = value;
}

void MaterialLinked::IdData::reset() { *this = IdData(); }

bool MaterialLinked::IdData::writeToArchive(QuickArchive& ar) {
    if (tag_ < 0 || tag_ > kIntegerTag) return false;
    ar.write(VersionWord::make(0, 1));
    ar.write(static_cast<std::uint32_t>(tag_));
    if (tag_ == kIntegerTag)
        ar.write(integer_);
    else
        ar.writeWString(text_);
    return true;
}

bool MaterialLinked::IdData::readFromArchive(QuickArchive& ar) {
    if (!ar.readVersion(1, "link identifier")) return false;
    tag_ = static_cast<std::int32_t>(ar.getAs<std::uint32_t>("tag"));
    if (tag_ == 0 || tag_ == kTextTag) return ar.readWStringAs("text", text_);
    if (tag_ == kIntegerTag) {
        ar.readAs("integer", integer_);
        return true;
    }
    return ar.fail("unknown link identifier tag " + std::to_string(static_cast<std::uint32_t>(tag_)));
}

bool MaterialLinked::IdData::isEqual(const IdData& other) const {
    if (tag_ != other.tag_) return false;
    if (tag_ == kIntegerTag) return integer_ == other.integer_;
    if (tag_ == 0 || tag_ == kTextTag) return text::equalsIgnoringAsciiCase(text_, other.text_);
    return true;
}

// --- MaterialLinked, MaterialInstance ---

std::span<const record::Field<MaterialLinked>> MaterialLinked::fields() { return kLinkedFields; }

std::span<const record::Field<MaterialInstance>> MaterialInstance::fields() { return kInstanceFields; }

// --- MaterialReference ---

std::span<const record::Field<MaterialReference>> MaterialReference::fields() { return kReferenceFields; }

MaterialPtr MaterialReference::target() const { return SceneMaterials::instance()->getById(targetId); }

MaterialPtr MaterialReference::resolve() const {
    MaterialPtr found = target();
    return found ? found : heldMaterial;
}

bool MaterialReference::writeToArchive(QuickArchive& ar) {
    MaterialWalk walk(MaterialWalk::kWrite, this);
    if (!walk) return false;
    ar.write(VersionWord::make(0, kInfo.version));
    writeBaseRecord(ar);
    ar.writeWString(targetId);
    MaterialPtr found = target();
    if (found && MaterialWalk::isInside(MaterialWalk::kWrite, found.get())) found.reset();
    heldMaterial = std::move(found);
    return writeOptionalMember(ar, heldMaterial);
}

bool MaterialReference::equalContent(const MaterialReference& that) const {
    return text::equalsIgnoringAsciiCase(targetId, that.targetId) && membersEqual(target(), that.target()) &&
           membersEqual(heldMaterial, that.heldMaterial);
}

} // namespace OrvexKavorCore
