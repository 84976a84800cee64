#include <gtest/gtest.h>
#include <pwd.h>
#include <unistd.h>
#include <zanoplatform/error.h>
#include <zanoplatform/privilege.h>
#include <zanoplatform/unicode.h>
#include <zanoplatform/user.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <tuple>

#include "support/files.h"
#include "system_paths_internal.h"

namespace {

namespace fs = std::filesystem;

/* The number, or "none CODE" with the platform's reason. */
template <typename Wanted>
std::string load(const Wanted &wanted) {
    SDK::User *const user = SDK::User::LoadUser(wanted);
    const std::string shown = user != nullptr ? std::to_string(user->GetUID())
                                              : "none " + std::to_string(KLIBCErrGet() & 0xF);
    SDK::User::Release(user);
    return shown;
}

class Users : public testing::Test {
    const files::Places places_{ZANO_PATH_PASSWD, ZANO_PATH_GROUP};
};

TEST_F(Users, AreThoseOfTheDevicesFile) {
    std::ofstream(ZANO_PATH_PASSWD)
        << "# a comment\n\nadmin:x:1024:100:" << std::string(5000, 'i') << ":/root:/bin/sh\n"
        << "broken:x:zwölf\n:x:7:7:::\n+:::::\n-left:x:0:0:::\n"
        << "José:x:1026:100::/home:/bin/sh\nlast:x:4294967294:1:::\nadmin:x:9:9:::";
    const std::pair<const char *, const char *> byName[] = {
        {"admin", "1024"},   {"José", "1026"},     {"last", "4294967294"},
        {"ADMIN", "none 0"}, {"broken", "none 0"}, {"", "none 0"},
        {"+", "none 0"},     {"-left", "none 0"},  {"root", "none 0"},
    };
    for (const auto &[name, shown] : byName) {
        EXPECT_EQ(load(std::string(name)), shown) << name;
    }
    const std::pair<int, const char *> byNumber[] = {
        {1024, "1024"}, {9, "9"}, {-2, "4294967294"}, {0, "none 0"}, {7, "none 0"}};
    for (const auto &[number, shown] : byNumber) {
        EXPECT_EQ(load(number), shown) << number;
    }
}

TEST_F(Users, AreTheSystemsOnlyWhereTheDeviceHasNoFile) {
    const passwd *const self = getpwuid(getuid());
    ASSERT_NE(self, nullptr);
    const std::string name = self->pw_name;
    const std::string number = std::to_string(getuid());
    EXPECT_EQ(load(name), number);
    EXPECT_EQ(load(static_cast<int>(getuid())), number);
    EXPECT_EQ(load(std::string("no such user")), "none 0");
    fs::create_directory(ZANO_PATH_PASSWD);
    EXPECT_EQ(load(name), "none 1") << "a folder in the place of the file";
}

TEST_F(Users, HoldThePrivilegesWhoseGroupsListThem) {
    EXPECT_EQ(KLIBUserPrivilegeHas("ann", "Audio"), 0) << "no file";
    std::ofstream(ZANO_PATH_GROUP) << "Other:x:1:ann\nAudio:x:100:bob,ann,carl\nbroken\n"
                                   << "Audio:x:100:dora\nNobody:x:5:\n";
    const std::tuple<const char *, const char *, int> cases[] = {
        {"ann", "Audio", 1},    {"carl", "Audio", 1}, {"dora", "Audio", 1}, {"an", "Audio", 0},
        {"ann", "audio", 0},    {"bob", "Other", 0},  {"", "Nobody", 0},    {"ann", "", 0},
        {nullptr, "Audio", -1}, {"ann", nullptr, -1}, {"ann", "broken", 0}};
    for (const auto &[user, privilege, result] : cases) {
        EXPECT_EQ(KLIBUserPrivilegeHas(user, privilege), result)
            << testing::PrintToString(user) << " " << testing::PrintToString(privilege);
    }
    fs::remove(ZANO_PATH_GROUP);
    fs::create_directory(ZANO_PATH_GROUP);
    EXPECT_EQ(KLIBUserPrivilegeHas("ann", "Audio"), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_PRIVILEGES_UNREADABLE);
}

TEST(CaseCompare, IgnoresCaseAndNothingElse) {
    const std::tuple<const char *, const char *, int> cases[] = {
        {"admin", "ADmIN", 0},         {"", "", 0},
        {"STRASSE", "straße", 0},      {"ÉCOLE", "école", 0},
        {"ΣΊΣΥΦΟΣ", "σίσυφος", 0},     {"K", "\u212A", 0},
        {"admin", "administ", -1},     {"b", "A", 1},
        {"ádmin", "admin", 1},         {"ａｄｍｉｎ", "admin", 1},
        {"adm\u0131n", "admin", 1},    {"ad\u00ADmin", "admin", 1},
        {"e\u0301", "\u00E9", -1},     {"\xFF", "\xFE", 1},
        {"\xFF", "\xFF", 0},           {"\xE9", "\uFFFD", 1},
        {"caf\xC3", "caf\xC3\xA9", 1},
    };
    for (const auto &[one, other, result] : cases) {
        EXPECT_EQ(KLIBCUnicodeUTF8StrCaseCmp(one, other), result) << one << " " << other;
        EXPECT_EQ(KLIBCUnicodeUTF8StrCaseCmp(other, one), -result) << other << " " << one;
    }
    EXPECT_EQ(KLIBCUnicodeUTF8StrCaseCmp(nullptr, nullptr), 0);
    EXPECT_LT(KLIBCUnicodeUTF8StrCaseCmp(nullptr, ""), 0);
    EXPECT_GT(KLIBCUnicodeUTF8StrCaseCmp("", nullptr), 0);
}

}  // namespace
