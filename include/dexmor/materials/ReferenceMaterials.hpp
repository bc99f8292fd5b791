#pragma once
// The material kinds that stand for another material instead of describing a
// surface. None writes XML of its own; the folding of a material library looks
// through linked and reference materials to what they stand for.
//
// MaterialLinked (kind 6): a material together with an identifier of where it was
// linked from.
//   VersionWord (0, 1), the IdData record, Int32 kind id and record of the linked
//   material, base record.
// It resets before reading (the name stays) and is written only with its material.
//
// MaterialInstance (kind 4): a placeholder that stores only its name.
//   VersionWord (0, 1), base record.
// Two instances are never equal.
//
// MaterialReference (kind 13): names a material of the scene library by its
// identifier and keeps the material that it found there.
//   VersionWord (0, 2), base record, WString targetId, then (version 2) Bool
//   present and, when present, Int32 kind id and record of the held material.
// Writing looks the target up first and keeps what the library has (nothing when
// it has no such material), so a record always holds the current target.
#include <dexmor/materials/MaterialKind.hpp>

#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace OrvexKavorCore {

class MaterialLinked final : public MaterialKind<MaterialLinked> {
public:
    static constexpr KindInfo kInfo{.kind = kLinked,
                                    .version = 1,
                                    .pluginType = "",
                                    .what = "linked material"};

    // A tagged identifier: tags 0 and 1 hold a text, tag 2 an integer.
    //   VersionWord (0, 1), UInt32 tag, then WString text (tags 0, 1) or Int32 (tag 2).
    class IdData : public OrvexSerializable {
    public:
        static constexpr std::int32_t kTextTag = 1;
        static constexpr std::int32_t kIntegerTag = 2;

        std::int32_t tag() const { return tag_; }
        // The text; empty for an integer identifier.
        std::string text() const { return tag_ == kIntegerTag ? std::string() : text_; }
        std::int32_t integer() const { return integer_; }
        // `textTag` is 0 or 1.
        void setText(std::string_view text, std::int32_t textTag = kTextTag);
        void setInteger(std::int32_t value);
        // Tag 2, integer 0.
        void reset();

        // False for a tag outside 0 to 2, before anything is written.
        bool writeToArchive(QuickArchive& ar) override;
        bool readFromArchive(QuickArchive& ar) override;
        // Same tag; the same integer, or texts equal ignoring ASCII case.
        bool isEqual(const IdData& other) const;

    private:
        std::int32_t tag_ = kIntegerTag;
        std::string text_;
        std::int32_t integer_ = 0;
    };

    using MaterialKind::MaterialKind;
    ~MaterialLinked() override { releaseMaterialMembers(); }

    MaterialPtr linkedMaterial; // required by the record
    IdData idData;

    static std::span<const record::Field<MaterialLinked>> fields();
    bool canBeWritten() const { return static_cast<bool>(linkedMaterial); }
    bool separate(bool renamed) { return material::copyMember(linkedMaterial, renamed); }

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(linkedMaterial, out); }
};

class MaterialInstance final : public MaterialKind<MaterialInstance> {
public:
    static constexpr KindInfo kInfo{.kind = kInstance,
                                    .version = 1,
                                    .pluginType = "",
                                    .what = "instance material",
                                    .keepsFieldsOnRead = true,
                                    .resetTakesName = true};
    using MaterialKind::MaterialKind;
    ~MaterialInstance() override { releaseMaterialMembers(); }

    // Not stored; copies share it.
    MaterialPtr instancedMaterial;

    static std::span<const record::Field<MaterialInstance>> fields();
    // Both copies keep the name.
    MaterialPtr cloneRenamed() const override { return clone(); }
    bool isEqual(const MaterialPtr&) const override { return false; }

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(instancedMaterial, out); }
};

class MaterialReference final : public MaterialKind<MaterialReference> {
public:
    static constexpr KindInfo kInfo{.kind = kReference,
                                    .version = 2,
                                    .pluginType = "",
                                    .what = "reference material",
                                    .keepsFieldsOnRead = true,
                                    .resetTakesName = true};
    using MaterialKind::MaterialKind;
    ~MaterialReference() override { releaseMaterialMembers(); }

    std::string targetId; // identifier of the target in the scene library
    MaterialPtr heldMaterial;

    static std::span<const record::Field<MaterialReference>> fields();
    // The library's material for targetId, or an empty pointer.
    MaterialPtr target() const;
    // What the reference stands for: the library's target, or when the library
    // has none, the held material.
    MaterialPtr resolve() const;

    // Refreshes heldMaterial from the library, then writes the record. A target
    // that is being written already (the reference stands, directly or through
    // other materials, for a material that contains it) cannot be stored inside
    // itself: it is written as absent and not held.
    bool writeToArchive(QuickArchive& ar) override;
    // Both copies keep the name and share the held material.
    MaterialPtr cloneRenamed() const override { return clone(); }
    // Targets equal ignoring ASCII case, then the library's targets and the held
    // materials compared.
    bool equalContent(const MaterialReference& that) const;

protected:
    void takeMaterialMembers(std::vector<MaterialPtr>& out) override { material::take(heldMaterial, out); }
};

} // namespace OrvexKavorCore
