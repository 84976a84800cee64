#include <gtest/gtest.h>
#include <zanoplatform/error.h>
#include <zanoplatform/volumes.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <map>
#include <optional>
#include <utility>
#include <vector>

#include "support/files.h"
#include "volumes/mount_table.h"

namespace zano::volumes {
namespace {

namespace fs = std::filesystem;

struct Script {
    std::optional<std::string> mountInfo;
    bool isChanged = true;
    int reads = 0;
};

class ScriptedMounts : public MountSource {
  public:
    explicit ScriptedMounts(Script &script) : script_(script) {}
    bool hasChanged() override { return script_.isChanged; }
    std::optional<std::string> contents() override {
        ++script_.reads;
        script_.isChanged = false;
        return script_.mountInfo;
    }

  private:
    Script &script_;
};

/* Folders in the place of mounts, and a sysfs of links. */
class MountTableTest : public testing::Test {
  protected:
    MountTableTest() {
        addDevice("8:1", "pci/ata1/block/sda/sda1");
        addDevice("8:17", "pci/usb2/2-1/host6/block/sdb/sdb1");
        addDevice("253:0", "virtual/block/dm-0");
        addDevice("253:1", "virtual/block/dm-1");
        addSlave("virtual/block/dm-1", "virtual/block/dm-0");
        addSlave("virtual/block/dm-0", "pci/usb2/2-1/host6/block/sdb/sdb1");
        for (const char *folder :
             {"disk/music/a", "usb/music", "my usb", "crypt", "share", "net", "usbx", "unknown"}) {
            fs::create_directories(at(folder));
        }
        fs::create_directory_symlink(at("usb"), at("disk/link"));
        fs::create_symlink(at("usb/gone.mp3"), at("disk/music/dangling.mp3"));
        std::ofstream(at("usb/music/b.mp3"));
        fs::create_symlink(at("usb/music/b.mp3"), at("disk/music/b.mp3"));
        mount("8:1", "", "ext4", "/dev/sda1");
        mount("8:1", "/disk", "ext4", "/dev/sda1");
        mount("8:1", "/usb", "ext4", "/dev/hidden");
        mount("8:17", "/usb", "vfat", "/dev/sdb1");
        mount("8:17", "/my\\040usb", "vfat", "/dev/sdb1");
        mount("253:1", "/crypt", "ext4", "/dev/mapper/x");
        mount("0:50", "/share", "nfs4", "nas:/music");
        mount("0:51", "/net", "fuse.sshfs", "me@nas:");
        mount("0:52", "/unknown", "btrfs", "/dev/none");
        script_.mountInfo->append("a line of another kind\n99 1 8:1\n");
    }

    std::string at(const std::string &path) const { return folder_.path(path); }

    void mount(const std::string &device, const std::string &point, const std::string &type,
               const std::string &source) {
        script_.mountInfo = script_.mountInfo.value_or("") + "36 35 " + device + " / " + root_ +
                            point + " rw,noatime master:1 - " + type + " " + source + " rw\n";
        script_.isChanged = true;
    }
    void addDevice(const std::string &number, const std::string &device) const {
        fs::create_directories(at("sys/devices/" + device));
        fs::create_directories(at("sys/dev/block"));
        fs::create_directory_symlink("../../devices/" + device, at("sys/dev/block/" + number));
    }
    void addSlave(const std::string &device, const std::string &slave) const {
        fs::create_directories(at("sys/devices/" + device + "/slaves"));
        fs::create_directory_symlink(
            at("sys/devices/" + slave),
            at("sys/devices/" + device + "/slaves/") + fs::path(slave).filename().string());
    }

    /* "TYPE MOUNT POINT" below the root. */
    std::string volume(const std::string &path) {
        if (!table_) {
            table_.emplace(std::make_unique<ScriptedMounts>(script_), at("sys/dev/block"),
                           lifetime_);
        }
        const auto found = table_->volumeOf(path);
        if (!found) {
            return "none";
        }
        const std::string point = found->mountPoint;
        return std::to_string(found->type) + " " +
               (point.substr(0, root_.size()) == root_ ? point.substr(root_.size()) : point);
    }

    Script script_;
    const files::Folder folder_;
    const std::string root_ = fs::path(folder_.path("x")).parent_path();
    std::chrono::milliseconds lifetime_{0};

