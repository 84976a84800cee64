/* confmimetype: prints which mime type the files of each extension have. */
#include <exception>
#include <fstream>
#include <iostream>
#include <string>
#include <vector>

#include "mapping.h"
#include "mime_data.h"

namespace {

constexpr int kSuccess = 0;
constexpr int kFailure = 1;
constexpr int kUsage = 2;

constexpr const char *kHelp =
    "usage: confmimetype [FILE...]\n"
    "\n"
    "Prints the mime types of file name extensions, a line for each type:\n"
    "\n"
    "    \"aif aiff\" \"audio/x-aiff\" \"application/octet-stream\"\n"
    "\n"
    "The order is such that a search for the extension of an audio file or of a playlist\n"
    "anywhere in the output finds the line of its type first. libvorelix reads the output from\n"
    "/tmp/mimetype.tmp, and makes that file where it is missing; remove it after a change of\n"
    "the system's types.\n"
    "\n"
    "FILE: a globs2 of the package shared-mime-info, or a mime.types of media-types. By default\n"
    "/usr/share/mime/globs2 and /etc/mime.types, of which one may be missing.\n";

zano::mime::Extensions readExtensions(const std::vector<std::string> &paths) {
    zano::mime::Extensions extensions;
    for (const std::string &path : paths) {
        std::ifstream file(path);
        zano::mime::addExtensions(file, extensions);
    }
    return extensions;
}

int fail(const std::string &what) {
    std::cerr << "confmimetype: " << what << "\n";
    return kFailure;
}

int printMapping(const std::vector<std::string> &paths) {
    const zano::mime::Extensions extensions = readExtensions(paths);
    if (extensions.empty()) {
        std::string list;
        for (const std::string &path : paths) {
            list += " " + path;
        }
        return fail("no mime types in" + list +
                    "; install the package shared-mime-info or media-types");
    }
    const zano::mime::Mapping mapping = zano::mime::makeMapping(extensions);
    if (!(std::cout << mapping.text << std::flush)) {
        return fail("the mapping could not be written");
    }
    for (const std::string &extension : mapping.hidden) {
        fail("a search for \"" + extension + "\" finds the entry of another type");
    }
    return mapping.hidden.empty() ? kSuccess : kFailure;
}

}  // namespace

int main(int argc, char **argv) {
    try {
        std::vector<std::string> paths(argv + 1, argv + argc);
        if (!paths.empty() && (paths[0] == "--help" || paths[0] == "-h")) {
            std::cout << kHelp;
            return kSuccess;
        }
        if (!paths.empty() && paths[0].starts_with('-')) {
            std::cerr << "confmimetype: unknown option " << paths[0]
                      << "; see confmimetype --help\n";
            return kUsage;
        }
        if (paths.empty()) {
            paths = {"/usr/share/mime/globs2", "/etc/mime.types"};
        }
        return printMapping(paths);
    } catch (const std::exception &exception) {
        std::cerr << "confmimetype: " << exception.what() << "\n";
        return kFailure;
    }
}
