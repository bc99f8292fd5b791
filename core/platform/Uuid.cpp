#include <dexmor/platform/Uuid.hpp>

#include <boost/uuid/random_generator.hpp>
#include <boost/uuid/uuid_io.hpp>

namespace OrvexKavorCore {

std::string newUuidText() {
    // One generator per thread: conversions on different threads share nothing.
    thread_local boost::uuids::random_generator generator;
    return boost::uuids::to_string(generator());
}

} // namespace OrvexKavorCore
