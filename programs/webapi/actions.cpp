#include "actions.h"

#include <vorelix/users/audiousers.h>
#include <algorithm>
#include <iterator>

#include "file_actions.h"
#include "key_actions.h"
#include "playlist_actions.h"
#include "song_actions.h"

namespace webapi {

namespace {

class UnknownAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override { throw Refusal(kNotFound, "action"); }
};

template <typename Kind>
std::unique_ptr<ActionHandler> make(const ActionKind &kind, const Request &request) {
    return std::make_unique<Kind>(kind, request);
}

constexpr unsigned kStreaming = AudioUsers::kStreaming;
constexpr unsigned kUsb = AudioUsers::kUsb;
constexpr unsigned kPlaylist = AudioUsers::kPlaylist;

constexpr ActionKind kActions[] = {
    {"rights", kRead, 0, make<RightsAction>},
    {"songs", kRead, kStreaming, make<SongsAction>},
    {"browse", kRead, kStreaming, make<BrowseAction>},
    {"random", kRead, kStreaming, make<RandomAction>},
    {"mimetype", kRead, kStreaming, make<MimetypeAction>},
    {"stream", kRead, kStreaming, make<StreamAction>},
    {"playlists", kRead, kPlaylist, make<PlaylistsAction>},
    {"playlist", kRead, kPlaylist, make<PlaylistAction>},
    {"playlist-create", kChange, kPlaylist, make<PlaylistCreateAction>},
    {"playlist-append", kChange, kPlaylist, make<PlaylistAppendAction>},
    {"playlist-remove", kChange, kPlaylist, make<PlaylistRemoveAction>},
    {"playlist-move", kChange, kPlaylist, make<PlaylistMoveAction>},
    {"playlist-delete", kChange, kPlaylist, make<PlaylistDeleteAction>},
    {"keys", kRead, kUsb, make<KeysAction>},
    {"key-set", kChange, kUsb, make<KeySetAction>},
};

constexpr ActionKind kUnknown = {"request", kAnyMethod, 0, make<UnknownAction>};

}  // namespace

const ActionKind &actionNamed(const std::string &name) {
    const auto *found = std::find_if(std::begin(kActions), std::end(kActions),
                                     [&](const ActionKind &row) { return name == row.name; });
    return found != std::end(kActions) ? *found : kUnknown;
}

}  // namespace webapi
