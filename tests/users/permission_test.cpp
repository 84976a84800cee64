#include <vorelix/users/audiousers.h>

#include <initializer_list>
#include <utility>

#include "support/files.h"
#include "support/platform_stand_in.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;
using files::Folder;
using stand_in::takeTrace;

/* A store that holds a text. */
struct Store : AudioUsers {
    explicit Store(const std::string &text) {
        files::write(folder.path("users"), text);
        EXPECT_TRUE(Read(folder.path("users"))) << text;
    }
    std::string saved() {
        EXPECT_TRUE(Save(folder.path("saved")));
        return files::read(folder.path("saved"));
    }
    Folder folder;
};

class Permissions : public stand_in::Test {
    const files::Places places_{ZANO_PATH_AUDIO_USERS, ZANO_PATH_PASSWD, ZANO_PATH_GROUP};
};

TEST_F(Permissions, OfAnEntryAreItsTrueFlags) {
    const std::pair<const char *, unsigned int> entries[] = {
        {R"({"usb":true,"upnp":true})", 9},
        {R"({"editsong":true})", 16},
        {R"({"streaming":true,"playlist":true,"usb":false,"other":true})", 6},
        {R"({"editsong":true,"playlist":true,"streaming":true,"upnp":true,"usb":true})", 31},
        {R"({"usb":1,"playlist":0.5,"upnp":0,"streaming":null})", 5},
        {R"({"usb":"true","playlist":[true],"upnp":{"a":1},"editsong":true})", 16},
        {"{}", 0},
        {"null", 0},
        {"true", 0},
        {"[true]", 0},
        {R"("usb")", 0},
    };
    for (const auto &[entry, mask] : entries) {
        Store store(std::string(R"({"12":)") + entry + R"(,"1024":)" + entry + "}");
        EXPECT_EQ(store.GetUser(12), mask) << entry;
        EXPECT_EQ(store.GetUser(1024), 31U) << entry;
        EXPECT_EQ(store.GetUser(13), 2U);
    }
    EXPECT_EQ(Store("null").GetUser(1024), 2U);
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(Permissions, ThatWereAskedForAndMissingAreWrittenAsNull) {
    Store store(R"({"12":{"usb":true},"13":5})");
    EXPECT_EQ(store.GetUser(12), 1U);
    EXPECT_EQ(store.GetUser(13), 0U);
    EXPECT_EQ(store.saved(),
              "{\n   \"12\" : {\n      \"editsong\" : null,\n      \"playlist\" : null,\n"
              "      \"streaming\" : null,\n      \"upnp\" : null,\n      \"usb\" : true\n   },\n"
              "   \"13\" : 5\n}\n");
}

TEST_F(Permissions, AreSetWholeAndRemoved) {
    Store store(R"({"7":{"usb":true,"more":1},"9":{}})");
    store.SetUser(7, 4 | 64);
    store.SetUser(3000000000U, 8 | 16);
    store.Remove(9);
    store.Remove(10);
    EXPECT_EQ(store.GetUser(3000000000U), 24U);
    EXPECT_EQ(store.saved(),
              "{\n   \"-1294967296\" : {\n      \"editsong\" : true,\n      \"playlist\" : false,\n"
              "      \"streaming\" : false,\n      \"upnp\" : true,\n      \"usb\" : false\n   },\n"
              "   \"7\" : {\n      \"editsong\" : false,\n      \"playlist\" : true,\n"
              "      \"streaming\" : false,\n      \"upnp\" : false,\n      \"usb\" : false\n"
              "   }\n}\n");
    store.SetUser(7, 32);
    EXPECT_EQ(store.GetUser(7), 0U);
}

TEST_F(Permissions, AreListedByTheNumbersOfTheirUsers) {
    EXPECT_EQ(Store(R"({"0":{},"12":{},"x":{},"-3":{},"100 a":{},"2":5,"":{}})").enumUsers(),
              (std::vector<unsigned int>{100, 12, 2}));
    EXPECT_TRUE(AudioUsers().enumUsers().empty());
}

TEST_F(Permissions, OfANameNeedThePrivilegeAndTheFile) {
    const auto expectEach =
        [](std::initializer_list<std::pair<const char *, unsigned int>> expected) {
            for (const auto &[name, mask] : expected) {
                EXPECT_EQ(AudioUsers::GetUserPermission(name), mask) << name;
            }
        };
    files::write(ZANO_PATH_PASSWD,
                 "admin:x:1024:1:::\nann:x:1026:1:::\nbob:x:1027:1:::\nadministrator:x:1028:1:::\n"
                 "carl:x:1029:1:::\nboss:x:1024:1:::\n");
    files::write(
        ZANO_PATH_GROUP,
        "Other:x:1:carl\nZANO.VXT.Vorelix.Application:x:2:ann,bob,administrator,gone,boss\n");
    expectEach({{"admin", 31}, {"ADmIN", 31}, {"ann", 0}, {"administrator", 0}});
    EXPECT_EQ(takeTrace(), "") << "a missing file is no failure";

    files::write(ZANO_PATH_AUDIO_USERS,
                 R"({"1024":{},"1026":{"usb":true},"1028":{"upnp":true},"1029":{"usb":true}})");
    expectEach({{"admin", 31},
                {"ann", 1},
                {"bob", 2},
                {"administrator", 8},
                {"carl", 0},
                {"gone", 0},
                {"boss", 31},
                {"", 0},
                {"ádmin", 0}});
    EXPECT_EQ(takeTrace(), "");

    files::write(ZANO_PATH_AUDIO_USERS, "{");
    expectEach({{"Admin", 31}});
    EXPECT_EQ(takeTrace(), "") << "the file is not read for the administrator";
    expectEach({{"ann", 0}});
    EXPECT_NE(takeTrace(), "");
}

TEST_F(Permissions, OfUsersThatAreGoneAreSynchronised) {
    files::write(ZANO_PATH_PASSWD, "ann:x:12:1:::\nbob:x:13:1:::\n");
    files::write(ZANO_PATH_AUDIO_USERS, R"({"12":{},"13":{},"14":{},"0":{},"x":1})");
    AudioUsers::SyncUsers();
    EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS),
              "{\n   \"0\" : {},\n   \"12\" : {},\n   \"13\" : {},\n   \"x\" : 1\n}\n");
    files::write(ZANO_PATH_AUDIO_USERS, "{ \"12\":{} }");
    AudioUsers::SyncUsers();
    EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), "{\n   \"12\" : {}\n}\n") << "written always";

    for (const char *broken : {"{\"14\":", "[]", ""}) {
        files::write(ZANO_PATH_AUDIO_USERS, broken);
        AudioUsers::SyncUsers();
        EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), broken);
    }
    fs::remove(ZANO_PATH_AUDIO_USERS);
    AudioUsers::SyncUsers();
    EXPECT_FALSE(fs::exists(ZANO_PATH_AUDIO_USERS));
}

TEST_F(Permissions, AreSeededOnceForTheUsersThatExist) {
    const auto entry = [](const std::string &uid, const std::string &flag) {
        std::string text = "   \"" + uid + "\" : {\n";
        for (const char *key : {"editsong", "playlist", "streaming", "upnp"}) {
            text.append("      \"").append(key).append("\" : ").append(flag).append(",\n");
        }
        return text + "      \"usb\" : " + flag + "\n   }";
    };
    const std::pair<const char *, std::string> cases[] = {
        {"admin:x:1024:1:::\nguest:x:1025:1:::\n",
         "{\n" + entry("1024", "true") + ",\n" + entry("1025", "false") + "\n}\n"},
        {"admin:x:500:1:::\n", "{\n" + entry("500", "true") + "\n}\n"},
        {"ann:x:12:1:::\n", "{}\n"},
    };
    for (const auto &[passwd, seeded] : cases) {
        fs::remove(ZANO_PATH_AUDIO_USERS);
        files::write(ZANO_PATH_PASSWD, passwd);
        AudioUsers::InitUserPermission();
        EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), seeded);
    }
    files::write(ZANO_PATH_AUDIO_USERS, "");
    AudioUsers::InitUserPermission();
    EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), "");
}

}  // namespace
