/* The mounts of the system, and what each is. */
#pragma once

#include <chrono>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>

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
     * folderLifetime: how long it is remembered where links lead, and what is mounted. */
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

    /* A folder that was asked about: the songs of a playlist lie in a few. */
    struct Folder {
        bool isThere = false;
        std::string realPath;  // "" for the root
        Mounts::value_type *mount = nullptr;
        int timesAsked = 0;
        std::unordered_set<std::string> links;  // names, once it was asked often
    };

    bool refresh();
    void addMount(std::string_view line);
    static bool isPlain(std::string_view path);
    Mounts::value_type *mountOfPlain(const std::string &path);
    Folder &folderOf(const std::string &path);
    static bool isLinkIn(Folder &folder, const std::string &path, const std::string &name);
    Mounts::value_type *mountAbove(std::string realPath);
    int typeOf(const Mount &mount) const;
    bool isOnUsb(const std::string &device, int depth) const;

    const std::unique_ptr<MountSource> source_;
    const std::string blockDevices_;
    const std::chrono::milliseconds folderLifetime_;
    std::mutex mutex_;
    Mounts mounts_;
    std::unordered_map<std::string, Folder> folders_;
    std::chrono::steady_clock::time_point foldersEnd_;
};

}  // namespace zano::volumes
