// Each test runs in a conversion context of its own, as each conversion does:
// what one test's sky records and sun assets leave behind never reaches the next.
#include <dexmor/files/ConversionContext.hpp>

#include <gtest/gtest.h>

#include <optional>

namespace {

class FreshContextPerTest final : public ::testing::EmptyTestEventListener {
    void OnTestStart(const ::testing::TestInfo&) override { context_.emplace(); }
    void OnTestEnd(const ::testing::TestInfo&) override { context_.reset(); }
    std::optional<OrvexKavorCore::ConversionContext> context_;
};

const bool registered = [] {
    ::testing::UnitTest::GetInstance()->listeners().Append(new FreshContextPerTest);
    return true;
}();

} // namespace
