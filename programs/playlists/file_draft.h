/* The next contents of a file, kept beside it until they are complete.
 *
 * The library rewrites files in place. So programs have a draft written instead, a hidden file in
 * the same folder (".Road.vorelix.m3u" for Road.m3u), and rename it. Whatever happens meanwhile,
 * the file is the old one or the new one.
 *
 * The draft is the lock too: who has locked it (an open file description lock) may write it and
 * the file. What a killed program leaves behind is unlocked, and the next draft takes its place.
 */
#pragma once

#include <sys/types.h>
#include <chrono>
#include <functional>
#include <string>
#include <string_view>

namespace vorelix {

/* When a program stops waiting for others, and the pause between two looks. */
using Deadline = std::chrono::steady_clock::time_point;
Deadline deadlineOf(int seconds);
inline constexpr auto kPause = std::chrono::milliseconds(10);

/* What errno means, in the system's words. */
std::string reasonOf(int error);

/* The path that a rename may go to: of a link what it leads to. */
std::string withoutLinks(const std::string &path);

/* What is left of a mode in a file that this process makes. */
mode_t modeOfNewFile(mode_t mode);

class FileDraft {
  public:
    /* Waits until nobody else has a draft of the file (absolute path), which need not be there.
     * Throws Failure when the deadline passes, and when the folder cannot be written. */
    FileDraft(const std::string &file, Deadline deadline);

    /* Takes the draft away unless it became the file. */
    ~FileDraft();
    FileDraft(const FileDraft &) = delete;
    FileDraft &operator=(const FileDraft &) = delete;

    const std::string &path() const { return path_; }

    /* Replaces what the draft has. Throws Failure for a full disk. */
    void fill(std::string_view contents) const;

    /* Waits for the disk. Owner and mode become those of the file, or the mode `modeOfNew` when
     * there is none. Throws Failure. */
    void complete(mode_t modeOfNew) const;

    /* Throws Failure when no more can be written to the draft: then what is missing in it was not
     * written either. */
    void throwWhenFull() const;

    /* Make it the file, to be called once. The first throws Failure when there is one. */
    void putAsNew();
    void putInPlace();

    /* Has write() complete the draft from what the file holds and puts it in its place; starts
     * again when another program changed the file meanwhile. write() may be called several times;
     * when it returns false there is nothing to change, and so does this. Throws Failure, with the
     * file untouched, when the deadline passes. */
    bool replace(Deadline deadline, const std::function<bool()> &write);

  protected:
    const std::string &file() const { return file_; }

  private:
    void open();
    bool tryLock() const;
    bool isNamed() const;
    bool isUsable() const;
    void settle();
    [[noreturn]] void throwFailure(int error) const;

    std::string file_;
    std::string path_;
    int descriptor_ = -1;
    bool isDone_ = false;
};

}  // namespace vorelix
