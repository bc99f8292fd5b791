#include <dexmor/model/WalkGuard.hpp>

#include <dexmor/model/PerConversion.hpp>

#include <algorithm>

namespace OrvexKavorCore {

namespace {
WalkGuard::Path& path() { return PerConversion<WalkGuard::Path>::current(); }
} // namespace

WalkGuard::WalkGuard(Chain chain, Purpose purpose, const void* object, const void* other)
    : chain_(chain), named_(true), state_(State::kEntered) {
    Path& walk = path();
    const Path::Step step{chain, purpose, object, other};
    if (walk.depth[chain] >= kMaxDepth)
        state_ = State::kTooDeep;
    else if (std::find(walk.steps.begin(), walk.steps.end(), step) != walk.steps.end())
        state_ = State::kCycle;
    else {
        walk.steps.push_back(step);
        ++walk.depth[chain];
    }
}

WalkGuard::WalkGuard(Chain chain) : chain_(chain), named_(false), state_(State::kEntered) {
    unsigned& depth = path().depth[chain];
    if (depth >= kMaxDepth)
        state_ = State::kTooDeep;
    else
        ++depth;
}

WalkGuard::~WalkGuard() {
    if (state_ != State::kEntered) return;
    Path& walk = path();
    --walk.depth[chain_];
    if (named_) walk.steps.pop_back();
}

bool WalkGuard::isInside(Chain chain, Purpose purpose, const void* object) {
    const Path& walk = path();
    return std::any_of(walk.steps.begin(), walk.steps.end(), [&](const Path::Step& s) {
        return s.chain == chain && s.purpose == purpose && s.object == object;
    });
}

} // namespace OrvexKavorCore
