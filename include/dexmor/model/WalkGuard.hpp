#pragma once
// The guard of every recursive walk over a tree of stored objects (reading's
// own guard is the archive's Scope): writing, XML, searching, copying, comparing
// and releasing materials and textures.
//
// A walk opens a WalkGuard for each level it enters. The guard refuses (it is
// false) when the chain of its kind is already as deep as the nesting limit, or,
// for a step that names its object, when the walk comes back to a step it is
// already inside: the same object for the same purpose (for a comparison, the
// same pair). The caller then stops there instead of overflowing the stack or
// going round a cycle.
#include <dexmor/archive/QuickArchive.hpp>

#include <vector>

namespace OrvexKavorCore {

class WalkGuard {
public:
    // Chains nest independently: a texture chain inside a deep material chain
    // has its own depth.
    enum Chain : unsigned char { kMaterials, kTextures, kChainCount };
    enum Purpose : unsigned char { kSearch, kCompare, kCopy, kWrite, kXml, kRelease, kAny };

    static constexpr unsigned kMaxDepth = QuickArchive::kMaxNesting;

    // A level that names its object: refused when too deep or a cycle.
    WalkGuard(Chain chain, Purpose purpose, const void* object, const void* other = nullptr);
    // A level counted only: refused when too deep.
    explicit WalkGuard(Chain chain);
    ~WalkGuard();
    WalkGuard(const WalkGuard&) = delete;
    WalkGuard& operator=(const WalkGuard&) = delete;

    explicit operator bool() const { return state_ == State::kEntered; }
    // The walk came back to a step it is already inside.
    bool cycle() const { return state_ == State::kCycle; }

    // Whether `object` is on the current walk for `purpose`.
    static bool isInside(Chain chain, Purpose purpose, const void* object);

    // The walk in progress, one per conversion (see PerConversion).
    struct Path {
        struct Step {
            Chain chain;
            Purpose purpose;
            const void* object;
            const void* other;
            bool operator==(const Step&) const = default;
        };
        std::vector<Step> steps; // the levels that named their object
        unsigned depth[kChainCount] = {};
    };

private:
    enum class State : unsigned char { kEntered, kTooDeep, kCycle };
    Chain chain_;
    bool named_;
    State state_;
};

} // namespace OrvexKavorCore
