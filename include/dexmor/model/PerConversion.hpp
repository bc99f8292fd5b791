#pragma once
// State that belongs to one conversion and that no other conversion may see: the
// default sun that sky records write into, the sun assets a document has
// written, the path of a recursive walk. Each kind of state is reached through
// PerConversion<State>::current(): the state of the conversion running on this
// thread, or, outside any conversion, a state of the thread's own.
//
// A conversion's context (files/ConversionContext) owns one State of each kind
// and puts them in place with Use for its lifetime; contexts nest.
namespace OrvexKavorCore {

template <class State>
class PerConversion {
public:
    static State& current() { return *slot(); }

    // Makes `state` the current one on this thread until the end of the scope.
    class Use {
    public:
        explicit Use(State& state) : previous_(slot()) { slot() = &state; }
        ~Use() { slot() = previous_; }
        Use(const Use&) = delete;
        Use& operator=(const Use&) = delete;

    private:
        State* previous_;
    };

private:
    static State*& slot() {
        thread_local State threadOwn;
        thread_local State* current = &threadOwn;
        return current;
    }
};

} // namespace OrvexKavorCore
