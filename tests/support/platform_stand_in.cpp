// This file defines what a fortified build would turn into other calls.
#undef _FORTIFY_SOURCE

#include "support/platform_stand_in.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <syslog.h>
#include <unistd.h>
#include <zanoplatform/error.h>
#include <zanoplatform/media_database.h>
#include <zanoplatform/playlist_parser.h>
#include <zanoplatform/sql_escape.h>
#include <zanoplatform/strings.h>
#include <zanoplatform/volumes.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <memory>
#include <string_view>
#include <utility>

namespace {

struct OpenResult {
    MEDIA_DB_RESULT handle{};
    std::size_t nextRow = 0;
};

stand_in::Script theScript;
std::string theTrace;
std::map<MEDIA_DB_RESULT *, std::unique_ptr<OpenResult>> openResults;

void note(const std::string &line) {
    theTrace += line + "\n";
}

std::string quoted(const char *text) {
    return text != nullptr ? '"' + std::string(text) + '"' : "null";
}

/* What a child process notes: memory that it shares with this one. */
constexpr std::size_t kChildNoteSize = 8192;
char *childNote() {
    static void *const kShared =
        mmap(nullptr, kChildNoteSize, PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    EXPECT_NE(kShared, MAP_FAILED);
    return static_cast<char *>(kShared);
}

std::string rowText(const ZANO_MEDIA_INFO *row) {
    return std::to_string(row->id) + " " + row->title + " " + row->path;
}

ZANO_PLAYLIST_REC *parsed(const std::string &playlist, int *total, int third, int fourth,
                          const char *fields, int last) {
    note("parse(" + playlist + ", " + std::to_string(third) + ", " + std::to_string(fourth) + ", " +
         quoted(fields) + ", " + std::to_string(last) + ")");
    ZANO_PLAYLIST_REC *list = nullptr;
    ZANO_PLAYLIST_REC **tail = &list;
    for (const ZANO_MEDIA_INFO &entry : theScript.entries) {
        *tail = static_cast<ZANO_PLAYLIST_REC *>(std::calloc(1, sizeof(ZANO_PLAYLIST_REC)));
        (*tail)->info = entry;
        tail = &(*tail)->next;
    }
    *total = static_cast<int>(theScript.entries.size()) - theScript.missingFromTotal;
    return list;
}

template <typename Function>
Function *platformFunction(Function *, const char *name) {
    return reinterpret_cast<Function *>(dlsym(RTLD_NEXT, name));
}

}  // namespace

// How this file calls the function that it stands in for.
#define REAL(name) platformFunction(&(name), #name)

namespace stand_in {

Script &script() {
    return theScript;
}

std::string takeTrace() {
    return std::exchange(theTrace, {});
}

std::string outcome(int result) {
    return std::to_string(result) + " " + takeTrace();
}

int takeOpenResults() {
    const int count = static_cast<int>(openResults.size());
    openResults.clear();
    return count;
}

ZANO_MEDIA_INFO row(int id, const std::string &title) {
    ZANO_MEDIA_INFO row{};
    row.id = id;
    title.copy(row.title, sizeof row.title - 1);
    ("/volume1/music/" + title).copy(row.path, sizeof row.path - 1);
    return row;
}

std::string bytes(const ZANO_MEDIA_INFO &row) {
    return {reinterpret_cast<const char *>(&row), sizeof row};
}

std::string textOf(const ZANO_PLAYLIST_REC *list) {
    std::string text;
    for (const ZANO_PLAYLIST_REC *node = list; node != nullptr; node = node->next) {
        text += (text.empty() ? "" : ", ") + std::to_string(node->info.id) + " " + node->info.title;
    }
    return text;
}

std::string textOf(const ZANO_PLAYLIST *list) {
    std::string text;
    for (const ZANO_PLAYLIST *node = list; node != nullptr; node = node->next) {
        text += std::to_string(node->id) + " " + node->title + " " + node->album + " " +
                node->path + "\n";
    }
    return text;
}

Test::Test() {
    theScript = Script();
    *childNote() = '\0';
    theTrace.clear();
}

void Test::TearDown() {
    EXPECT_EQ(takeOpenResults(), 0);
}

}  // namespace stand_in

MEDIA_DB_RESULT *MediaInfoDBOpen(int table, const char *select, const char *condition,
                                 const char *distinct, const char *orderBy, int offset, int limit,
                                 int flag) {
    note("open(" + std::to_string(table) + ", " + quoted(select) + ", " + quoted(condition) + ", " +
         quoted(distinct) + ", " + quoted(orderBy) + ", " + std::to_string(offset) + ", " +
         std::to_string(limit) + ", " + std::to_string(flag) + ")");
    if (theScript.openFails) {
        return nullptr;
    }
    auto result = std::make_unique<OpenResult>();
    MEDIA_DB_RESULT *const handle = &result->handle;
    handle->rowCount = theScript.rowCount;
    openResults[handle] = std::move(result);
    return handle;
}

int MediaInfoDBGet(MEDIA_DB_RESULT *result, ZANO_MEDIA_INFO *row) {
    OpenResult &open = *openResults.at(result);
    if (open.nextRow == theScript.rows.size()) {
        return -1;
    }
    *row = theScript.rows[open.nextRow++];
    return 0;
}

void MediaInfoDBClose(MEDIA_DB_RESULT *result) {
    note(openResults.erase(result) == 1 ? "close" : "close of a result that is not open");
}

int MediaInfoDBGetCount(int table, const char *countExpression, const char *condition, int fourth,
                        int fifth) {
    note("count(" + std::to_string(table) + ", " + quoted(countExpression) + ", " +
         quoted(condition) + ", " + std::to_string(fourth) + ", " + std::to_string(fifth) + ")");
    return theScript.count;
}

int MediaInfoDBSave(int table, const ZANO_MEDIA_INFO *row) {
    note("save(" + std::to_string(table) + ", " + rowText(row) + ")");
    return theScript.saved;
}

int MediaInfoDBUpdate(int table, const ZANO_MEDIA_INFO *row) {
    note("update(" + std::to_string(table) + ", " + rowText(row) + ")");
    return theScript.updated;
}

int MediaInfoDBDelete(int table, const char *path) {
    note("delete(" + std::to_string(table) + ", " + quoted(path) + ")");
    return theScript.deleted;
}

int KLIBZanoFileIndexAdd(const char *path, const char *formerPath, int operation) {
    // What a child noted in the meantime.
    theTrace += childNote();
    *childNote() = '\0';
    note("notice(" + quoted(path) + ", " + quoted(formerPath) + ", " + std::to_string(operation) +
         ")");
    return theScript.noticed;
}

ZANO_PLAYLIST_REC *ParsePlayListByField(const char *id, int *total, int third, int fourth,
                                        const char *fields, int last) {
    return parsed("id " + quoted(id), total, third, fourth, fields, last);
}

ZANO_PLAYLIST_REC *ParsePlayListByFieldGivenPath(const char *path, int *total, int third,
                                                 int fourth, const char *fields, int last) {
    return parsed(quoted(path), total, third, fourth, fields, last);
}

int VolumePathParse(const char *path, VOLUME_INFO *volume) {
    const bool isUsb = std::string_view(path).starts_with("/usb/");
    volume->type = isUsb ? VOLUME_TYPE_USB : theScript.volumeType;
    return theScript.volumeResult;
}

char *KLIBCStrGet(const char *format, ...) {
    if (theScript.textFails) {
        return nullptr;
    }
    va_list arguments;
    va_start(arguments, format);
    char *text = nullptr;
    EXPECT_NE(vasprintf(&text, format, arguments), -1);
    va_end(arguments);
    return text;
}

int KLIBCErrGet() {
    return KLIB_ERR_OUT_OF_MEMORY;
}

int ZANODBEscapeString(char *out, const char *text, int length) {
    return theScript.quotesFail ? -1 : REAL(ZANODBEscapeString)(out, text, length);
}

int ZANODBEscapeBackslash(char *out, int size, const char *text) {
    theScript.backslashSize = size;
    return theScript.backslashesFail ? -1 : REAL(ZANODBEscapeBackslash)(out, size, text);
}

char *ZANODBEscapeStringEX3(int one, const char *pattern, ...) {
    if (one != 1) {
        note("a template whose first argument is " + std::to_string(one));
    }
    if (theScript.templateFails) {
        return nullptr;
    }
    constexpr std::string_view kMarker = "@ZANO:NEVAR";
    const std::string_view rest(pattern);
    std::array<const char *, 5> texts{};
    va_list arguments;
    va_start(arguments, pattern);
    std::size_t used = 0;
    for (std::size_t at = rest.find(kMarker); at != std::string_view::npos;
         at = rest.find(kMarker, at + 1)) {
        texts.at(used++) = va_arg(arguments, const char *);
    }
    va_end(arguments);
    return REAL(ZANODBEscapeStringEX3)(1, pattern, texts[0], texts[1], texts[2], texts[3],
                                       texts[4]);
}

PSZLIST KLIBCSzListAlloc(int capacity) {
    if (capacity != 1024) {
        note("a string list for " + std::to_string(capacity));
    }
    return theScript.stringListFails ? nullptr : REAL(KLIBCSzListAlloc)(capacity);
}

int KLIBCStrSep(const char *text, const char *separator, PSZLIST *list) {
    return theScript.splitFails ? -1 : REAL(KLIBCStrSep)(text, separator, list);
}

void KLIBCSzListSortItems(PSZLIST list, int keepSorted) {
    note("sort(" + std::to_string(list->count) + " items, " + std::to_string(keepSorted) + ")");
    REAL(KLIBCSzListSortItems)(list, keepSorted);
}

// The system's functions by their names in the C library, also as fortified builds call them.
extern "C" {

#define EXPORTED __attribute__((visibility("default")))

__attribute__((format(printf, 2, 0))) static void logged(int priority, const char *format,
                                                         va_list arguments) {
    std::array<char, 32768> text{};
    // glibc's printf knows %m too.
    const int length = std::vsnprintf(text.data(), text.size(), format, arguments);
    ASSERT_LT(static_cast<std::size_t>(length), text.size());
    note(std::to_string(priority) + " " + text.data());
}

EXPORTED void syslog(int priority, const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logged(priority, format, arguments);
    va_end(arguments);
}

EXPORTED __attribute__((format(printf, 3, 4))) void fortifiedSyslog(int priority, int,
                                                                    const char *format,
                                                                    ...) __asm__("__syslog_chk");
void fortifiedSyslog(int priority, int, const char *format, ...) {
    va_list arguments;
    va_start(arguments, format);
    logged(priority, format, arguments);
    va_end(arguments);
}

EXPORTED int flock(int descriptor, int operation) {
    if (operation == LOCK_UN && theScript.unlockFails) {
        errno = EIO;
        return -1;
    }
    return REAL(flock)(descriptor, operation);
}

EXPORTED int execv(const char *program, char *const argv[]) {
    std::string line = "exec " + std::string(program);
    for (; *argv != nullptr; ++argv) {
        line += " " + quoted(*argv);
    }
    line += "\n";
    childNote()[line.copy(childNote(), kChildNoteSize - 1)] = '\0';
    _exit(0);
}

EXPORTED ssize_t readlink(const char *path, char *out, size_t size) {
    if (std::strcmp(path, ZANO_ROOT "/var/services/music") != 0) {
        return readlinkat(AT_FDCWD, path, out, size);
    }
    if (theScript.linkError != 0) {
        errno = theScript.linkError;
        return -1;
    }
    // Without a NUL, as the system does it.
    return static_cast<ssize_t>(theScript.musicRoot.copy(out, size));
}

EXPORTED ssize_t fortifiedReadlink(const char *path, char *out, size_t size,
                                   size_t) __asm__("__readlink_chk");
ssize_t fortifiedReadlink(const char *path, char *out, size_t size, size_t) {
    return readlink(path, out, size);
}

}  // extern "C"
