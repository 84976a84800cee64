#include <vorelix/upnp/dmagent.h>

#include <array>
#include <cstdio>
#include <utility>

namespace {

constexpr std::size_t kArgumentsSize = 4096;
constexpr const char *kArguments =
    "\t\t\t<ObjectID>%s</ObjectID>\r\n"
    "\t\t\t<BrowseFlag>%s</BrowseFlag>\r\n"
    "\t\t\t<Filter>res,res@resolution,res@protocolInfo,res@size,res@duration,res@bitrate,"
    "res@sampleFrequency,res@bitsPerSample,res@nrAudioChannels,dc:creator,dc:date,upnp:genre,"
    "upnp:album,upnp:originalTrackNumber,upnp:channelNr,upnp:scheduledStartTime,"
    "upnp:scheduledEndTime,upnp:icon,upnp:albumArtURI,upnp:artist,@childCount</Filter>\r\n"
    "\t\t\t<StartingIndex>%d</StartingIndex>\r\n"
    "\t\t\t<RequestedCount>%d</RequestedCount>\r\n"
    "\t\t\t<SortCriteria></SortCriteria>\r\n";

}  // namespace

DMABrowse::DMABrowse(DMAGENT_BROWSETYPE type, std::string theUrl)
    : DMAgent(DMAGENT_ACTION_BROWSE, std::move(theUrl)), browseType(type) {}

DMABrowse::~DMABrowse() = default;

int DMABrowse::Perform() {
    std::array<char, kArgumentsSize> arguments;
    std::snprintf(arguments.data(), arguments.size(), kArguments, objectID.c_str(),
                  browseType == DMAGENT_BROWSE_METADATA ? "BrowseMetadata" : "BrowseDirectChildren",
                  startingIndex, requestedCount);
    return Send(arguments.data());
}

DMAGet::DMAGet(DMAGENT_ACTION theAction, std::string theUrl)
    : DMAgent(theAction, std::move(theUrl)) {}

DMAGet::~DMAGet() = default;

int DMAGet::Perform() {
    return Send(nullptr);
}
