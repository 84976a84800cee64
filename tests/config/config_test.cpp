#include <sys/stat.h>
#include <vorelix/config/config.h>

#include <map>
#include <string>
#include <tuple>
#include <vector>

#include "config/line_internal.h"
#include "support/files.h"
#include "support/platform_stand_in.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;
using stand_in::outcome;
using stand_in::takeTrace;

constexpr const char *kPath = ZANO_PATH_AUDIO_CONF;
constexpr const char *kDefaults =
    "AS_Player_Source=\"Music\"\nAS_Player_Repeat=\"All\"\nAS_Player_Shuffle=\"Off\"\n"
    "AS_Default_Music_PLS=\"\"\nAS_Default_IPod_PLS=\"\"\n";

template <typename Call>
std::string printed(Call call) {
    testing::internal::CaptureStdout();
    call();
    return testing::internal::GetCapturedStdout();
}

/* A line as the reader takes it: "key|value", or "" for none. */
std::string split(const std::string &line) {
    std::string buffer = line;
    const auto read = vorelix::config::splitLine(buffer.data());
    return read ? std::string(read->key) + "|" + read->value : "";
}

class Configuration : public stand_in::Test {
  protected:
    Configuration() { fs::create_directory(ZANO_PATH_AUDIO_FOLDER); }
    static void write(const std::string &text) { files::write(kPath, text); }

  private:
    const files::Places places_{ZANO_PATH_AUDIO_FOLDER};
};

TEST(ConfigurationLine, IsTakenApart) {
    const std::map<std::string, std::vector<const char *>> linesOf = {
        {"a|b", {"a=\"b\"\n", "a = \"b\"", " \ta\t=\t\"b\" \t\n", "a== = b\n"}},
        {"a|b c", {"a=b c\n"}},
        {"a b|c", {"a b=c"}},
        {"a| b ", {"a=\" b \"\n"}},
        {"a|b=\"c\"", {"a=\"b=\"c\"\"\n"}},
        {"a|\"b", {"a=\"b\n"}},
        {"a|b\"", {"a=b\"\n"}},
        {"a|", {"a=\"\n", "a=\"\"\n", "a=\n", "a= \t", "a\n", "a"}},
        {"a|\"", {"a=\"\"\"\n"}},
        {"a|\"b\"\r", {"a=\"b\"\r\n"}},
        {"a|# b", {"a=# b\n"}},
        {"a b|", {"a b \t\n"}},
        {"|b", {"=b\n", " ==\"b\"\n"}},
        {"|", {"="}},
        {"\r|", {"\r\n"}},
        {"\"a\"|1", {"\"a\"=1\n"}},
        {"", {"# a=b\n", "  #", "\n", " \t\n", " \t", ""}},
    };
    for (const auto &[read, lines] : linesOf) {
        for (const char *line : lines) {
            EXPECT_EQ(split(line), read) << line;
        }
    }
}

TEST_F(Configuration, IsReadToItsEndAndNothingStored) {
    for (const std::string &text :
         {std::string(), std::string("# c\n\n  a = b\nx\n=\n\0y=1", 20), std::string(5000, '='),
          "AS_Default_IPod_PLS=\"/p\"\nl=\"" + std::string(2000, 'x') + "\"\n" + kDefaults}) {
        write(text);
        ZANO_AUDIO_CONF conf{};
        conf.currentSource = 7;
        EXPECT_EQ(printed([&] { EXPECT_EQ(ZANOAudioConfGetALL(&conf), 1) << text; }), "");
        EXPECT_EQ(conf.currentSource, 7);
        EXPECT_STREQ(conf.szDefaultIPodPlaylist, "");
        EXPECT_EQ(printed([] { EXPECT_EQ(ZANOAudioConfPrintALL(), 1); }),
                  "CurentSource=0\nPlayMode=0\nszDefaultMusicPlaylist=\n");
    }
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Configuration, ThatCannotBeReadIsPrintedAndNotLogged) {
    const std::string failure = std::string("config (228) Failed to open ") + kPath + ", errno:";
    ZANO_AUDIO_CONF conf{};
    const auto read = [&] { EXPECT_EQ(ZANOAudioConfGetALL(&conf), 0); };
    EXPECT_EQ(printed(read), failure + "2 (No such file or directory)");
    EXPECT_EQ(printed([] { EXPECT_EQ(ZANOAudioConfPrintALL(), 0); }),
              failure + "2 (No such file or directory)");
    fs::create_directory(kPath);
    EXPECT_EQ(printed(read), failure + "21 (Is a directory)");
    EXPECT_EQ(printed([] { EXPECT_EQ(ZANOAudioConfGetALL(nullptr), 0); }), "");
    EXPECT_EQ(takeTrace(), "");

    EXPECT_EQ(ZANOAudioConfMatchKeyValue("k", "v", &conf), 1);
    EXPECT_EQ(ZANOAudioConfMatchKeyValue(nullptr, "v", &conf), 0);
    EXPECT_EQ(ZANOAudioConfMatchKeyValue("k", nullptr, &conf), 0);
    EXPECT_EQ(ZANOAudioConfMatchKeyValue("k", "v", nullptr), 0);
    const std::string line = "3 config(168): Parameter error.\n";
    EXPECT_EQ(takeTrace(), line + line + line);
}

