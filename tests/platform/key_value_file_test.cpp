#include <gtest/gtest.h>
#include <zanoplatform/error.h>
#include <zanoplatform/key_value_file.h>

#include <algorithm>
#include <filesystem>
#include <string>

#include "settings/key_value_line.h"
#include "support/files.h"
#include "support/process.h"

namespace {

namespace fs = std::filesystem;

constexpr const char *kFormat = "%s=\"%s\"\n";

class KeyValueFile : public testing::Test {
  protected:
    int set(const std::string &key, const std::string &value) const {
        return KLIBCFileSetKeyValue(path().c_str(), key.c_str(), value.c_str(), kFormat);
    }
    std::string path() const { return folder_.path("a.conf"); }
    void expectNothingBeside() const {
        for (const auto &entry : fs::directory_iterator(folder_.path(""))) {
            EXPECT_EQ(entry.path(), path());
        }
    }

    const files::Folder folder_;
};

TEST_F(KeyValueFile, ChangesTheLinesOfTheKeyAndNoOther) {
    const std::pair<std::string, std::string> cases[] = {
        {"", "k=\"v\"\n"},
        {"a=\"1\"\nb=2", "a=\"1\"\nb=2\nk=\"v\"\n"},
        {"\r\n\n", "\r\n\nk=\"v\"\n"},
        {"# k=\"0\"\n\n  k =0\t\r\n#", "# k=\"0\"\n\nk=\"v\"\n#"},
        {"k=1\nkk=2\nx=k=3\nk=4", "k=\"v\"\nkk=2\nx=k=3\nk=\"v\"\n"},
        {"K=1\nk\nk k=2\n=k\n", "K=1\nk\nk k=2\n=k\nk=\"v\"\n"},
        {std::string("a\0k=1\nk=\0\n", 11), std::string("a\0k=1\nk=\"v\"\n", 13)},
        {"k=\"v\"\nlast", "k=\"v\"\nlast"},
    };
    for (const auto &[before, after] : cases) {
        files::write(path(), before);
        EXPECT_EQ(set("k", "v"), 0) << before;
        EXPECT_EQ(files::read(path()), after) << before;
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_NONE);
    }
    expectNothingBeside();
    EXPECT_EQ(KLIBCFileSetKeyValue(path().c_str(), "p", "50%s", "%s = %s%%\n"), -1);
    EXPECT_EQ(KLIBCFileSetKeyValue(path().c_str(), "p", "50%s", "%%%s=%s\n"), -1);
    EXPECT_EQ(KLIBCFileSetKeyValue(path().c_str(), "p", "50%s", "%s = %s\n"), 0);
    EXPECT_EQ(files::read(path()), "k=\"v\"\nlast\np = 50%s\n");
}

TEST_F(KeyValueFile, MakesAFileThatIsMissingForAllToRead) {
    EXPECT_EQ(set("k", ""), 0);
    EXPECT_EQ(files::read(path()), "k=\"\"\n");
    EXPECT_EQ(fs::status(path()).permissions() | fs::perms::group_read | fs::perms::others_read,
              fs::perms(0644));
    fs::permissions(path(), fs::perms(0660));
    EXPECT_EQ(set("k", "2"), 0);
    EXPECT_EQ(fs::status(path()).permissions(), fs::perms(0660));
}

TEST_F(KeyValueFile, GivesBackEveryValueThatItTakes) {
    for (const std::string &value :
         {std::string("\""), std::string("\"\""), std::string("say \"hi\""), std::string(" a\t"),
          std::string("#=\\'%s"), std::string("Ærø\xff\r."), std::string("'; rm -rf"),
          std::string(1023 - 4, 'a')}) {
        files::write(path(), "before=1\n");
        EXPECT_EQ(set("k", value), 0) << value;
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_NONE) << value;
        const std::string text = files::read(path());
        std::string_view rest = text;
        EXPECT_EQ(zano::settings::takeLine(rest), "before=1\n");
        EXPECT_EQ(zano::settings::readKeyValue(zano::settings::takeLine(rest))->value, value);
    }
}

