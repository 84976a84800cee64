/* zanoipod: writes what an iPod has into the lists that libvorelix reads. */
#include <csignal>
#include <exception>
#include <filesystem>
#include <iostream>
#include <string>
#include <vector>

#include "ipod.h"
#include "lists.h"
#include "new_folder.h"
#include "system_paths_internal.h"
#include "text.h"

namespace {

constexpr int kSuccess = 0;
constexpr int kFailure = 1;
constexpr int kUsage = 2;

constexpr const char *kHelp =
    "usage: zanoipod FOLDER\n"
    "\n"
    "Reads the iPod that is attached at FOLDER, or a copy of its file tree, and writes the list "
    "of\n"
    "its tracks and one for each of its playlists into /usr/zano/etc/audio/ipod, in the place of\n"
    "what that has: all of them or, when something fails, none.\n";

/* Whose files are gone, or cannot be named in a list. */
void tellLeftOut(const char *why, const std::vector<std::string> &tracks) {
    for (const std::string &track : tracks) {
        std::cerr << "zanoipod: left out '" << vorelix::printable(track) << "': " << why << "\n";
    }
}

int writeLists(const std::string &folder) {
    const zano::ipod::Contents contents =
        zano::ipod::readIPod(std::filesystem::absolute(folder).lexically_normal());
    std::vector<std::string> refused;
    const zano::ipod::Files files = zano::ipod::listsOf(contents, refused);
    const std::string lists = ZANO_PATH_IPOD_FOLDER;
    zano::ipod::replaceFolder(lists.substr(0, lists.size() - 1), files);
    tellLeftOut("its file is not there", contents.missing);
    tellLeftOut("its path cannot stand in a list", refused);
    const size_t tracks = contents.tracks.size() - refused.size();
    const size_t playlists = files.size() - 1;
    std::cout << tracks << (tracks == 1 ? " track, " : " tracks, ") << playlists
              << (playlists == 1 ? " playlist\n" : " playlists\n") << std::flush;
    return std::cout ? kSuccess : kFailure;
}

}  // namespace

int main(int argc, char **argv) {
    // A limit of file sizes is a failed write, which is cleaned up after.
    std::signal(SIGXFSZ, SIG_IGN);
    const std::vector<std::string> words(argv + 1, argv + argc);
    if (words == std::vector<std::string>{"--help"} || words == std::vector<std::string>{"-h"}) {
        std::cout << kHelp;
        return kSuccess;
    }
    if (words.size() != 1 || words[0].empty() || words[0].front() == '-') {
        std::cerr << "zanoipod: name one folder; see zanoipod --help\n";
        return kUsage;
    }
    try {
        return writeLists(words[0]);
    } catch (const std::exception &error) {
        std::cerr << "zanoipod: " << vorelix::printable(error.what()) << "\n";
        return kFailure;
    }
}
