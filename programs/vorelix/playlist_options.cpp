#include "playlist_options.h"

#include <limits>

#include "option_checks.h"
#include "playlist_draft.h"
#include "playlist_input.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr int kMostWaitSeconds = 3600;

CLI::Validator songId() {
    const CLI::Validator number = wholeNumber(1, std::numeric_limits<int>::max());
    return {[number](std::string &text) { return text == "-" ? "" : number(text); }, ""};
}

CLI::Validator positions(bool isRange) {
    return {[isRange](std::string &text) -> std::string {
                PositionRange range{};
                if (readRange(text, range) && (isRange || text.find('-') == std::string::npos)) {
                    return "";
                }
                return "'" + printable(text) + "' is no position: they count from 1" +
                       (isRange ? ", as in 4, 2-7, end" : "; end is the last");
            },
            ""};
}

CLI::Validator writtenFile() {
    return {[](std::string &path) -> std::string {
                return formOf(path).empty()
                           ? "'" + printable(path) + "' ends neither in .m3u, .pls nor .wpl"
                           : "";
            },
            ""};
}

void addOperands(CLI::App &app, unsigned arguments, PlaylistRequest &request) {
    const auto add = [&app](const char *name, auto &value, const std::string &description) {
        return app.add_option(name, value, description)->required()->type_name("");
    };
    if ((arguments & kPlaylist) != 0) {
        add("PLAYLIST", request.name, "Its id, title or path")->check(notEmpty());
    }
    if ((arguments & kNewTitle) != 0) {
        add("NAME", request.name, "Its title, and its file's name")->check(notEmpty());
    }
    if ((arguments & kFile) != 0) {
        add("FILE", request.file, "A playlist: m3u, m3u8, pls or wpl")->check(notEmpty());
    }
    if ((arguments & kPlace) != 0) {
        add("POSITION", request.place, "In front of which entry, counted from 1, or end")
            ->check(positions(false));
    }
    if ((arguments & kPositions) != 0) {
        add("POSITION", request.positions, "Entries, counted from 1: 4, 2-7, end")
            ->check(positions(true));
    }
    if ((arguments & kMoved) != 0) {
        add("POSITION", request.positions,
            "Entries, counted from 1, and last the position that the first of them gets")
            ->expected(2, std::numeric_limits<int>::max())
            ->check(positions(true));
    }
    if ((arguments & kSongs) != 0) {
        add("ID", request.songs,
            "Ids of songs; - takes them from standard input, also from a listing with --json")
            ->required(false)
            ->transform(songId());
    }
}

void addOptions(CLI::App &app, unsigned arguments, PlaylistRequest &request) {
    const auto add = [&app](const char *name, auto &value, const char *type,
                            const std::string &description) {
        return app.add_option(name, value, description)->type_name(type);
    };
    if ((arguments & kSongs) != 0) {
        add("--path", request.paths, "PATH", "A file or a web address behind them; may be repeated")
            ->allow_extra_args(false)
            ->check(notEmpty());
    }
    if ((arguments & kForm) != 0) {
        add("--form", request.form, "FORM", "Form of the file: m3u, pls, wpl; m3u if not given")
            ->check(CLI::IsMember({"m3u", "pls", "wpl"}).description(""));
    }
    if ((arguments & kTitle) != 0) {
        add("--name", request.name, "NAME", "Its title; the name of the file if not given")
            ->check(notEmpty());
    }
    if ((arguments & kTo) != 0) {
        add("--to", request.file, "FILE", "Where to; the ending tells the form: m3u, pls, wpl")
            ->required()
            ->check(writtenFile());
    }
    if ((arguments & kForce) != 0) {
        app.add_flag("--force", request.force, "Replace a file that is there");
    }
    if ((arguments & kDirectory) != 0) {
        add("--dir", request.directory, "DIR", "The personal playlists, in DIR/playlists")
            ->check(notEmpty());
    }
    if ((arguments & kWait) != 0) {
        add("--wait", request.waitSeconds, "SECONDS",
            "How long to wait for other edits; 10 if not given")
            ->transform(wholeNumber(0, kMostWaitSeconds));
    }
}

}  // namespace

void addPlaylistArguments(CLI::App &app, unsigned arguments, PlaylistRequest &request) {
    addOperands(app, arguments, request);
    addOptions(app, arguments, request);
}

void finishPlaylistArguments(unsigned arguments, PlaylistRequest &request) {
    const bool isWithoutSongs = request.songs.empty() && request.paths.empty();
    if ((arguments & kSongs) != 0 && (arguments & kNoSongs) == 0 && isWithoutSongs) {
        throw CLI::RequiredError("ID or --path");
    }
    if ((arguments & kMoved) != 0) {
        request.place = request.positions.back();
        request.positions.pop_back();
        const std::string error = positions(false)(request.place);
        if (!error.empty()) {
            throw CLI::ValidationError("TO", error);
        }
    }
    if (!request.directory.empty() && request.form != "m3u") {
        throw CLI::ValidationError("--form", "personal playlists are m3u files");
    }
}

}  // namespace vorelix
