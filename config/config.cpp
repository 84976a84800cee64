#include <sys/stat.h>
#include <unistd.h>
#include <vorelix/config/config.h>
#include <zanoplatform/key_value_file.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>
#include <optional>

#include "line_internal.h"
#include "log_internal.h"
#include "system_paths_internal.h"

using vorelix::LogMessage;
using namespace vorelix::config;

namespace {

constexpr const char *kUnit = "config";
constexpr const char *kBadParameter = "%s(%d): Parameter error.";
constexpr LogMessage<> kSetBadParameter{kUnit, kBadParameter, 17};
constexpr LogMessage<const char *> kNotSet{kUnit, "%s(%d): value of [%s] is empty.", 22};
constexpr LogMessage<> kMatchBadParameter{kUnit, kBadParameter, 168};
constexpr LogMessage<const char *> kNoFolder{kUnit, "%s(%d): Failed to mkdir. [%s]", 333};
constexpr LogMessage<const char *> kNoTemporary{kUnit, "%s(%d): Failed to open %s.", 339};

constexpr const char *kLineFormat = "%s=\"%s\"\n";

/* One of the two default playlists. */
struct DefaultPlaylist {
    const char *key;
    LogMessage<> badParameter;
    LogMessage<const char *> notSet;
};
constexpr DefaultPlaylist kMusic{
    "AS_Default_Music_PLS",
    {kUnit, kBadParameter, 96},
    {kUnit, "%s(%d): Failed to set value of key \"AS_Default_Music_PLS\" to %s.", 101}};
constexpr DefaultPlaylist kIPod{
    "AS_Default_IPod_PLS",
    {kUnit, kBadParameter, 136},
    {kUnit, "%s(%d): Failed to set value of key \"AS_Default_IPod_PLS\" to %s.", 141}};

constexpr const char *kDefaults =
    "AS_Player_Source=\"Music\"\n"
    "AS_Player_Repeat=\"All\"\n"
    "AS_Player_Shuffle=\"Off\"\n"
    "AS_Default_Music_PLS=\"\"\n"
    "AS_Default_IPod_PLS=\"\"\n";

struct CloseFile {
    void operator()(std::FILE *file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, CloseFile>;

int setDefault(const DefaultPlaylist &playlist, const char *path) {
    if (path == nullptr) {
        playlist.badParameter();
        return 0;
    }
    if (ZANOAudioConfSet(playlist.key, path) == 0) {
        // Intended and kept: the configuration file, not the value.
        playlist.notSet(ZANO_PATH_AUDIO_CONF);
        return 0;
    }
    return 1;
}

/* To standard output, unlike all other failures: intended and kept. */
int failToRead() {
    std::printf("%s (%d) Failed to open %s, errno:%d (%s)", kUnit, 228, ZANO_PATH_AUDIO_CONF, errno,
                std::strerror(errno));
    return 0;
}

bool makeFolder() {
    return mkdir(ZANO_PATH_AUDIO_FOLDER, 0777) == 0 || errno == EEXIST;
}

int failToRestore(const LogMessage<const char *> &message, const char *path) {
    message(path);
    unlink(ZANO_PATH_AUDIO_CONF_TEMPORARY);
    return 0;
}

}  // namespace

int ZANOAudioConfSet(const char *key, const char *value) {
    if (key == nullptr || value == nullptr) {
        kSetBadParameter();
        return 0;
    }
    if (KLIBCFileSetKeyValue(ZANO_PATH_AUDIO_CONF, key, value, kLineFormat) < 0) {
        // Intended and kept: whatever the reason is.
        kNotSet(key);
        return 0;
    }
    return 1;
}

int ZANOAudioDefaultMusicPLSSet(const char *path) {
    return setDefault(kMusic, path);
}

int ZANOAudioDefaultIPodPLSSet(const char *path) {
    return setDefault(kIPod, path);
}

int ZANOAudioCurrentPlayModeSet(void) {
    return 1;
}

int ZANOAudioConfGetALL(ZANO_AUDIO_CONF *conf) {
    if (conf == nullptr) {
        return 0;
    }
    const File file(std::fopen(ZANO_PATH_AUDIO_CONF, "re"));
    if (file == nullptr) {
        return failToRead();
    }
    std::array<char, 1024> line;
    while (std::fgets(line.data(), line.size(), file.get()) != nullptr) {
        const std::optional<KeyValue> read = splitLine(line.data());
        if (read && ZANOAudioConfMatchKeyValue(read->key, read->value, conf) == 0) {
            return 0;
        }
    }
    return std::ferror(file.get()) == 0 ? 1 : failToRead();
}

int ZANOAudioConfMatchKeyValue(const char *key, const char *value, ZANO_AUDIO_CONF *conf) {
    if (key == nullptr || value == nullptr || conf == nullptr) {
        kMatchBadParameter();
        return 0;
    }
    // Intended and kept: nothing is stored.
    return 1;
}

int ZANOAudioConfPrintALL(void) {
    ZANO_AUDIO_CONF conf{};
    if (ZANOAudioConfGetALL(&conf) != 1) {
        return 0;
    }
    // Intended and kept: the first label's spelling.
    std::printf("CurentSource=%d\nPlayMode=%d\nszDefaultMusicPlaylist=%s\n", conf.currentSource,
                conf.playMode, conf.szDefaultMusicPlaylist);
    return 1;
}

int ZANOSonmiraRestoreConf(void) {
    if (access(ZANO_PATH_AUDIO_CONF, F_OK) == 0) {
        return 1;
    }
    if (!makeFolder()) {
        return failToRestore(kNoFolder, ZANO_PATH_AUDIO_FOLDER);
    }
    File file(std::fopen(ZANO_PATH_AUDIO_CONF_TEMPORARY, "we"));
    if (file == nullptr) {
        return failToRestore(kNoTemporary, ZANO_PATH_AUDIO_CONF_TEMPORARY);
    }
    // Intended and kept: whether writing and renaming succeed is not asked.
    std::fputs(kDefaults, file.get());
    std::fflush(file.get());
    file.reset();
    [[maybe_unused]] const int renamed =
        std::rename(ZANO_PATH_AUDIO_CONF_TEMPORARY, ZANO_PATH_AUDIO_CONF);
    return 1;
}
