#include "files/LibraryConversion.hpp"

#include "files/SinkWriter.hpp"

#include <dexmor/materials/ListReplay.hpp>
#include <dexmor/materials/MaterialAssets.hpp>

#include <algorithm>
#include <string>

namespace OrvexKavorCore {

namespace {

// A library's document is some twenty times its size: a destination that holds
// the whole text can make room for that at once.
constexpr std::size_t kExpectedGrowth = 24;
constexpr std::size_t kMostExpectedAtOnce = std::size_t{1} << 30;

std::string describe(const ZelMatFile::Framing& framing) {
    return "material library, generation " + std::to_string(framing.generation) + ", " +
           std::to_string(framing.count) + (framing.count == 1 ? " material" : " materials");
}

// The stored bytes of a sun's record: two suns are the same state when these
// are, to the last bit (0 and -0 differ; so do two NaNs of other payloads).
std::string recordOf(SunLight& sun) {
    QuickArchive ar(1);
    sun.writeToArchive(ar);
    std::string bytes;
    for (const auto& chunk : ar.chunks()) bytes.append(reinterpret_cast<const char*>(chunk->data()), chunk->size());
    return bytes;
}

// Sky records write into the conversion's default sun, and every sky that uses
// it shows the state the last record leaves it in. A material written as soon as
// it has read shows the state of its moment instead, which is the last one only
// if no later record changes it: this notes whether one does.
class DefaultSunWatch {
public:
    // Called after each material has read; true once the state differs from the
    // one after the first material.
    bool changedAfterReading() {
        const DefaultSun& sun = PerConversion<DefaultSun>::current();
        if (!first_) {
            first_ = recordOf(*sun.light);
            writes_ = sun.writes;
        } else if (!changed_ && sun.writes != writes_) {
            writes_ = sun.writes;
            changed_ = recordOf(*sun.light) != *first_;
        }
        return changed_;
    }
    bool changed() const { return changed_; }

private:
    std::optional<std::string> first_;
    unsigned long writes_ = 0;
    bool changed_ = false;
};

} // namespace

bool LibraryConversion::readMaterials(Diagnosis& result, const std::function<void(MaterialPtr&&)>& take) {
    // Each material is written as soon as it has read, while its archive lives:
    // its lists need not all be held (see ListReplay.hpp).
    ListReplay replayLongLists{.enabled = true};
    PerConversion<ListReplay>::Use replaying(replayLongLists);
    const auto takeAndStartAgain = [&](MaterialPtr&& material) {
        take(std::move(material));
        replayLongLists.heldItems = 0;
    };
    ReadFailure failure;
    std::optional<ZelMatFile::Framing> framing = ZelMatFile::readFraming(bytes_, &failure);
    if (framing && ZelMatFile::readMaterials(*framing, takeAndStartAgain, failure)) {
        result.readsAsBinary = true;
        result.description = describe(*framing);
        return true;
    }
    result.failure = std::move(failure);
    return false;
}

Diagnosis LibraryConversion::readThrough() {
    Diagnosis result;
    readMaterials(result, [](MaterialPtr&&) {});
    return result;
}

Diagnosis LibraryConversion::writeTo(DocumentSink& sink) {
    Diagnosis result;
    if (!sink.canTakeBack()) {
        writeReadingTwice(sink, result);
        return result;
    }
    switch (writeReadingOnce(sink, result)) {
    case SingleReading::Written: break;
    case SingleReading::NotALibrary:
        sink.takeBack();
        if (survey_) survey_->reset();
        break;
    case SingleReading::SunChanged:
        sink.takeBack();
        if (survey_) survey_->reset();
        context_.defaultSun() = *DefaultSun::pristine();
        context_.restartDocument();
        writeReadingTwice(sink, result);
        break;
    }
    return result;
}

LibraryConversion::SingleReading LibraryConversion::writeReadingOnce(DocumentSink& sink, Diagnosis& result) {
    sink.expect(std::min(bytes_.size() * kExpectedGrowth, kMostExpectedAtOnce));
    SinkWriter out(sink, budget_, survey_, form());
    DefaultSunWatch sunWatch;
    const bool read = readMaterials(result, [&](MaterialPtr&& material) {
        if (sunWatch.changedAfterReading()) return; // the text is written again by two readings
        out.beginMaterial(*material);
        writeMaterialAssets(out.writer(), material);
    });
    if (!read) return SingleReading::NotALibrary;
    if (sunWatch.changed()) return SingleReading::SunChanged;
    out.finish();
    return SingleReading::Written;
}

void LibraryConversion::writeReadingTwice(DocumentSink& sink, Diagnosis& result) {
    // The first reading ends in the state the sky records leave the default sun
    // in; the second reads the records again, so that state is put back before
    // each material is written.
    SunLight& defaultSun = context_.defaultSun();
    const SunLight pristineSun = defaultSun;
    if (!readMaterials(result, [](MaterialPtr&&) {})) return;
    const SunLight finalSun = defaultSun;
    defaultSun = pristineSun;

    SinkWriter out(sink, budget_, survey_, form());
    readMaterials(result, [&](MaterialPtr&& material) {
        defaultSun = finalSun;
        out.beginMaterial(*material);
        writeMaterialAssets(out.writer(), material);
    });
    out.finish();
}

} // namespace OrvexKavorCore
