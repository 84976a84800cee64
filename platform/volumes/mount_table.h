/* The mounts of the system, and what each is. */
#pragma once

#include <chrono>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>

namespace zano::volumes {

struct Volume {
    std::string mountPoint;
    int type;  // VOLUME_TYPE_*
};

/* Where the table of mounts comes from. */
class MountSource {
  public:
    virtual ~MountSource() = default;
    MountSource(const MountSource &) = delete;
    MountSource &operator=(const MountSource &) = delete;

    /* Whether the mounts changed since contents(); true before its first call. Cheap. */
    virtual bool hasChanged() = 0;
    /* Lines as in /proc/self/mountinfo, see proc(5); null when they cannot be read. */
    virtual std::optional<std::string> contents() = 0;

  protected:
    MountSource() = default;
};

/* The mounts of this process, kept open: the kernel tells through it when they change. */
std::unique_ptr<MountSource> processMounts();

/* Any thread. */
class MountTable {
  public:
    /* blockDevices: a folder of links MAJOR:MINOR to devices, as /sys/dev/block.
     * folderLifetime: how long it is remembered where the links of a folder lead. */
    MountTable(std::unique_ptr<MountSource> source, std::string blockDevices,
               std::chrono::milliseconds folderLifetime)
        : source_(std::move(source)),
          blockDevices_(std::move(blockDevices)),
          folderLifetime_(folderLifetime) {}

    /* The volume that holds an absolute path, or its nearest existing parent; null when the
     * mounts cannot be read. A link leads to the volume that its target is on. */
    std::optional<Volume> volumeOf(const std::string &path);

  private:
    struct Mount {
        std::string device;  // MAJOR:MINOR
        std::string fileSystem;
        std::string source;
        int type = 0;  // 0: not looked at yet
    };
    using Mounts = std::unordered_map<std::string, Mount>;  // by mount point

    bool refresh();
    void addMount(std::string_view line);
    std::string realPathOf(const std::string &path);
    const std::string &realFolder(const std::string &folder);
    Mounts::value_type *mountAbove(std::string realPath);
    int typeOf(const Mount &mount) const;
    bool isOnUsb(const std::string &device, int depth) const;

    const std::unique_ptr<MountSource> source_;
    const std::string blockDevices_;
    const std::chrono::milliseconds folderLifetime_;
    std::mutex mutex_;
    Mounts mounts_;
    /* The songs of a playlist lie in a few folders. "" for the root. */
    std::unordered_map<std::string, std::string> realFolders_;
    std::chrono::steady_clock::time_point foldersEnd_;
};

}  // namespace zano::volumes
