#include "command_line.h"

namespace command_line {
namespace {

namespace fs = std::filesystem;

class Users : public CommandLine {
  protected:
    Users() : CommandLine({"users"}) {
        files::write(ZANO_PATH_PASSWD, "admin:x:1024:1:::\nann:x:1026:1:::\nbob:x:1027:1:::\n");
        files::write(ZANO_PATH_GROUP, "ZANO.VXT.Vorelix.Application:x:2:ann\n");
    }

  private:
    const files::Places places_{ZANO_PATH_AUDIO_USERS, ZANO_PATH_PASSWD, ZANO_PATH_GROUP};
};

TEST_F(Users, AreSetShownAndRemoved) {
    const std::pair<Words, const char *> steps[] = {
        {{"list"}, "no entries yet; users without one may stream\n"},
        {{"show", "ann"}, "Name   UID  Rights\nann   1026  none\n"},
        {{"set", "ann", "playlist", "upnp"}, "ann (user 1026): playlist, upnp\n"},
        {{"list"}, " UID  Rights          User\n1024  all\n1026  playlist, upnp\n"},
        {{"set", "ann", "all"}, "ann (user 1026): all\n"},
        {{"set", "1026", "none"}, "user 1026: none\n"},
        {{"set", "bob", "usb"},
         "bob (user 1027): usb\nin effect: none; who is not in the group "
         "ZANO.VXT.Vorelix.Application may do nothing\n"},
        {{"set", "admin", "usb"},
         "admin (user 1024): usb\nin effect: all; the administrator may do everything\n"},
        {{"show", "ann", "admin"}, "Name    UID  Rights\nann    1026  none\nadmin  1024  all\n"},
        {{"remove", "ann"}, "removed the entry of user 1026\n"},
        {{"show", "ann"}, "Name   UID  Rights\nann   1026  streaming\n"},
        {{"sync"}, "nothing to remove\n"},
    };
    for (const auto &[words, out] : steps) {
        EXPECT_EQ(says(words), out);
    }
    files::write(ZANO_PATH_PASSWD, "admin:x:1024:1:::\n");
    const Json::Value listed = answerOf({"list"});
    EXPECT_EQ(listed["users"][1]["uid"].asInt(), 1027);
    EXPECT_EQ(listed["users"][1]["exists"].asBool(), false);
    EXPECT_EQ(listed["users"][1]["rights"][0].asString(), "usb");
    EXPECT_EQ(says({"set", "1027", "upnp"}), "user 1027: upnp\n") << "gone, but with an entry";
    EXPECT_EQ(answerOf({"sync"})["removed"][0].asInt(), 1027);
    EXPECT_EQ(says({"list"}), " UID  Rights  User\n1024  all\n");
}

TEST_F(Users, ThatCannotBeChangedStayAsTheyWere) {
    const std::string before = R"({"1026":{"usb":true}})";
    files::write(ZANO_PATH_AUDIO_USERS, before);
    const std::pair<Words, const char *> cases[] = {
        {{"set", "carl", "usb"}, "vorelix: there is no user 'carl'\n"},
        {{"set", "9", "usb"}, "vorelix: there is no user '9'\n"},
        {{"show", "1026"}, "vorelix: there is no user '1026'\n"},
        {{"remove", "bob"}, "vorelix: bob (user 1027) has no entry\n"},
    };
    for (const auto &[words, error] : cases) {
        EXPECT_EQ(fails(words), error);
    }
    fs::remove(ZANO_PATH_PASSWD);
    fs::create_directory(ZANO_PATH_PASSWD);
    EXPECT_TRUE(contains(fails({"sync"}), "could not look for users: "))
        << "nobody is gone because the users cannot be read";
    EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), before);
    fs::create_directory(ZANO_PATH_AUDIO_USERS ".tmp");
    fs::remove(ZANO_PATH_PASSWD);
    files::write(ZANO_PATH_PASSWD, "ann:x:1026:1:::\n");
    EXPECT_TRUE(contains(fails({"set", "ann", "upnp"}), "could not write "));
    fs::remove(ZANO_PATH_AUDIO_USERS ".tmp");
    EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), before);
    files::write(ZANO_PATH_AUDIO_USERS, "{");
    for (const Words &words : {Words{"list"}, Words{"show", "ann"}, Words{"set", "ann", "usb"},
                               Words{"remove", "ann"}, Words{"sync"}}) {
        EXPECT_TRUE(contains(fails(words), "could not read ")) << words[0];
    }
    EXPECT_EQ(files::read(ZANO_PATH_AUDIO_USERS), "{");
}

TEST_F(Users, ChangedAtOnceAreAllChanged) {
    std::string passwd;
    for (int uid = 2000; uid < 2016; ++uid) {
        passwd += "u" + std::to_string(uid) + ":x:" + std::to_string(uid) + ":1:::\n";
    }
    files::write(ZANO_PATH_PASSWD, passwd);
    process::runAtOnce(16, [](int number) {
        return run({{"users", "set", "u" + std::to_string(2000 + number), "upnp"}}).status;
    });
    EXPECT_EQ(answerOf({"list"})["users"].size(), 16U);
}

}  // namespace
}  // namespace command_line
