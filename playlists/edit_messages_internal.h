/* The log lines of the edits. The numbers, and which of the two prefixes stands in front, are part
 * of the messages. */
#pragma once

#include "edit_internal.h"
#include "playlists_internal.h"

namespace vorelix::playlist {

inline constexpr const char *kBadParameter = "%s (%d) Bad parameter.";
inline constexpr const char *kNotUpdated = "%s (%d) Failed to update playlist.(%s)";
inline constexpr const char *kNoList = "%s (%d) Failed to malloc list.";
inline constexpr const char *kNothingSelected = "%s (%d) There is no selected item.";
inline constexpr const char *kNoRecords = "%s (%d) pMusicRec is null.";
inline constexpr const char *kNotParsed = "%s:%d Failed to parse playlist.";
inline constexpr const char *kNoArray = "%s:%d Failed to calloc()";
// Intended and kept: it says ">" where a start that is equal fails too.
inline constexpr const char *kBadStart = "%s:%d Bad parameters. Start[%d] > TotalRow[%d]";
inline constexpr const char *kMissingBadParameter = "%s:%d Bad parameter.";
inline constexpr const char *kMissingNotWritten = "%s:%d Failed to write playlist.(%s)";

inline constexpr LogMessage<const char *, const char *> kSharedMissingNotParsed{
    kUnit, "%s:%d Parse playlist (%s, %s) return NULL.", 1271};
inline constexpr EditMessages kSharedMessages{
    .removal = {.badParameter{kUnit, kBadParameter, 979},
                .noList{kUnit, kNoList, 992},
                .nothingSelected{kUnit, kNothingSelected, 999},
                .notParsed{kUnit, kNoRecords, 1006},
                .notWritten{kUnit, kNotUpdated, 1042}},
    .update = {.badParameter{kUnit, kBadParameter, 1065},
               .notParsed{kUnit, kNotParsed, 1077},
               .noArray{kUnit, kNoArray, 1090},
               .badStart{kUnit, kBadStart, 1096},
               .notWritten{kUnit, kNotUpdated, 1138}},
    .append = {.badParameter{kUnit, kBadParameter, 1161}, .notWritten{kUnit, kNotUpdated, 1199}},
    .missing = {.badParameter{kUnit, kMissingBadParameter, 1258},
                .notParsed =
                    [](const Playlist &playlist) {
                        kSharedMissingNotParsed(playlist.id, playlist.path);
                    },
                .notWritten{kUnit, kMissingNotWritten, 1296}},
};

inline constexpr LogMessage<const char *> kPersonalMissingNotParsed{
    kUnit, "%s:%d Parse playlist: %s return NULL.", 1598};
inline constexpr EditMessages kPersonalMessages{
    .removal = {.badParameter{kUnit, kBadParameter, 1505},
                .noList{kUnit, kNoList, 1511},
                .nothingSelected{kUnit, kNothingSelected, 1518},
                .notParsed{kUnit, kNoRecords, 1525},
                .notWritten{kUnit, kNotUpdated, 1561}},
    .update = {.badParameter{kUnit, kBadParameter, 1661},
               .notParsed{kUnit, kNotParsed, 1668},
               .noArray{kUnit, kNoArray, 1681},
               .badStart{kUnit, kBadStart, 1687},
               .notWritten{kUnit, kNotUpdated, 1729}},
    .append = {.badParameter{kUnit, kBadParameter, 1438}, .notWritten{kUnit, kNotUpdated, 1471}},
    .missing = {.badParameter{kUnit, kMissingBadParameter, 1592},
                .notParsed =
                    [](const Playlist &playlist) { kPersonalMissingNotParsed(playlist.path); },
                .notWritten{kUnit, kMissingNotWritten, 1623}},
};

}  // namespace vorelix::playlist
