#include "commands.h"

namespace vorelix {

const std::vector<Command> &allCommands() {
    static const std::vector<Command> commands = {
        {"list", "List songs", kSort | kDescending | kPaging, listCommand},
        {"search", "Find songs by a part of their tags",
         kKeyword | kIn | kSort | kDescending | kPaging, listCommand},
        {"browse", "List the artists, albums or genres",
         kColumn | kSearchOption | kDescending | kPaging, browseCommand},
        {"show", "Show all that is known of songs", kIds, showCommand},
        {"count", "Count the songs, or those with a text in their tags", kOptionalKeyword | kIn,
         countCommand},
        {"random", "List some songs by chance", kNumber, randomCommand},
        {"playlist", "Make, show and change playlists", 0, nullptr},
        {"playlist list", "List playlists", kPaging | kDirectory, playlistListCommand},
        {"playlist show", "Show the entries of a playlist", kPlaylist | kPaging | kDirectory,
         playlistShowCommand},
        {"playlist create", "Make a playlist, of songs or empty",
         kNewTitle | kSongs | kNoSongs | kForm | kForce | kDirectory | kWait,
         playlistCreateCommand},
        {"playlist append", "Add entries at the end", kPlaylist | kSongs | kDirectory | kWait,
         playlistAppendCommand},
        {"playlist insert", "Add entries in front of one",
         kPlaylist | kPlace | kSongs | kDirectory | kWait, playlistInsertCommand},
        {"playlist remove", "Remove entries", kPlaylist | kPositions | kDirectory | kWait,
         playlistRemoveCommand},
        {"playlist move", "Move entries to another position",
         kPlaylist | kMoved | kDirectory | kWait, playlistMoveCommand},
        {"playlist prune", "Remove the entries whose files are gone",
         kPlaylist | kDirectory | kWait, playlistPruneCommand},
        {"playlist delete", "Delete a playlist with its file", kPlaylist | kDirectory | kWait,
         playlistDeleteCommand},
        {"playlist import", "Make a playlist of any playlist file",
         kFile | kTitle | kForm | kForce | kDirectory | kWait, playlistImportCommand},
        {"playlist export", "Write a playlist file for other programs or places",
         kPlaylist | kTo | kForce | kDirectory | kWait, playlistExportCommand},
        {"users", "Say what the users may do", 0, nullptr},
        {"users list", "List the entries of users", 0, usersListCommand},
        {"users show", "Show what users may do", kUserNames, usersShowCommand},
        {"users set", "Set what a user may do", kUser | kUserRights, usersSetCommand},
        {"users remove", "Remove the entry of a user, who may stream then", kUser,
         usersRemoveCommand},
        {"users sync", "Remove the entries of users that are gone", 0, usersSyncCommand},
    };
    return commands;
}

}  // namespace vorelix
