#pragma once
// Mapping channels of a mesh: per channel its number, its face list ("faces", the
// texture-vertex indices of the faces) and its texture vertices ("tverts").
//
// GeomMapChannel record:
//   VersionWord (0, 1)
//   Int32       channel number
//   Bool        faces present; when true, the integer list record
//   Bool        tverts present; when true, the vector list record
//
// DefGeomMapChannel record:
//   VersionWord (0, 1)
//   String      parameter name
//   UInt32      number of channels
//   each channel's record, in order (no kind id)
#include <dexmor/archive/Serializable.hpp>
#include <dexmor/params/PluginParameter.hpp>
#include <dexmor/params/SerialListParams.hpp>

#include <boost/shared_ptr.hpp>

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

namespace OrvexKavorCore {

// One mapping channel. It owns its two lists (through its parameter tracker).
class GeomMapChannel : public OrvexSerializable {
public:
    static constexpr const char* kFacesName = "faces";
    static constexpr const char* kTvertsName = "tverts";

    // Takes over the lists given; a list not given is created empty under its usual
    // name.
    explicit GeomMapChannel(std::int32_t channel, std::unique_ptr<DefSerialIntListParam> faces = nullptr,
                            std::unique_ptr<DefSerialVectorListParam> tverts = nullptr);
    // The lists belong to one channel; clone() makes a deep copy.
    GeomMapChannel(const GeomMapChannel&) = delete;
    GeomMapChannel& operator=(const GeomMapChannel&) = delete;

    bool writeToArchive(QuickArchive& ar) override;
    // Releases the old lists and reads the channel with the lists its record holds
    // (a list the record marks as absent stays absent).
    bool readFromArchive(QuickArchive& ar) override;
    // The same channel number with fresh lists holding copies of the elements.
    virtual boost::shared_ptr<GeomMapChannel> clone() const;

    std::int32_t channel() const { return channel_; }
    void setChannel(std::int32_t channel) { channel_ = channel; }

    // Null when a record read left the list absent.
    DefSerialIntListParam* faces() const { return faces_; }
    DefSerialVectorListParam* tverts() const { return tverts_; }

    // Replace the elements of a list (creating the list when it is absent).
    void setFaces(std::span<const std::int32_t> faces);
    void setTverts(std::span<const Vector> tverts);

private:
    DefSerialIntListParam* newFaces();
    DefSerialVectorListParam* newTverts();

    DefSerialIntListParam* faces_ = nullptr;
    DefSerialVectorListParam* tverts_ = nullptr;
    KavorPluginParamTracker tracker_;
    std::int32_t channel_;
};

using GeomMapChannelPtr = boost::shared_ptr<GeomMapChannel>;

// The mapping channels of a mesh as one parameter.
//
// Walk: elementCount() is the number of channels; enterList(i) selects channel i.
// Inside a channel its elements are the channel number (getInt), and, entered as
// element 1, the texture vertices (elementCount, getVector, getVectorList), or,
// entered as element 2, the faces (elementCount, getIntList). Every enter returns
// kChannelHandle.
class DefGeomMapChannel : public KavorPluginParameter, public OrvexSerializable {
public:
    static constexpr KavorUtils::ListHandle kChannelHandle = 0xDEAFBABE;
    static constexpr std::int32_t kTvertsElement = 1;
    static constexpr std::int32_t kFacesElement = 2;

    explicit DefGeomMapChannel(std::string name) : name_(std::move(name)) {}

    // Appends a channel; an empty pointer is not added (false).
    bool addChannel(GeomMapChannelPtr channel);
    // Channel `index`, or an empty pointer past the end.
    GeomMapChannelPtr channelAt(std::int32_t index) const;
    std::int32_t channelCount() const { return static_cast<std::int32_t>(channels_.size()); }
    const std::string& name() const { return name_; }

    bool writeToArchive(QuickArchive& ar) override;
    // A failing channel fails the read; the channels read before it are kept.
    bool readFromArchive(QuickArchive& ar) override;

    const char* getName() const override { return name_.c_str(); }
    // Nothing entered: the number of channels. In the selected channel: the number
    // of texture vertices (element 1 entered) or of face indices (element 2
    // entered); 0 otherwise.
    std::int32_t elementCount(double time = 0.0) const override;
    KavorUtils::ListHandle enterList(std::int32_t index, double time = 0.0) override;
    void leaveList(KavorUtils::ListHandle handle) override;
    // The number of the selected channel; 0 when none is selected.
    std::int32_t getInt(std::int32_t index = 0, double time = 0.0) const override;
    // Texture vertex `index` of the selected channel.
    Vector getVector(std::int32_t index = 0, double time = 0.0) const override;
    std::span<const std::int32_t> getIntList(double time = 0.0) const override;
    std::span<const Vector> getVectorList(double time = 0.0) const override;

private:
    GeomMapChannel* selected() const;

    std::vector<GeomMapChannelPtr> channels_;
    std::vector<std::int32_t> openStack_;
    std::int32_t current_ = -1;
    std::string name_;
};

} // namespace OrvexKavorCore
