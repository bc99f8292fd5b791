#include <dexmor/params/GeomMapChannel.hpp>

#include <dexmor/archive/QuickArchive.hpp>

#include <boost/make_shared.hpp>

namespace OrvexKavorCore {

// --- GeomMapChannel ---

GeomMapChannel::GeomMapChannel(std::int32_t channel, std::unique_ptr<DefSerialIntListParam> faces,
                               std::unique_ptr<DefSerialVectorListParam> tverts)
    : channel_(channel) {
    faces_ = faces ? tracker_.add(std::move(faces)) : newFaces();
    tverts_ = tverts ? tracker_.add(std::move(tverts)) : newTverts();
}

DefSerialIntListParam* GeomMapChannel::newFaces() {
    return tracker_.add(std::make_unique<DefSerialIntListParam>(kFacesName));
}

DefSerialVectorListParam* GeomMapChannel::newTverts() {
    return tracker_.add(std::make_unique<DefSerialVectorListParam>(kTvertsName));
}

void GeomMapChannel::setFaces(std::span<const std::int32_t> faces) {
    if (!faces_) faces_ = newFaces();
    faces_->setValues(faces);
}

void GeomMapChannel::setTverts(std::span<const Vector> tverts) {
    if (!tverts_) tverts_ = newTverts();
    tverts_->setValues(tverts);
}

bool GeomMapChannel::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, 1));
    ar.write(channel_);
    ar.write(faces_ != nullptr);
    if (faces_ && !faces_->writeToArchive(ar)) return false;
    ar.write(tverts_ != nullptr);
    if (tverts_ && !tverts_->writeToArchive(ar)) return false;
    return true;
}

bool GeomMapChannel::readFromArchive(QuickArchive& ar) {
    const auto version = ar.get<VersionWord>();
    if (!version.is(0, 1)) return ar.fail("unknown map channel version");
    faces_ = nullptr;
    tverts_ = nullptr;
    tracker_.clear();
    channel_ = ar.getAs<std::int32_t>("channel");
    if (ar.getAs<bool>("faces present")) {
        auto scope = QuickArchive::Scope::label(ar, kFacesName);
        faces_ = newFaces();
        if (!faces_->readFromArchive(ar)) return false;
    }
    if (ar.getAs<bool>("tverts present")) {
        auto scope = QuickArchive::Scope::label(ar, kTvertsName);
        tverts_ = newTverts();
        if (!tverts_->readFromArchive(ar)) return false;
    }
    return true;
}

boost::shared_ptr<GeomMapChannel> GeomMapChannel::clone() const {
    auto copy = boost::make_shared<GeomMapChannel>(channel_);
    if (faces_) copy->setFaces(faces_->values());
    if (tverts_) copy->setTverts(tverts_->values());
    return copy;
}

// --- DefGeomMapChannel ---

bool DefGeomMapChannel::addChannel(GeomMapChannelPtr channel) {
    if (!channel) return false;
    channels_.push_back(std::move(channel));
    return true;
}

GeomMapChannelPtr DefGeomMapChannel::channelAt(std::int32_t index) const {
    if (index < 0 || static_cast<std::size_t>(index) >= channels_.size()) return {};
    return channels_[static_cast<std::size_t>(index)];
}

bool DefGeomMapChannel::writeToArchive(QuickArchive& ar) {
    ar.write(VersionWord::make(0, 1));
    ar.writeString(name_);
    ar.write(static_cast<std::uint32_t>(channels_.size()));
    for (const GeomMapChannelPtr& channel : channels_)
        if (!channel->writeToArchive(ar)) return false;
    return true;
}

bool DefGeomMapChannel::readFromArchive(QuickArchive& ar) {
    const auto version = ar.get<VersionWord>();
    if (!version.is(0, 1)) return ar.fail("unknown map channel list version");
    channels_.clear();
    if (!ar.readString(name_)) return false;
    const auto count = ar.get<std::uint32_t>();
    // The smallest channel record: version, number and two absent flags.
    constexpr std::uint64_t kMinChannelSize = 4 + 4 + 1 + 1;
    if (!ar.canHold(count, kMinChannelSize))
        return ar.fail(std::to_string(count) + " map channels do not fit in the " + std::to_string(ar.remaining()) +
                       " bytes left");
    for (std::uint32_t i = 0; i < count; ++i) {
        QuickArchive::Scope scope(ar, "map channel", nullptr, i);
        if (!scope) return false;
        auto channel = boost::make_shared<GeomMapChannel>(1);
        if (!channel->readFromArchive(ar)) return false;
        channels_.push_back(std::move(channel));
    }
    return true;
}

GeomMapChannel* DefGeomMapChannel::selected() const { return channelAt(current_).get(); }

std::int32_t DefGeomMapChannel::elementCount(double time) const {
    if (openStack_.empty()) return channelCount();
    const GeomMapChannel* channel = selected();
    if (!channel) return 0;
    if (openStack_.back() == kTvertsElement) return channel->tverts() ? channel->tverts()->elementCount(time) : 0;
    if (openStack_.back() == kFacesElement) return channel->faces() ? channel->faces()->elementCount(time) : 0;
    return 0;
}

KavorUtils::ListHandle DefGeomMapChannel::enterList(std::int32_t index, double) {
    if (openStack_.empty()) {
        current_ = index;
        openStack_.push_back(0);
    } else {
        openStack_.push_back(index);
    }
    return kChannelHandle;
}

void DefGeomMapChannel::leaveList(KavorUtils::ListHandle) {
    if (!openStack_.empty()) openStack_.pop_back();
}

std::int32_t DefGeomMapChannel::getInt(std::int32_t, double) const {
    const GeomMapChannel* channel = selected();
    return channel ? channel->channel() : 0;
}

Vector DefGeomMapChannel::getVector(std::int32_t index, double time) const {
    const GeomMapChannel* channel = selected();
    return channel && channel->tverts() ? channel->tverts()->getVector(index, time) : Vector{};
}

std::span<const std::int32_t> DefGeomMapChannel::getIntList(double time) const {
    const GeomMapChannel* channel = selected();
    return channel && channel->faces() ? channel->faces()->getIntList(time) : std::span<const std::int32_t>{};
}

std::span<const Vector> DefGeomMapChannel::getVectorList(double time) const {
    const GeomMapChannel* channel = selected();
    return channel && channel->tverts() ? channel->tverts()->getVectorList(time) : std::span<const Vector>{};
}

} // namespace OrvexKavorCore
