#include <unistd.h>
#include <vorelix/playlists/playlist.h>

#include <array>

#include "edit_internal.h"
#include "edit_messages_internal.h"
#include "log_internal.h"
#include "media_rows_internal.h"
#include "playlists_internal.h"

using vorelix::asInt;
using vorelix::LogMessage;
using namespace vorelix::playlist;

namespace {

constexpr const char *kNoFile = "%s (%d) Playlist(%s, %s) does not exist.";
constexpr const char *kNoPath = "%s (%d) Failed to get playlist path.";
constexpr LogMessage<const char *, const char *> kRemovalNoFile{kUnit, kNoFile, 986};
constexpr LogMessage<> kUpdateNoPath{kUnit, kNoPath, 1070};
constexpr LogMessage<> kAppendNoPath{kUnit, kNoPath, 1166};
constexpr LogMessage<const char *, const char *> kMissingNoFile{
    kUnit, "%s:%d Playlist(%s, %s) does not exist.", 1265};

/* A shared playlist, looked up by its id; the path is empty when there is none. */
class SharedPlaylist {
  public:
    explicit SharedPlaylist(const char *id)
        : id_(id),
          hasPath_(ZANOPlaylistPathGet(playlistId(id), path_.data(), asInt(path_.size())) == 0) {}

    operator Playlist() const { return {id_, path_.data()}; }

    bool hasPath(const LogMessage<> &failure) const {
        if (!hasPath_) {
            failure();
        }
        return hasPath_;
    }

    /* Looks at the path alone, whatever the lookup gave. */
    bool hasFile(const LogMessage<const char *, const char *> &failure) const {
        if (access(path_.data(), F_OK) == 0) {
            return true;
        }
        failure(id_, path_.data());
        return false;
    }

  private:
    const char *id_;
    std::array<char, 4096> path_{};
    bool hasPath_;
};

}  // namespace

int ZANOPlaylistRemoveSongs(const char *id, const char *selection) {
    if (id == nullptr || selection == nullptr) {
        kSharedMessages.removal.badParameter();
        return -1;
    }
    const SharedPlaylist playlist(id);
    return playlist.hasFile(kRemovalNoFile)
               ? removeSongs(playlist, selection, kSharedMessages.removal)
               : -1;
}

int ZANOPlaylistUpdateSongs(const char *id, ZANO_PLAYLIST_REC *records, int start, int count) {
    if (id == nullptr || records == nullptr) {
        kSharedMessages.update.badParameter();
        return -1;
    }
    const SharedPlaylist playlist(id);
    return playlist.hasPath(kUpdateNoPath)
               ? updateSongs(playlist, records, start, count, kSharedMessages.update)
               : -1;
}

int ZANOPlaylistAppendSongs(const char *id, ZANO_PLAYLIST_REC *records, int recordCount) {
    if (id == nullptr || records == nullptr) {
        kSharedMessages.append.badParameter();
        return -1;
    }
    const SharedPlaylist playlist(id);
    return playlist.hasPath(kAppendNoPath)
               ? appendSongs(playlist, records, recordCount, kSharedMessages.append)
               : -1;
}

int ZANOPlaylistRemoveMissing(const char *id) {
    if (id == nullptr) {
        kSharedMessages.missing.badParameter();
        return -1;
    }
    const SharedPlaylist playlist(id);
    return playlist.hasFile(kMissingNoFile) ? removeMissing(playlist, kSharedMessages.missing) : -1;
}
