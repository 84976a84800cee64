/* The log lines of the unit musiclib. The numbers are part of the messages. */
#pragma once

#include "log_internal.h"

namespace vorelix::musiclib {

inline constexpr const char *kUnit = "musiclib.cpp";

// ZANOMusicListAll
inline constexpr LogMessage<> kListBadParameter{kUnit, "%s (%d) Bad parameter.", 84};
inline constexpr LogMessage<const char *> kListNoRoot{kUnit, "%s:%d Failed to readlink(%s). [%m]",
                                                      97};
inline constexpr LogMessage<int> kListNoFirstBuffer{kUnit, "%s (%d) Failed to malloc(%d)", 125};
inline constexpr LogMessage<int> kListNoSecondBuffer{kUnit, "%s (%d) Failed to malloc(%d)", 130};
inline constexpr LogMessage<> kListQuotesNotEscaped{kUnit, "%s (%d) Failed to escape condition.",
                                                    134};
inline constexpr LogMessage<> kListBackslashesNotEscaped{
    kUnit, "%s (%d) Failed to escape condition.", 138};
inline constexpr LogMessage<int> kListNoConditionAny{kUnit, "%s (%d) Failed to alloc memory %d",
                                                     145};
inline constexpr LogMessage<int> kListNoConditionColumn{kUnit, "%s (%d) Failed to alloc memory %d",
                                                        152};
inline constexpr LogMessage<int> kListNoNode{kUnit, "%s (%d) Failed to alloc %d", 176};

// ZANOMusicGetPathById
inline constexpr LogMessage<const char *> kPathNoDatabase{
    kUnit, "%s (%d) Failed to open media database (%s).", 231};
inline constexpr LogMessage<> kPathNotEscaped{kUnit, "%s (%d) Failed to escape path.", 237};

// ZANOMusicGetKeyword
inline constexpr LogMessage<const char *> kKeywordNoDatabase{
    kUnit, "%s (%d) Failed to open media database (%s).", 290};
inline constexpr LogMessage<> kKeywordNotEscaped{kUnit, "%s (%d) Failed to escape condition.", 296};

// ZANOMusicBrowse
inline constexpr LogMessage<> kBrowseBadParameter{kUnit, "%s (%d) Bad parameter.", 333};
inline constexpr LogMessage<const char *> kBrowseNoDatabase{
    kUnit, "%s (%d) Failed to open media database (%s).", 340};
inline constexpr LogMessage<int> kBrowseNoNode{kUnit, "%s (%d) Failed to alloc %d", 347};

// ZANOPageTotalRowCount
inline constexpr LogMessage<const char *> kCountNoRoot{kUnit, "%s:%d Failed to readlink(%s). [%m]",
                                                       401};
inline constexpr LogMessage<int> kCountNoBuffer{kUnit, "%s (%d) Failed to malloc(%d)", 430};
inline constexpr LogMessage<> kCountNotEscaped{kUnit, "%s (%d) Failed to escape condition.", 434};
inline constexpr LogMessage<int> kCountNoConditionAny{kUnit, "%s (%d) Failed to alloc memory %d",
                                                      443};
inline constexpr LogMessage<int> kCountNoConditionColumn{kUnit, "%s (%d) Failed to alloc memory %d",
                                                         449};

// ZANOPlaylistDBSave, ZANOPlaylistDBUpdate
inline constexpr LogMessage<> kPlaylistNotInserted{
    kUnit, "%s:%d Failed to insert into playlist table.", 499};
inline constexpr LogMessage<> kPlaylistNotUpdated{kUnit, "%s:%d Failed to update playlist in DB.",
                                                  525};

}  // namespace vorelix::musiclib
