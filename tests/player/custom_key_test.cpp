#include <sys/resource.h>
#include <vorelix/player/custom_key.h>

#include <climits>
#include <string>

#include "player/custom_key_internal.h"
#include "support/files.h"
#include "support/platform_stand_in.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;
using stand_in::outcome;
using stand_in::takeTrace;

const std::string kPath = ZANO_PATH_CUSTOM_KEYS;

class CustomKeys : public stand_in::Test {
  protected:
    CustomKeys() { fs::create_directory(ZANO_PATH_AUDIO_FOLDER); }

  private:
    const files::Places places_{ZANO_PATH_AUDIO_FOLDER};
};

/* "type|value|title", or "-1". */
std::string get(int key) {
    std::string type = "a";
    std::string value = "b";
    std::string title = "c";
    const int result = ZANOAudioCustomGet(key, type, value, title);
    if (result == -1) {
        EXPECT_EQ(type + value + title, "abc");
        return "-1";
    }
    EXPECT_EQ(result, 0);
    return type + "|" + value + "|" + title;
}

/* The file without blanks. */
std::string file() {
    std::string text = files::read(kPath);
    std::erase_if(text, [](char c) { return c == ' ' || c == '\n'; });
    return text;
}

std::string deep(int levels) {
    return std::string(static_cast<std::size_t>(levels), '[');
}

TEST_F(CustomKeys, AreEmptyUntilTheFirstOneIsSet) {
    for (int key = 1; key <= 4; ++key) {
        EXPECT_EQ(get(key), "||");
    }
    EXPECT_FALSE(fs::exists(kPath));
    EXPECT_EQ(ZANOAudioCustomSet(2, "t", "v", "\"Ø\"\n"), 0);
    const auto element = [](int id, const char *title, const char *type, const char *value) {
        return "      {\n         \"id\" : " + std::to_string(id) + ",\n         \"title\" : \"" +
               title + "\",\n         \"type\" : \"" + type + "\",\n         \"value\" : \"" +
               value + "\"\n      }";
    };
    EXPECT_EQ(files::read(kPath), "{\n   \"items\" : [\n" + element(1, "", "", "") + ",\n" +
                                      element(2, R"(\"\u00d8\"\n)", "t", "v") + ",\n" +
                                      element(3, "", "", "") + ",\n" + element(4, "", "", "") +
                                      "\n   ]\n}\n");
    EXPECT_EQ(get(2), "t|v|\"Ø\"\n");
    EXPECT_EQ(get(4), "||");
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(CustomKeys, AreFour) {
    for (const int key : {0, 5, -1, INT_MIN, INT_MAX}) {
        const std::string number = std::to_string(key);
        EXPECT_EQ(get(key), "-1");
        EXPECT_EQ(takeTrace(), "3 custom_key:120 Index out of range [" + number + "]\n");
        EXPECT_EQ(outcome(ZANOAudioCustomSet(key, "t", "v", "x")),
                  "-1 3 custom_key:151 Index out of range [" + number + "]\n");
    }
    EXPECT_FALSE(fs::exists(kPath));
}

TEST_F(CustomKeys, OfAFileOfAnyShapeAreReadAndSetOrRefused) {
    const std::string parsing = "3 custom_key:92 Failed to parse json file [" + kPath + "]\n";
    const std::string getFails = "3 custom_key:125 Failed to get custom json.\n";
    const std::string setFails = "3 custom_key:156 Failed to get custom json.\n";
    const std::string invalid = "3 custom_key:130 Invalid json file\n";
    const std::string set = R"({"title":"x","type":"t","value":"v"})";
    const struct {
        std::string before;
        std::string got;
        std::string getTrace;
        std::string after;  // "": as before, and setting fails
        std::string setTrace;
    } cases[] = {
        {"", "-1", parsing + getFails, "", parsing + setFails},
        {"items", "-1", parsing + getFails, "", parsing + setFails},
        {R"({"items":[)", "-1", parsing + getFails, "", parsing + setFails},
        {deep(2000), "-1", parsing + getFails, "", parsing + setFails},
        {R"({"items":)" + deep(2000), "-1", parsing + getFails, "", parsing + setFails},
        {"[1,2]", "-1", invalid, "", setFails},
        {"5", "-1", invalid, "", setFails},
        {"\"items\"", "-1", invalid, "", setFails},
        {R"({"items":{"0":1}})", "-1", invalid, "", setFails},
        {R"({"items":"0"})", "-1", invalid, "", setFails},
        {R"({"items":[0,1]})", "-1", invalid, "", setFails},
        {R"({"items":[0,[]]})", "-1", invalid, "", setFails},
        {R"({"items":[{},{"type":{}}]})", "-1", invalid, R"({"items":[{},)" + set + "]}", ""},
        {"null", "-1", invalid, R"({"items":[null,)" + set + "]}", ""},
        {"{}", "-1", invalid, R"({"items":[null,)" + set + "]}", ""},
        {R"({"items":null,"other":1})", "-1", invalid,
         R"({"items":[null,)" + set + R"(],"other":1})", ""},
        {R"({"items":[]})", "||", "", R"({"items":[null,)" + set + "]}", ""},
        {R"({"items":[7,null,8]})", "||", "", R"({"items":[7,)" + set + ",8]}", ""},
        {R"({"items":[{},{"id":9,"title":"a","more":[1]}]})", "||a", "",
         R"({"items":[{},{"id":9,"more":[1],"title":"x","type":"t","value":"v"}]})", ""},
        {R"({"items":[0,{"type":5,"value":true,"title":null}]})", "5|true|", "",
         R"({"items":[0,)" + set + "]}", ""},
        {R"({"items":[],"more":[{"items\u0000":0}]})", "||", "", "", setFails},
        {R"(/*kept*/{"items":[1,{}]})", "||", "", R"(/*kept*/{"items":[1,)" + set + "]}", ""},
    };
    for (const auto &each : cases) {
        SCOPED_TRACE(each.before.substr(0, 50));
        files::write(kPath, each.before);
        EXPECT_EQ(get(2), each.got);
        EXPECT_EQ(takeTrace(), each.getTrace);
        EXPECT_EQ(ZANOAudioCustomSet(2, "t", "v", "x"), each.after.empty() ? -1 : 0);
        EXPECT_EQ(takeTrace(), each.setTrace);
        EXPECT_EQ(file(), each.after.empty() ? each.before : each.after);
    }
}

TEST_F(CustomKeys, ThatCannotBeReadAreNotSet) {
    fs::create_directory(kPath);
    EXPECT_EQ(get(1), "-1");
    EXPECT_EQ(takeTrace(), "3 custom_key:92 Failed to parse json file [" + kPath +
                               "]\n3 custom_key:125 Failed to get custom json.\n");
    fs::remove(kPath);
    files::write(kPath, "{}");
    Json::Value root;
    {
        struct rlimit usual {};
        getrlimit(RLIMIT_NOFILE, &usual);
        const struct rlimit none { 0, usual.rlim_max };
        ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &none), 0);
        EXPECT_EQ(ZANOAudioCustomLoadJson(root), -1);
        setrlimit(RLIMIT_NOFILE, &usual);
    }
    EXPECT_EQ(takeTrace(),
              "3 custom_key:87 Failed to open json file [" + kPath + "] Too many open files\n");
    fs::remove_all(ZANO_PATH_AUDIO_FOLDER);
    files::write(ZANO_PATH_AUDIO_FOLDER, "a file");
    EXPECT_EQ(outcome(ZANOAudioCustomSet(1, "t", "v", "x")),
              "-1 3 custom_key:79 Failed to access json file [" + kPath +
                  "] Not a directory\n3 custom_key:156 Failed to get custom json.\n");
}

