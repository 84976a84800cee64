/* A command line, understood. */
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "songs.h"
#include "terminal.h"

namespace CLI {  // NOLINT(readability-identifier-naming): the parser's own
class App;
}

namespace vorelix {

struct Request;

struct Outcome {
    std::string text;       // for standard output
    std::string complaint;  // why the command failed in spite of its output; "" when it did not
};

/* Groups of arguments that commands share. */
enum Arguments : unsigned {
    kKeyword = 1U << 0,          // KEYWORD
    kOptionalKeyword = 1U << 1,  // [KEYWORD]
    kSearchOption = 1U << 2,     // --search KEYWORD
    kIn = 1U << 3,               // --in
    kSort = 1U << 4,             // --sort
    kDescending = 1U << 5,       // --desc
    kPaging = 1U << 6,           // --page, --page-size or --offset, --limit
    kColumn = 1U << 7,           // artist|album|genre
    kIds = 1U << 8,              // ID...
    kNumber = 1U << 9,           // N
    // of playlists
    kPlaylist = 1U << 10,   // PLAYLIST
    kNewTitle = 1U << 11,   // NAME
    kFile = 1U << 12,       // FILE
    kPlace = 1U << 13,      // POSITION
    kPositions = 1U << 14,  // POSITION...
    kMoved = 1U << 15,      // FROM... TO
    kSongs = 1U << 16,      // ID... --path
    kNoSongs = 1U << 17,    // of which there may be none
    kForm = 1U << 18,       // --form
    kTitle = 1U << 19,      // --name
    kTo = 1U << 20,         // --to
    kForce = 1U << 21,      // --force
    kDirectory = 1U << 22,  // --dir
    kWait = 1U << 23,       // --wait
    // of users
    kUser = 1U << 29,        // USER
    kUserNames = 1U << 30,   // USER...
    kUserRights = 1U << 31,  // RIGHT...
};

struct Command {
    const char *name;  // "list", or of a group "playlist list"
    const char *description;
    unsigned arguments;
    Outcome (*run)(const Request &request, const Terminal &terminal);  // null: a group of commands
    void (*addOwn)(CLI::App &app, Request &request) = nullptr;  // arguments of this command alone
};

/* What playlist commands were given; positions as readRange takes them. */
struct PlaylistRequest {
    std::string name;       // id, title or path; the title of a new one
    std::string directory;  // of personal playlists; "": shared ones
    std::string file;       // to import from or to export to
    std::string place;
    std::vector<std::string> positions;
    std::vector<std::string> songs;  // ids, or "-" for those on standard input
    std::vector<std::string> paths;
    std::string form = "m3u";
    bool force = false;
    int waitSeconds = 10;
};

/* What users commands were given. */
struct UsersRequest {
    std::string user;  // a name or a number
    std::vector<std::string> names;
    std::vector<std::string> rights;
};

/* What the commands of queue, configuration, custom keys and iPod were given. */
struct StateRequest {
    std::string name;   // a queue's file, a setting's key, an iPod's playlist
    std::string value;  // of a setting
    int number = 0;     // of a custom key or a track; 0: all
    std::optional<std::string> type;
    std::optional<std::string> keyValue;
    std::optional<std::string> title;
};

/* What commands that ask media servers were given. */
struct UpnpRequest {
    std::string server;        // its name, id or address
    std::string object = "0";  // id of a container
    bool all = false;
    int depth = 3;
    int waitSeconds = 2;
    int timeoutSeconds = 10;
    std::string interface;  // name or address; "": as the system chooses
};

/* Which media databases db commands were given, as the setting mediadb names them. */
struct DatabaseRequest {
    std::string location;  // "": that of the setting
    std::string from;
    std::string to;
    bool force = false;
};

struct Request {
    const Command *command = nullptr;
    std::vector<std::string> words;  // the whole command line as it was typed
    bool json = false;
    bool verbose = false;
    Filter filter;
    Order order;
    Span span;
    bool byPage = true;  // the span was not given as an offset or limit
    std::string column;
    std::vector<int> ids;
    PlaylistRequest playlist;
    UsersRequest users;
    StateRequest state;
    UpnpRequest upnp;
    DatabaseRequest database;
};

}  // namespace vorelix
