// This file defines what a fortified build would turn into other calls.
#undef _FORTIFY_SOURCE

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vorelix/users/audiousers.h>

#include <csignal>
#include <random>
#include <thread>
#include <utility>

#include "support/files.h"
#include "support/platform_stand_in.h"

namespace {

bool diesAmidWrite = false;

}  // namespace

// Takes the place of the system's function for this program.
extern "C" __attribute__((visibility("default"))) ssize_t write(int file, const void *text,
                                                                size_t size) {
    if (diesAmidWrite) {
        syscall(SYS_write, file, text, size / 2);
        raise(SIGKILL);
    }
    return syscall(SYS_write, file, text, size);
}

namespace {

namespace fs = std::filesystem;
using files::Folder;

class UsersFile : public stand_in::Test {
  protected:
    const Folder folder_;
    const std::string path_ = folder_.path("users");
};

std::string asText(AudioUsers &users) {
    const Folder folder;
    EXPECT_TRUE(users.Save(folder.path("users")));
    return files::read(folder.path("users"));
}

TEST_F(UsersFile, IsReplacedWholeAndForAllToRead) {
    AudioUsers users;
    users.SetUser(1024, 31);
    files::write(path_, "before");
    EXPECT_TRUE(users.Save(path_));
    EXPECT_EQ(
        files::read(path_),
        "{\n   \"1024\" : {\n      \"editsong\" : true,\n      \"playlist\" : true,\n"
        "      \"streaming\" : true,\n      \"upnp\" : true,\n      \"usb\" : true\n   }\n}\n");
    EXPECT_FALSE(fs::exists(path_ + ".tmp"));
    const mode_t mask = umask(0);
    EXPECT_TRUE(users.Save(folder_.path("new")));
    umask(mask);
    EXPECT_EQ(fs::status(folder_.path("new")).permissions(), fs::perms(0644));
    EXPECT_EQ(stand_in::takeTrace(), "");
}

TEST_F(UsersFile, StaysWhenItCannotBeWritten) {
    AudioUsers users;
    files::write(path_, "before");
    fs::create_symlink("/dev/full", path_ + ".tmp");
    EXPECT_FALSE(users.Save(path_));
    EXPECT_EQ(stand_in::takeTrace(),
              "3 audiousers (146) Failed to write " + path_ + ".tmp. (No space left on device)\n");
    EXPECT_TRUE(fs::is_symlink(path_ + ".tmp")) << "the temporary file stays";

    fs::remove(path_ + ".tmp");
    fs::create_directory(path_ + ".tmp");
    EXPECT_FALSE(users.Save(path_));
    EXPECT_EQ(stand_in::takeTrace(),
              "3 audiousers (153) Failed to open " + path_ + ".tmp. (Is a directory)\n");
    EXPECT_EQ(files::read(path_), "before");

    const std::string folder = folder_.path("folder");
    fs::create_directory(folder);
    EXPECT_TRUE(users.Save(folder)) << "the result of the rename is not asked";
    EXPECT_EQ(files::read(folder + ".tmp"), "{}\n");
}

TEST_F(UsersFile, IsNotWrittenThroughDescriptorZero) {
    const int input = dup(STDIN_FILENO);
    close(STDIN_FILENO);
    EXPECT_FALSE(AudioUsers().Save(path_));
    EXPECT_EQ(fcntl(STDIN_FILENO, F_GETFD), -1) << "the descriptor is closed again";
    dup2(input, STDIN_FILENO);
    close(input);
    EXPECT_TRUE(stand_in::takeTrace().starts_with("3 audiousers (153) Failed to open " + path_ +
                                                  ".tmp. ("));
    EXPECT_FALSE(fs::exists(path_));
}

TEST_F(UsersFile, ThatCannotBeReadLeavesTheStoreAsItWas) {
    constexpr std::size_t kLimit = 1048576;
    const std::string parsing = "3 Error: parsing error, reason = ";
    const struct {
        std::string text;
        std::string trace;  // its beginning
    } cases[] = {
        {"", parsing + "* Line 1, Column 1\n  Syntax error: value, object or array expected.\n\n"},
        {R"({"12":{})", parsing + "* Line 1, Column 9\n  Missing ',' or '}'"},
        {"[1,2]", parsing + "The root is not an object.\n\n"},
        {"\"text\"", parsing + "The root is not an object.\n\n"},
        {std::string(2000, '['), parsing},
        {R"({"a":)" + std::string(2000, '['), parsing},
        {std::string("\0{}", 3), parsing},
        {"{}" + std::string(kLimit - 1, ' '), "3 audiousers (184) Can't read file > 1MB.\n"},
    };
    AudioUsers users;
    users.SetUser(5, 1);
    const std::string before = asText(users);
    for (const auto &each : cases) {
        files::write(path_, each.text);
        EXPECT_FALSE(users.Read(path_)) << each.text.substr(0, 20);
        EXPECT_TRUE(stand_in::takeTrace().starts_with(each.trace)) << each.text.substr(0, 20);
        EXPECT_EQ(asText(users), before);
    }
    EXPECT_FALSE(users.Read(folder_.path("missing")));
    EXPECT_EQ(stand_in::takeTrace(), "");
    EXPECT_FALSE(users.Read(path_ + "/below a file"));
    EXPECT_EQ(stand_in::takeTrace(),
              "3 audiousers (174) Failed to open " + path_ + "/below a file. (Not a directory)\n");
    EXPECT_FALSE(users.Read(folder_.path(".")));
    const std::string trace = stand_in::takeTrace();
    EXPECT_TRUE(trace.starts_with("3 audiousers (196) read file failed. (-1) != (")) << trace;
    EXPECT_TRUE(trace.ends_with("), errno=Is a directory\n")) << trace;
    EXPECT_EQ(asText(users), before);
}

TEST_F(UsersFile, MayHoldAMebibyteCommentsAndANul) {
    constexpr std::size_t kLimit = 1048576;
    std::string text = "// by hand\n{\"12\":{\"usb\":true}}";
    text.append(kLimit - text.size(), ' ');
    for (const std::string &each : {text, std::string("{\"12\":{\"usb\":true}}\0junk", 24)}) {
        files::write(path_, each);
        AudioUsers users;
        users.SetUser(5, 1);
        EXPECT_TRUE(users.Read(path_));
        EXPECT_EQ(users.GetUser(12), 1U);
        EXPECT_EQ(users.GetUser(5), 2U) << "what was there before is gone";
    }
    EXPECT_EQ(stand_in::takeTrace(), "");
}

/* Two stores whose files are of some hundred kilobytes, so that writing them takes a while. */
struct TwoStores {
    AudioUsers stores[2];
    std::string texts[2];
    TwoStores() {
        constexpr unsigned int kUsers = 3000;
        for (unsigned int at = 0; at < 2; ++at) {
            for (unsigned int uid = 1; uid <= kUsers; ++uid) {
                stores[at].SetUser(uid, at == 0 ? 31 : 0);
            }
            texts[at] = asText(stores[at]);
        }
    }
};

TEST_F(UsersFile, OfAWriterKilledAmidItsWriteIsTheOneBefore) {
    TwoStores two;
    ASSERT_TRUE(two.stores[0].Save(path_));
    const pid_t child = fork();
    if (child == 0) {
        diesAmidWrite = true;
        two.stores[1].Save(path_);
        _exit(0);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFSIGNALED(status));
    EXPECT_EQ(files::read(path_ + ".tmp").size(), two.texts[1].size() / 2);
    EXPECT_TRUE(files::read(path_) == two.texts[0]);
    EXPECT_TRUE(two.stores[1].Save(path_));
    EXPECT_TRUE(files::read(path_) == two.texts[1]) << "the next save goes over what was left";
}

TEST_F(UsersFile, OfAWriterKilledAtAnyMomentIsOneOfTheTwo) {
    TwoStores two;
    ASSERT_TRUE(two.stores[0].Save(path_));
    const auto seed = std::random_device()();
    std::mt19937 random(seed);
    constexpr int kKills = 50;
    constexpr int kLongestMicroseconds = 60000;
    std::uniform_int_distribution<int> delay(0, kLongestMicroseconds);
    for (int kill = 0; kill < kKills; ++kill) {
        const pid_t child = fork();
        if (child == 0) {
            for (unsigned int save = 1;; ++save) {
                two.stores[save % 2].Save(path_);
            }
        }
        // The moment itself is what is random here.
        std::this_thread::sleep_for(std::chrono::microseconds(delay(random)));
        ASSERT_EQ(::kill(child, SIGKILL), 0);
        ASSERT_EQ(waitpid(child, nullptr, 0), child);
        const std::string text = files::read(path_);
        ASSERT_TRUE(text == two.texts[0] || text == two.texts[1])
            << "seed " << seed << ", kill " << kill << ": " << text.size() << " bytes";
    }
}

}  // namespace
