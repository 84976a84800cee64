#include <unistd.h>
#include <vorelix/player/custom_key.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <exception>
#include <fstream>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "custom_key_internal.h"
#include "log_internal.h"
#include "system_paths_internal.h"

using vorelix::LogMessage;
using namespace vorelix::custom_key;

namespace {

constexpr const char *kUnit = "custom_key";
constexpr const char *kBadParameter = "%s:%d Bad parameter.";
constexpr const char *kOutOfRange = "%s:%d Index out of range [%d]";
constexpr const char *kNotLoaded = "%s:%d Failed to get custom json.";
constexpr LogMessage<> kWriteBadParameter{kUnit, kBadParameter, 17};
constexpr LogMessage<const char *> kWriteNotOpened{kUnit, "%s:%d Failed to fopen [%s], [%m]", 24};
constexpr LogMessage<> kNotWritten{kUnit, "%s:%d Failed to fwrite, [%m]", 30};
constexpr LogMessage<> kReadBadParameter{kUnit, kBadParameter, 67};
constexpr LogMessage<const char *> kNoAccess{kUnit, "%s:%d Failed to access json file [%s] %m", 79};
constexpr LogMessage<const char *> kNotOpened{kUnit, "%s:%d Failed to open json file [%s] %m", 87};
constexpr LogMessage<const char *> kNotParsed{kUnit, "%s:%d Failed to parse json file [%s]", 92};
constexpr LogMessage<> kInvalid{kUnit, "%s:%d Invalid json file", 130};

/* The failures that reading and changing a key share. */
struct KeyMessages {
    LogMessage<int> outOfRange;
    LogMessage<> notLoaded;
};
constexpr KeyMessages kGet{{kUnit, kOutOfRange, 120}, {kUnit, kNotLoaded, 125}};
constexpr KeyMessages kSet{{kUnit, kOutOfRange, 151}, {kUnit, kNotLoaded, 156}};

constexpr unsigned kKeyCount = 4;
constexpr const char *kItems = "items";
constexpr const char *kType = "type";
constexpr const char *kValue = "value";
constexpr const char *kTitle = "title";

struct CloseFile {
    void operator()(std::FILE *file) const { std::fclose(file); }
};

Json::ArrayIndex indexOf(int key) {
    return static_cast<unsigned>(key) - 1;
}

bool isObjectOrMissing(const Json::Value &value) {
    return value.isObject() || value.isNull();
}

/* Whether a key can be read: the JSON has the shape that the members below ask for, without which
 * jsoncpp throws. */
bool holdsKeys(const Json::Value &root, Json::ArrayIndex index) {
    return root.isObject() && root[kItems].isArray() && isObjectOrMissing(root[kItems][index]);
}

/* Whether a key can be set: what is missing is made then. */
bool takesKeys(const Json::Value &root, Json::ArrayIndex index) {
    return isObjectOrMissing(root) && (root[kItems].isNull() || holdsKeys(root, index));
}

bool areTexts(const Json::Value &element) {
    for (const char *member : {kType, kValue, kTitle}) {
        if (!element[member].isConvertibleTo(Json::stringValue)) {
            return false;
        }
    }
    return true;
}

/* The writer cuts a name at a NUL, which can make it that of another member. The parser has bounded
 * the depth. */
bool areNamesWhole(const Json::Value &value) {  // NOLINT(misc-no-recursion)
    const auto isWhole = [](const std::string &name) { return name.find('\0') == name.npos; };
    if (value.isObject()) {
        const std::vector<std::string> names = value.getMemberNames();
        if (!std::all_of(names.begin(), names.end(), isWhole)) {
            return false;
        }
    }
    return std::all_of(value.begin(), value.end(), areNamesWhole);
}

/* The file of a key's function with a number that is one. */
bool loadFor(int key, const KeyMessages &messages, Json::Value &root) {
    if (indexOf(key) >= kKeyCount) {
        messages.outOfRange(key);
        return false;
    }
    if (ZANOAudioCustomLoadJson(root) == -1) {
        messages.notLoaded();
        return false;
    }
    return true;
}

int getKey(int key, std::string &type, std::string &value, std::string &title) {
    Json::Value root;
    if (!loadFor(key, kGet, root)) {
        return -1;
    }
    const Json::Value &keys = root;
    if (!holdsKeys(keys, indexOf(key)) || !areTexts(keys[kItems][indexOf(key)])) {
        kInvalid();
        return -1;
    }
    const Json::Value &element = keys[kItems][indexOf(key)];
    std::string texts[] = {element[kType].asString(), element[kValue].asString(),
                           element[kTitle].asString()};
    type = std::move(texts[0]);
    value = std::move(texts[1]);
    title = std::move(texts[2]);
    return 0;
}

int setKey(int key, const std::string &type, const std::string &value, const std::string &title) {
    Json::Value root;
    if (!loadFor(key, kSet, root)) {
        return -1;
    }
    if (!takesKeys(root, indexOf(key)) || !areNamesWhole(root)) {
        kSet.notLoaded();
        return -1;
    }
    Json::Value &element = root[kItems][indexOf(key)];
    element[kType] = type;
    element[kValue] = value;
    element[kTitle] = title;
    return WriteJsonFile(ZANO_PATH_CUSTOM_KEYS, root);
}

}  // namespace

