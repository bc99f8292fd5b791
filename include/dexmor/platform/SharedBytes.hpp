#pragma once
// SharedBytes: read-only bytes in memory together with whatever keeps them
// alive, so that archives can read a file's bytes in place and hand out views
// that outlive the function that read the file.
#include <boost/shared_ptr.hpp>

#include <cstddef>
#include <string>
#include <string_view>

namespace OrvexKavorCore {

class SharedBytes {
public:
    SharedBytes() = default;
    SharedBytes(boost::shared_ptr<const void> owner, std::string_view bytes)
        : owner_(std::move(owner)), bytes_(bytes) {}

    // The bytes copied into memory of their own.
    static SharedBytes copyOf(std::string_view bytes);
    // The bytes of `text`, which is moved into shared ownership.
    static SharedBytes adopt(std::string&& text);
    // `size` bytes of fresh memory, not initialised, for the caller to fill through
    // `data` before sharing the result. Large buffers are asked for in huge pages:
    // touching a fresh page of memory costs more than copying into it.
    static SharedBytes allocate(std::size_t size, char*& data);

    std::string_view view() const { return bytes_; }
    const char* data() const { return bytes_.data(); }
    std::size_t size() const { return bytes_.size(); }
    const boost::shared_ptr<const void>& owner() const { return owner_; }

    // The first `size` bytes, still owned by the same owner.
    SharedBytes prefix(std::size_t size) const { return SharedBytes(owner_, bytes_.substr(0, size)); }

private:
    boost::shared_ptr<const void> owner_;
    std::string_view bytes_;
};

} // namespace OrvexKavorCore
