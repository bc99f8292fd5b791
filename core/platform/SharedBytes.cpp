#include <dexmor/platform/SharedBytes.hpp>

#include "platform/HugePages.hpp"

#include <boost/make_shared.hpp>

#include <cstring>
#include <new>
#include <sys/mman.h>

namespace OrvexKavorCore {

namespace {

// An anonymous mapping whose huge-page-aligned part the kernel is asked to back
// with huge pages: one fault per 2 MiB instead of one per 4 KiB.
class HugePageMapping {
public:
    explicit HugePageMapping(std::size_t size) : length_(size + kHugePageSize) {
        void* base = ::mmap(nullptr, length_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (base == MAP_FAILED) throw std::bad_alloc();
        base_ = static_cast<char*>(base);
        const auto address = reinterpret_cast<std::uintptr_t>(base_);
        data_ = base_ + ((kHugePageSize - address % kHugePageSize) % kHugePageSize);
        adviseHugePages(data_, size);
    }
    ~HugePageMapping() { ::munmap(base_, length_); }
    HugePageMapping(const HugePageMapping&) = delete;
    HugePageMapping& operator=(const HugePageMapping&) = delete;

    char* data() const { return data_; }

private:
    std::size_t length_;
    char* base_ = nullptr;
    char* data_ = nullptr;
};

} // namespace

SharedBytes SharedBytes::copyOf(std::string_view bytes) {
    char* data = nullptr;
    SharedBytes copy = allocate(bytes.size(), data);
    if (!bytes.empty()) std::memcpy(data, bytes.data(), bytes.size());
    return copy;
}

SharedBytes SharedBytes::adopt(std::string&& text) {
    auto owner = boost::make_shared<const std::string>(std::move(text));
    const std::string_view bytes = *owner;
    return SharedBytes(std::move(owner), bytes);
}

SharedBytes SharedBytes::allocate(std::size_t size, char*& data) {
    if (size >= kHugePageSize) {
        auto mapping = boost::make_shared<HugePageMapping>(size);
        data = mapping->data();
        return SharedBytes(std::move(mapping), std::string_view(data, size));
    }
    auto buffer = boost::make_shared_noinit<char[]>(size == 0 ? 1 : size);
    data = buffer.get();
    return SharedBytes(std::move(buffer), std::string_view(data, size));
}

} // namespace OrvexKavorCore
