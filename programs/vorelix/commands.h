/* The commands. Each answers with a text for standard output, a table or with request.json a
 * document, and throws Failure when it has none. */
#pragma once

#include <vector>

#include "request.h"

namespace vorelix {

const std::vector<Command> &allCommands();

/* list, search, random: {"songs": [...], "offset", "limit", "total"} */
Outcome listCommand(const Request &request, const Terminal &terminal);
Outcome randomCommand(const Request &request, const Terminal &terminal);

/* {"column": "artist", "values": [...], "offset", "limit", "total"} */
Outcome browseCommand(const Request &request, const Terminal &terminal);

/* {"songs": [...], "unknown": [ids that name no song]}, which are a complaint too */
Outcome showCommand(const Request &request, const Terminal &terminal);

/* {"total": number} */
Outcome countCommand(const Request &request, const Terminal &terminal);

/* Of playlists; each document has "playlist", but for the first:
 *   list                    {"playlists": [...], "offset", "limit", "total"}
 *   show                    "entries": [...], "known", "offset", "limit", "total"
 *   create, export          "total": its entries; of an export also "file"
 *   import                  "total", "known": how many of them the media database has
 *   append, insert, move    "changed": true, "total"
 *   remove, prune           "removed": [...] too
 * Entries are songs with their "position", from 1, and id 0 when they are not in the database. */
Outcome playlistListCommand(const Request &request, const Terminal &terminal);
Outcome playlistShowCommand(const Request &request, const Terminal &terminal);
Outcome playlistCreateCommand(const Request &request, const Terminal &terminal);
Outcome playlistAppendCommand(const Request &request, const Terminal &terminal);
Outcome playlistInsertCommand(const Request &request, const Terminal &terminal);
Outcome playlistRemoveCommand(const Request &request, const Terminal &terminal);
Outcome playlistMoveCommand(const Request &request, const Terminal &terminal);
Outcome playlistPruneCommand(const Request &request, const Terminal &terminal);
Outcome playlistDeleteCommand(const Request &request, const Terminal &terminal);
Outcome playlistImportCommand(const Request &request, const Terminal &terminal);
Outcome playlistExportCommand(const Request &request, const Terminal &terminal);

/* What users may do. A user has "uid" and "rights", by name:
 *   list          {"users": [with "exists"]}
 *   show          {"users": [with "name"]}: what is in effect
 *   set           {"user"}
 *   remove, sync  {"removed": [uids]} */
Outcome usersListCommand(const Request &request, const Terminal &terminal);
Outcome usersShowCommand(const Request &request, const Terminal &terminal);
Outcome usersSetCommand(const Request &request, const Terminal &terminal);
Outcome usersRemoveCommand(const Request &request, const Terminal &terminal);
Outcome usersSyncCommand(const Request &request, const Terminal &terminal);

/* Of a player's queue; each document has "queue": {"path", "state": [3 numbers]}, "total":
 *   show                    "entries": [...], "offset", "limit", "trailingBytes" too */
Outcome queueShowCommand(const Request &request, const Terminal &terminal);
Outcome queueSaveCommand(const Request &request, const Terminal &terminal);
Outcome queueAppendCommand(const Request &request, const Terminal &terminal);
Outcome queueRandomCommand(const Request &request, const Terminal &terminal);

/* get, set   {"settings": [{"key", "value"}, ...]}
 * restore    {"file", "made": true}
 * print      {"currentSource", "playMode", "defaultMusicPlaylist", "defaultIPodPlaylist"} */
Outcome configGetCommand(const Request &request, const Terminal &terminal);
Outcome configSetCommand(const Request &request, const Terminal &terminal);
Outcome configRestoreCommand(const Request &request, const Terminal &terminal);
Outcome configPrintCommand(const Request &request, const Terminal &terminal);

/* {"keys": [{"key", "type", "value", "title"}, ...]} */
Outcome keysGetCommand(const Request &request, const Terminal &terminal);
Outcome keysSetCommand(const Request &request, const Terminal &terminal);

/* tracks      {"tracks": [...], "offset", "limit", "total"}, songs with their "position"
 * songs       "playlist": {"title", "path"} too
 * track       {"track": song}
 * playlists   {"playlists": [{"title", "path"}, ...], "total"} */
Outcome ipodTracksCommand(const Request &request, const Terminal &terminal);
Outcome ipodTrackCommand(const Request &request, const Terminal &terminal);
Outcome ipodPlaylistsCommand(const Request &request, const Terminal &terminal);
Outcome ipodSongsCommand(const Request &request, const Terminal &terminal);
/* Of media servers:
 *   servers   {"servers": [{"name", "model", "id", "controlUrl", "url"}], "failed": [{"url",
 *             "complaint"}]}, which are a complaint too
 *   browse    {"server": {"name", "controlUrl"}, "id", "objects": [...], "lost", "repaired",
 *             "offset", "limit", "total"}
 *   caps      {"server", "search": [...], "sort": [...], "updateId"}
 *   tree      {"server", "id", "objects": [...], "lost"}, each with its "depth", from 1
 * An object has "kind" ("container" or "item"), "id", "title", "values", which has every value that
 * the server gave, and "resources", with the address of each under "res". */
Outcome upnpServersCommand(const Request &request, const Terminal &terminal);
Outcome upnpBrowseCommand(const Request &request, const Terminal &terminal);
Outcome upnpCapsCommand(const Request &request, const Terminal &terminal);
Outcome upnpTreeCommand(const Request &request, const Terminal &terminal);

/* Of whole media databases; built where the platform library is the bundled one:
 *   check     {"location", "songs", "playlists", "notices", "isIndexed"}
 *   migrate   {"location", "schemaBefore", "schema", "changed"}
 *   copy      {"from", "to", "songs", "playlists", "notices"}
 * A database that is damaged is a failure. */
Outcome dbCheckCommand(const Request &request, const Terminal &terminal);
Outcome dbMigrateCommand(const Request &request, const Terminal &terminal);
Outcome dbCopyCommand(const Request &request, const Terminal &terminal);

}  // namespace vorelix