TEST_F(Configuration, KeysAreSetInPlace) {
    write(kDefaults);
    EXPECT_EQ(ZANOAudioConfSet("AS_Player_Repeat", "One"), 1);
    EXPECT_EQ(ZANOAudioDefaultMusicPLSSet("/volume1/a \"b\".m3u"), 1);
    EXPECT_EQ(ZANOAudioDefaultIPodPLSSet("/i"), 1);
    EXPECT_EQ(ZANOAudioCurrentPlayModeSet(), 1);
    EXPECT_EQ(files::read(kPath),
              "AS_Player_Source=\"Music\"\nAS_Player_Repeat=\"One\"\nAS_Player_Shuffle=\"Off\"\n"
              "AS_Default_Music_PLS=\"/volume1/a \"b\".m3u\"\nAS_Default_IPod_PLS=\"/i\"\n");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Configuration, FailedSetsSayTheValueIsEmpty) {
    const std::string path = kPath;
    const std::tuple<int (*)(const char *), const char *, std::string> cases[] = {
        {[](const char *value) { return ZANOAudioConfSet(nullptr, value); }, "v",
         "3 config(17): Parameter error.\n"},
        {[](const char *value) { return ZANOAudioConfSet("k", value); }, nullptr,
         "3 config(17): Parameter error.\n"},
        {[](const char *value) { return ZANOAudioConfSet("k", value); }, "a\nb",
         "3 config(22): value of [k] is empty.\n"},
        {ZANOAudioDefaultMusicPLSSet, nullptr, "3 config(96): Parameter error.\n"},
        {ZANOAudioDefaultMusicPLSSet, "a\nb",
         "3 config(22): value of [AS_Default_Music_PLS] is empty.\n3 config(101): Failed to set "
         "value of key \"AS_Default_Music_PLS\" to " +
             path + ".\n"},
        {ZANOAudioDefaultIPodPLSSet, nullptr, "3 config(136): Parameter error.\n"},
        {ZANOAudioDefaultIPodPLSSet, "a\nb",
         "3 config(22): value of [AS_Default_IPod_PLS] is empty.\n3 config(141): Failed to set "
         "value of key \"AS_Default_IPod_PLS\" to " +
             path + ".\n"},
    };
    for (const auto &[set, value, trace] : cases) {
        EXPECT_EQ(set(value), 0) << trace;
        EXPECT_EQ(takeTrace(), trace);
    }
    EXPECT_FALSE(fs::exists(kPath));
}

TEST_F(Configuration, IsRestoredOnlyWhereThereIsNone) {
    const mode_t mask = umask(0);
    fs::remove_all(ZANO_PATH_AUDIO_FOLDER);
    EXPECT_EQ(ZANOSonmiraRestoreConf(), 1);
    umask(mask);
    EXPECT_EQ(files::read(kPath), kDefaults);
    EXPECT_EQ(files::read(kPath).size(), 119U);
    EXPECT_EQ(fs::status(ZANO_PATH_AUDIO_FOLDER).permissions(), fs::perms(0777));
    EXPECT_FALSE(fs::exists(ZANO_PATH_AUDIO_CONF_TEMPORARY));
    write("");
    EXPECT_EQ(ZANOSonmiraRestoreConf(), 1);
    EXPECT_EQ(files::read(kPath), "");
    fs::remove(kPath);
    files::write(ZANO_PATH_AUDIO_CONF_TEMPORARY,
                 std::string("left over, and longer: ") + kDefaults);
    EXPECT_EQ(ZANOSonmiraRestoreConf(), 1);
    EXPECT_EQ(files::read(kPath), kDefaults);
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Configuration, ThatCannotBeRestoredIsLogged) {
    const fs::path folder = ZANO_PATH_AUDIO_FOLDER;
    fs::create_directory(ZANO_PATH_AUDIO_CONF_TEMPORARY);
    EXPECT_EQ(
        outcome(ZANOSonmiraRestoreConf()),
        "0 3 config(339): Failed to open " + std::string(ZANO_PATH_AUDIO_CONF_TEMPORARY) + ".\n");
    const fs::path above = folder.parent_path();
    const fs::path aside = above.string() + ".aside";
    fs::rename(above, aside);
    EXPECT_EQ(ZANOSonmiraRestoreConf(), 0);
    fs::rename(aside, above);
    EXPECT_EQ(takeTrace(), "3 config(333): Failed to mkdir. [" + folder.string() + "]\n");
}

}  // namespace
