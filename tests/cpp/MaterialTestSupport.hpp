#pragma once
// Helpers shared by the material tests: a clean scene library around every test,
// named materials of any kind, and the shared record helpers.
#include "TrimSupport.hpp"

#include <dexmor/materials/Materials.hpp>

namespace materialtest {

using namespace OrvexKavorCore;
using testsupport::ByteVector;
using testsupport::Image;

// The library is process-wide: every test starts and ends with it empty.
class LibraryTest : public ::testing::Test {
protected:
    void SetUp() override { SceneMaterials::instance()->clear(); }
    void TearDown() override { SceneMaterials::instance()->clear(); }
    SceneMaterials& library() { return *SceneMaterials::instance(); }
};

// A material of `Kind` named `name`, with `set` applied to it.
template <class Kind, class Set>
boost::shared_ptr<Kind> make(const std::string& name, Set set) {
    auto m = boost::make_shared<Kind>();
    m->name = name;
    set(*m);
    return m;
}
template <class Kind>
boost::shared_ptr<Kind> make(const std::string& name) {
    return make<Kind>(name, [](Kind&) {});
}

// The record of a material as stored in a file: kind id, then the record.
inline ByteVector storedForm(const MaterialPtr& m) {
    QuickArchive ar;
    EXPECT_TRUE(writeMember(ar, m));
    ByteVector out(ar.writePosition());
    ar.getRaw(out.data(), out.size());
    return out;
}

// Reads a stored material (kind id and record); empty when it does not read.
inline MaterialPtr readStored(const ByteVector& bytes, std::string* why = nullptr) {
    QuickArchive ar(bytes.data(), bytes.size());
    MaterialPtr m;
    const bool ok = readMember(ar, m);
    if (why) *why = testsupport::failureOf(ar);
    if (!ok) return {};
    EXPECT_EQ(ar.readPosition(), bytes.size());
    return m;
}

} // namespace materialtest