namespace vorelix::custom_key {

Json::Value &BuildDefaultItems(Json::Value &items) {
    items = Json::Value(Json::arrayValue);
    Json::Value item(Json::objectValue);
    item[kType] = "";
    item[kValue] = "";
    item[kTitle] = "";
    for (unsigned position = 1; position <= kKeyCount; ++position) {
        items.append(item)["id"] = position;
    }
    return items;
}

int ReadJsonFile(const char *path, Json::Value &root) {
    if (path == nullptr) {
        kReadBadParameter();
        return -1;
    }
    if (access(path, R_OK) != 0) {
        if (errno != ENOENT) {
            kNoAccess(path);
            return -1;
        }
        if (!root.isObject()) {
            root = Json::Value(Json::objectValue);
        }
        BuildDefaultItems(root[kItems]);
        return 0;
    }
    std::ifstream file(path);
    if (!file) {
        kNotOpened(path);
        return -1;
    }
    Json::Value read;
    if (!Json::Reader().parse(file, read, true)) {
        kNotParsed(path);
        return -1;
    }
    root = std::move(read);
    return 0;
}

int WriteJsonFile(const char *path, const Json::Value &root) {
    if (path == nullptr) {
        kWriteBadParameter();
        return -1;
    }
    const std::string text = Json::StyledWriter().write(root);
    const std::unique_ptr<std::FILE, CloseFile> file(std::fopen(path, "wb"));
    if (file == nullptr) {
        kWriteNotOpened(path);
        return -1;
    }
    // Without a buffer a full disk is seen here, and not when the file is closed, where nobody
    // looks.
    std::setvbuf(file.get(), nullptr, _IONBF, 0);
    if (std::fwrite(text.data(), 1, text.size(), file.get()) < text.size()) {
        kNotWritten();
        return -1;
    }
    return 0;
}

}  // namespace vorelix::custom_key

int ZANOAudioCustomLoadJson(Json::Value &root) {
    try {
        return ReadJsonFile(ZANO_PATH_CUSTOM_KEYS, root);
    } catch (const std::exception &) {
        kNotParsed(ZANO_PATH_CUSTOM_KEYS);
        return -1;
    }
}

int ZANOAudioCustomGet(int key, std::string &type, std::string &value, std::string &title) {
    try {
        return getKey(key, type, value, title);
    } catch (const std::exception &) {
        kGet.notLoaded();
        return -1;
    }
}

int ZANOAudioCustomSet(int key, const std::string &type, const std::string &value,
                       const std::string &title) {
    try {
        return setKey(key, type, value, title);
    } catch (const std::exception &) {
        kSet.notLoaded();
        return -1;
    }
}
