#include "root.h"

#include <filesystem>
#include <fstream>

#include "system_paths_internal.h"

namespace zano::bench {

std::string prepareRoot(const std::string &location) {
    namespace fs = std::filesystem;
    fs::create_directories(fs::path(ZANO_PATH_CONF).parent_path());
    fs::create_directories(fs::path(ZANO_PATH_MUSIC_LINK).parent_path());
    std::ofstream(ZANO_PATH_CONF) << "mediadb=\"" << location << "\"\n";
    fs::remove(ZANO_PATH_MUSIC_LINK);
    fs::create_symlink("/volume1/music", ZANO_PATH_MUSIC_LINK);
    return ZANO_ROOT;
}

}  // namespace zano::bench
