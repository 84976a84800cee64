// This file defines what a fortified build would turn into other calls.
#undef _FORTIFY_SOURCE

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>
#include <vorelix/users/audiousers.h>

#include <csignal>
#include <random>
#include <thread>
#include <utility>

#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"
#include "support/process.h"

namespace {

int writesToDeath = 0;  // the process dies amid the last of so many

}  // namespace

// Takes the place of the system's function for this program.
extern "C" __attribute__((visibility("default"))) ssize_t write(int file, const void *text,
                                                                size_t size) {
    if (writesToDeath > 0 && --writesToDeath == 0) {
        syscall(SYS_write, file, text, size / 2);
        raise(SIGKILL);
    }
    return syscall(SYS_write, file, text, size);
}

namespace {

namespace fs = std::filesystem;
using files::Folder;
using stand_in::outcome;
using stand_in::takeTrace;

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
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(UsersFile, StaysWhenItCannotBeWritten) {
    AudioUsers users;
    files::write(path_, "before");
    fs::create_symlink("/dev/full", path_ + ".tmp");
    EXPECT_EQ(outcome(users.Save(path_)), "0 3 audiousers (146) Failed to write " + path_ +
                                              ".tmp. (No space left on device)\n");
    EXPECT_TRUE(fs::is_symlink(path_ + ".tmp")) << "the temporary file stays";

    fs::remove(path_ + ".tmp");
    fs::create_directory(path_ + ".tmp");
    EXPECT_EQ(outcome(users.Save(path_)),
              "0 3 audiousers (153) Failed to open " + path_ + ".tmp. (Is a directory)\n");
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
    EXPECT_TRUE(takeTrace().starts_with("3 audiousers (153) Failed to open " + path_ + ".tmp. ("));
    EXPECT_FALSE(fs::exists(path_));
}

TEST_F(UsersFile, ThatCannotBeReadLeavesTheStoreAsItWas) {
    constexpr std::size_t kLimit = 1048576;
    const std::string parsing = "3 Error: parsing error, reason = ";
    const std::pair<std::string, std::string> cases[] = {
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
    for (const auto &[text, trace] : cases) {
        files::write(path_, text);
        EXPECT_FALSE(users.Read(path_)) << text.substr(0, 20);
        EXPECT_TRUE(takeTrace().starts_with(trace)) << text.substr(0, 20);
        EXPECT_EQ(asText(users), before);
    }
    EXPECT_FALSE(users.Read(folder_.path("missing")));
    EXPECT_EQ(takeTrace(), "");
    EXPECT_EQ(
        outcome(users.Read(path_ + "/below a file")),
        "0 3 audiousers (174) Failed to open " + path_ + "/below a file. (Not a directory)\n");
    EXPECT_FALSE(users.Read(folder_.path(".")));
    const std::string trace = takeTrace();
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
    EXPECT_EQ(takeTrace(), "");
}

TEST_F(UsersFile, ThatFindsNoRoomIsNotRead) {
    const std::string text(7777, ' ');
    files::write(path_, text + "{}");
    AudioUsers users;
    failing_allocator::failOnSize(text.size() + 3);
    EXPECT_FALSE(users.Read(path_));
    EXPECT_TRUE(failing_allocator::hasFailed());
    EXPECT_EQ(takeTrace(), "3 audiousers (190) Failed to malloc(7779).\n");
    EXPECT_TRUE(users.Read(path_));
}

/* Killed amid each of its writes, the file is some hundred kilobytes long. */
TEST_F(UsersFile, OfAKilledWriterIsTheOneBefore) {
    AudioUsers users;
    EXPECT_TRUE(users.Save(path_));
    for (unsigned int uid = 1; uid <= 3000; ++uid) {
        users.SetUser(uid, 31);
    }
    const std::string after = asText(users);
    int writes = 0;
    for (int status = 128 + SIGKILL; status != 0; ++writes) {
        ASSERT_EQ(status, 128 + SIGKILL);
        EXPECT_TRUE(files::read(path_) == "{}\n") << writes << " writes";
        status = process::statusOf(process::start([&] {
            writesToDeath = writes + 1;
            return users.Save(path_) ? 0 : 1;
        }));
    }
    EXPECT_GT(writes, 1);
    EXPECT_TRUE(files::read(path_) == after) << "the last save goes over what was left";
}

TEST_F(UsersFile, OfAWriterKilledAtAnyMomentIsOneOfTheTwo) {
    AudioUsers users[2];
    std::string texts[2];
    for (unsigned int at = 0; at < 2; ++at) {
        for (unsigned int uid = 1; uid <= 3000; ++uid) {
            users[at].SetUser(uid, at == 0 ? 31 : 0);
        }
        texts[at] = asText(users[at]);
    }
    ASSERT_TRUE(users[0].Save(path_));
    const auto seed = std::random_device()();
    std::mt19937 random(seed);
    for (int kill = 0; kill < 50; ++kill) {
        const pid_t child = process::start([&] {
            for (unsigned int save = 1;; ++save) {
                users[save % 2].Save(path_);
            }
            return 0;
        });
        /* The moment itself is what is random here. */
        std::this_thread::sleep_for(std::chrono::microseconds(random() % 60000));
        ASSERT_EQ(::kill(child, SIGKILL), 0);
        process::statusOf(child);
        const std::string text = files::read(path_);
        ASSERT_TRUE(text == texts[0] || text == texts[1])
            << "seed " << seed << ", kill " << kill << ": " << text.size() << " bytes";
    }
}

}  // namespace