TEST_F(CustomKeys, ThatCannotBeWrittenAreAFailure) {
    {
        const files::FullDisk disk(100);
        EXPECT_EQ(ZANOAudioCustomSet(1, "t", "v", "x"), -1);
    }
    EXPECT_EQ(takeTrace(), "3 custom_key:30 Failed to fwrite, [File too large]\n");
    EXPECT_EQ(files::read(kPath).size(), 100U) << "written in place";
    fs::remove_all(ZANO_PATH_AUDIO_FOLDER);
    EXPECT_EQ(outcome(ZANOAudioCustomSet(1, "t", "v", "x")),
              "-1 3 custom_key:24 Failed to fopen [" + kPath + "], [No such file or directory]\n");
}

TEST_F(CustomKeys, AreLoadedInPlaceOfTheValueAtHand) {
    Json::Value root(5);
    EXPECT_EQ(ZANOAudioCustomLoadJson(root), 0);
    EXPECT_EQ(root["items"].size(), 4U);
    root["other"] = 1;
    EXPECT_EQ(ZANOAudioCustomLoadJson(root), 0);
    EXPECT_EQ(root["other"], 1);
    files::write(kPath, "[");
    EXPECT_EQ(ZANOAudioCustomLoadJson(root), -1);
    EXPECT_EQ(root["other"], 1);
    files::write(kPath, "[7]");
    EXPECT_EQ(ZANOAudioCustomLoadJson(root), 0);
    EXPECT_EQ(root[0], 7);
    takeTrace();
    EXPECT_EQ(outcome(vorelix::custom_key::ReadJsonFile(nullptr, root)),
              "-1 3 custom_key:67 Bad parameter.\n");
    EXPECT_EQ(outcome(vorelix::custom_key::WriteJsonFile(nullptr, root)),
              "-1 3 custom_key:17 Bad parameter.\n");
}

}  // namespace