  private:
    std::optional<MountTable> table_;
};

TEST_F(MountTableTest, PathsBelongToTheLongestMountThatHoldsThem) {
    const std::map<std::string, std::vector<const char *>> volumes = {
        {"1 /disk",
         {"disk/music/a/x.mp3", "disk", "disk/", "disk/none/none/none/x.mp3",
          "usb/music/../../disk/a.mp3", "disk/music/dangling.mp3"}},
        {"4 /usb",
         {"usb/music/b.mp3", "usb/music/none.mp3", "usb", "disk/link/music/b.mp3",
          "disk/link/none/b.mp3", "disk/music/b.mp3", "disk/music/a/../b.mp3"}},
        {"1 ", {"usbx/a.mp3", "usb-none/a.mp3", "disk/link/.."}},
        {"4 /my usb", {"my usb/a.mp3"}},
        {"4 /crypt", {"crypt/a.mp3"}},
        {"2 /share", {"share/a.mp3"}},
        {"2 /net", {"net/a.mp3"}},
        {"1 /unknown", {"unknown/a.mp3"}},
    };
    // Through links too; one without a target does not exist. Remembered, from the second round on
    // after many neighbours.
    lifetime_ = std::chrono::hours(1);
    for (int round = 0; round < 20; ++round) {
        for (const auto &[expected, paths] : volumes) {
            for (const std::string path : paths) {
                EXPECT_EQ(volume(at(path)), expected) << path;
                EXPECT_EQ(volume(at(path)), expected) << path << " again";
            }
        }
    }
    EXPECT_EQ(script_.reads, 1);
}

TEST_F(MountTableTest, ANeighbourThatIsALinkOrAMountIsNotTakenForItsFolder) {
    mount("8:17", "/disk/music/a", "vfat", "/dev/sdb1");
    EXPECT_EQ(volume(at("disk/music/x.mp3")), "1 /disk");
    EXPECT_EQ(volume(at("disk/music/b.mp3")), "4 /usb");
    EXPECT_EQ(volume(at("disk/music/a")), "4 /disk/music/a");
}

TEST_F(MountTableTest, AFolderIsRememberedForItsLifetime) {
    EXPECT_EQ(volume(at("disk/link/x.mp3")), "4 /usb");
    fs::remove(at("disk/link"));
    fs::create_directory_symlink(at("crypt"), at("disk/link"));
    EXPECT_EQ(volume(at("disk/link/x.mp3")), "4 /crypt");
}

TEST_F(MountTableTest, DevicesAreLookedAtOnceUntilTheMountsChange) {
    EXPECT_EQ(volume(at("usb/music/b.mp3")), "4 /usb");
    fs::remove(at("sys/dev/block/8:17"));
    EXPECT_EQ(volume(at("usb/music/b.mp3")), "4 /usb");
    mount("8:1", "/usb", "ext4", "/dev/sda1");
    EXPECT_EQ(volume(at("usb/music/b.mp3")), "1 /usb");
    EXPECT_EQ(script_.reads, 2);
}

TEST_F(MountTableTest, MountsThatCannotBeReadAreAFailureUntilTheyCan) {
    const auto mounts = std::exchange(script_.mountInfo, std::nullopt);
    EXPECT_EQ(volume(at("usb")), "none");
    script_.mountInfo = mounts;
    script_.isChanged = true;
    EXPECT_EQ(volume(at("usb")), "4 /usb");
    EXPECT_EQ(volume("/"), "none") << "no mount holds it here";
}

TEST(VolumePathParse, FillsTheRecordForThisSystemsMounts) {
    VOLUME_INFO volume{};
    for (const char *path : {"/proc/self/status", "/proc/none/none", "/proc"}) {
        ASSERT_EQ(VolumePathParse(path, &volume), 0) << path;
        EXPECT_STREQ(volume.mountPoint, "/proc");
        EXPECT_EQ(volume.type, VOLUME_TYPE_INTERNAL);
        EXPECT_EQ(volume.size, 4104);
    }
    volume.type = 77;
    for (const char *path : {static_cast<const char *>(nullptr), "", "music/a.mp3"}) {
        EXPECT_EQ(VolumePathParse(path, &volume), -1);
        EXPECT_EQ(KLIBCErrGet(), KLIB_ERR_BAD_PARAMETER);
    }
    EXPECT_EQ(VolumePathParse("/", nullptr), -1);
    EXPECT_EQ(volume.type, 77);
}

}  // namespace
}  // namespace zano::volumes
