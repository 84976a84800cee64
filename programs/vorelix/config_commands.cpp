/* config get, set, restore and print. */
#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/config/config.h>
#include <zanoplatform/error.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <memory>

#include "commands.h"
#include "failure.h"
#include "file_draft.h"
#include "json.h"
#include "line_internal.h"
#include "system_paths_internal.h"
#include "table.h"
#include "text.h"

namespace vorelix {

namespace {

constexpr const char *kPath = ZANO_PATH_AUDIO_CONF;

struct Setting {
    std::string key;
    std::string value;
};
using Settings = std::vector<Setting>;

struct CloseFile {
    void operator()(std::FILE *file) const { std::fclose(file); }
};

[[noreturn]] void throwUnread() {
    const std::string todo = errno == ENOENT ? "; make it: vorelix config restore" : "";
    throw Failure("could not read " + printable(kPath) + ": " + reasonOf(errno) + todo);
}

/* Line by line as the library reads them, whose reader keeps no value. */
Settings readSettings() {
    const std::unique_ptr<std::FILE, CloseFile> file(std::fopen(kPath, "re"));
    if (file == nullptr) {
        throwUnread();
    }
    Settings settings;
    std::array<char, 1024> line;
    while (std::fgets(line.data(), line.size(), file.get()) != nullptr) {
        if (const auto read = config::splitLine(line.data())) {
            settings.push_back({read->key, read->value});
        }
    }
    if (std::ferror(file.get()) != 0) {
        throwUnread();
    }
    return settings;
}

std::string documentOfSettings(const Settings &settings) {
    Json::Value answer(Json::objectValue);
    Json::Value &rows = answer["settings"] = Json::Value(Json::arrayValue);
    for (const Setting &each : settings) {
        Json::Value &row = rows.append(Json::Value(Json::objectValue));
        row["key"] = validUtf8(each.key);
        row["value"] = validUtf8(each.value);
    }
    return documentOf(answer);
}

std::string tableOf(const Settings &settings, const Terminal &terminal) {
    if (settings.empty()) {
        return "no settings\n";
    }
    Table table({{.header = "Key"}, {.header = "Value", .cut = true}});
    for (const Setting &each : settings) {
        table.addRow({each.key, each.value});
    }
    return table.render(terminal);
}

/* Of a key that has several lines the last one counts. */
Setting settingOf(const Settings &settings, const std::string &key) {
    const auto found = std::find_if(settings.rbegin(), settings.rend(),
                                    [&](const Setting &each) { return each.key == key; });
    if (found == settings.rend()) {
        throw Failure("there is no setting " + printable(key) + " in " + printable(kPath) +
                      "; vorelix config get shows those that there are");
    }
    return *found;
}

void requireFolder() {
    if (mkdir(ZANO_PATH_AUDIO_FOLDER, 0777) != 0 && errno != EEXIST) {
        throw Failure("could not make the folder " + printable(ZANO_PATH_AUDIO_FOLDER) + ": " +
                      reasonOf(errno));
    }
}

bool isThere() {
    return access(kPath, F_OK) == 0;
}

/* The library does not look whether the defaults reached the file, and would never make it again.
 */
void requireDefaults() {
    constexpr off_t kDefaultBytes = 119;
    struct stat file {};
    if (stat(kPath, &file) == 0 && file.st_size == kDefaultBytes) {
        return;
    }
    unlink(kPath);
    throw Failure("could not write " + printable(kPath) +
                  ": is the disk full? There is no such file now");
}

}  // namespace

Outcome configGetCommand(const Request &request, const Terminal &terminal) {
    Settings settings = readSettings();
    const std::string &key = request.state.name;
    if (!key.empty()) {
        settings = {settingOf(settings, key)};
    }
    if (request.json) {
        return {documentOfSettings(settings), ""};
    }
    return {key.empty() ? tableOf(settings, terminal) : printable(settings.front().value) + "\n",
            ""};
}

Outcome configSetCommand(const Request &request, const Terminal &) {
    const Setting setting{request.state.name, request.state.value};
    // The platform's setter lets others wait as well; restore does not.
    const FileDraft lock(kPath, deadlineOf(request.playlist.waitSeconds));
    if (ZANOAudioConfSet(setting.key.c_str(), setting.value.c_str()) != 1) {
        throw Failure("could not set " + printable(setting.key) + " in " + printable(kPath) + ": " +
                      printable(KLIBCErrTextGet()));
    }
    if (request.json) {
        return {documentOfSettings({setting}), ""};
    }
    return {"set " + printable(setting.key) + " to '" + printable(setting.value) + "'\n", ""};
}

Outcome configRestoreCommand(const Request &request, const Terminal &) {
    requireFolder();
    const FileDraft lock(kPath, deadlineOf(request.playlist.waitSeconds));
    const bool isMade = !isThere();
    if (ZANOSonmiraRestoreConf() != 1) {
        throw Failure("could not make " + printable(kPath) + ": " + reasonOf(errno) +
                      "; see the library's log with --verbose");
    }
    if (isMade) {
        requireDefaults();
    }
    if (request.json) {
        Json::Value answer(Json::objectValue);
        answer["file"] = validUtf8(kPath);
        answer["made"] = isMade;
        return {documentOf(answer), ""};
    }
    return {(isMade ? "made " + printable(kPath) + " with the defaults\n"
                    : printable(kPath) + " is there: it stays as it is\n"),
            ""};
}

Outcome configPrintCommand(const Request &request, const Terminal &) {
    // The library tells of a file that it cannot open on standard output.
    if (access(kPath, R_OK) != 0) {
        throwUnread();
    }
    if (!request.json) {
        if (ZANOAudioConfPrintALL() != 1) {
            throwUnread();
        }
        return {"", ""};
    }
    const auto conf = std::make_unique<ZANO_AUDIO_CONF>();
    if (ZANOAudioConfGetALL(conf.get()) != 1) {
        throwUnread();
    }
    Json::Value answer(Json::objectValue);
    answer["currentSource"] = conf->currentSource;
    answer["playMode"] = conf->playMode;
    answer["defaultMusicPlaylist"] = validUtf8(conf->szDefaultMusicPlaylist);
    answer["defaultIPodPlaylist"] = validUtf8(conf->szDefaultIPodPlaylist);
    return {documentOf(answer), ""};
}

}  // namespace vorelix