TEST_F(KeyValueFile, RefusesWhatWouldNotBeReadAgain) {
    files::write(path(), "k=1\n");
    for (const char *key : {"", " k", "k ", "k=", "#k", "a\nk"}) {
        EXPECT_EQ(set(key, "v"), -1) << key;
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_BAD_PARAMETER) << key;
    }
    for (const std::string &value : {std::string("a\nb"), std::string("\n"), std::string("a\r\n"),
                                     std::string(4000, 'a'), std::string(1023 - 3, 'a')}) {
        EXPECT_EQ(set("k", value), -1) << value;
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_BAD_PARAMETER) << value;
    }
    const std::string file = path();
    for (const char *format : {"", "%s\n", "%s=%s", "%s=%s%s\n", "%s=%d\n", "%s=%n%s\n", "%s=%s\n%",
                               "%s=%s\n\n", "%2$s=%1$s\n", "%s=x%s\n"}) {
        EXPECT_EQ(KLIBCFileSetKeyValue(file.c_str(), "k", "v", format), -1) << format;
    }
    EXPECT_EQ(KLIBCFileSetKeyValue(file.c_str(), "k", "\"v\"", "%s=%s\n"), -1);
    EXPECT_EQ(KLIBCFileSetKeyValue(nullptr, "k", "v", kFormat), -1);
    EXPECT_EQ(KLIBCFileSetKeyValue(file.c_str(), nullptr, "v", kFormat), -1);
    EXPECT_EQ(KLIBCFileSetKeyValue(file.c_str(), "k", nullptr, kFormat), -1);
    EXPECT_EQ(KLIBCFileSetKeyValue(file.c_str(), "k", "v", nullptr), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_BAD_PARAMETER);
    EXPECT_EQ(files::read(path()), "k=1\n");
}

TEST_F(KeyValueFile, FollowsALinkAndPassesOverWhatAKilledProcessLeft) {
    fs::create_directory(folder_.path("real"));
    files::write(folder_.path("real/b.conf"), "k=1\n");
    fs::create_symlink("real/b.conf", path());
    fs::create_symlink("../victim", folder_.path("real/b.conf.new"));
    EXPECT_EQ(set("k", "2"), 0);
    EXPECT_TRUE(fs::is_symlink(path()));
    EXPECT_EQ(files::read(folder_.path("real/b.conf")), "k=\"2\"\n");
    EXPECT_FALSE(fs::exists(folder_.path("victim")));
    EXPECT_FALSE(fs::exists(fs::symlink_status(folder_.path("real/b.conf.new"))));
}

TEST_F(KeyValueFile, SaysWhatCannotBeReadAndLeavesIt) {
    EXPECT_EQ(KLIBCFileSetKeyValue(folder_.path("none/a").c_str(), "k", "v", kFormat), -1);
    EXPECT_EQ(KLIBCErrTextGet(),
              "cannot open the folder " + folder_.path("none") + ": No such file or directory");
    ASSERT_EQ(mkfifo(path().c_str(), 0644), 0);
    EXPECT_EQ(set("k", "v"), -1);
    EXPECT_STREQ(KLIBCErrTextGet(), "a.conf is not a file");
    fs::remove(path());
    fs::create_directory(path());
    EXPECT_EQ(set("k", "v"), -1);
    EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_FILE_FAILED);
    fs::remove(path());
    files::write(path(), std::string(1048577, '\n'));
    EXPECT_EQ(set("k", "v"), -1);
    EXPECT_STREQ(KLIBCErrTextGet(), "a.conf is larger than 1 MiB");
    expectNothingBeside();
}

TEST_F(KeyValueFile, StaysOnAFullDisk) {
    const std::string before = "k=1\n" + std::string(5000, '#') + "\n";
    files::write(path(), before);
    {
        const files::FullDisk disk(4096);
        EXPECT_EQ(set("k", "2"), -1);
    }
    EXPECT_STREQ(KLIBCErrTextGet(), "cannot write a.conf.new: File too large");
    EXPECT_EQ(files::read(path()), before);
    expectNothingBeside();
}

TEST_F(KeyValueFile, LosesNoChangeOfTwoProcessesAtOnce) {
    constexpr int kChanges = 100;
    files::write(path(), "# here since the beginning\n");
    process::runAtOnce(2, [this](int child) {
        int failures = 0;
        for (int change = 0; change < kChanges; ++change) {
            failures -= set(std::to_string(child) + "_" + std::to_string(change), "x");
        }
        return failures;
    });
    const std::string text = files::read(path());
    EXPECT_TRUE(text.starts_with("# here since the beginning\n"));
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 2 * kChanges + 1);
    for (int change = 0; change < kChanges; ++change) {
        for (const char *child : {"0_", "1_"}) {
            const std::string line = child + std::to_string(change) + "=\"x\"\n";
            EXPECT_NE(text.find("\n" + line), std::string::npos) << line;
        }
    }
    expectNothingBeside();
}

}  // namespace
