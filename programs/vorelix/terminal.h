/* What standard output can show. */
#pragma once

namespace vorelix {

struct Terminal {
    int width = 0;  // cells in a line; 0: no limit
    bool bold = false;
};

/* The terminal's own width, or COLUMNS, or 80. Output that goes elsewhere is cut to COLUMNS when
 * that is set and not at all otherwise. Bold only on a terminal, and not with NO_COLOR or a
 * TERM of "dumb". */
Terminal terminalOfStandardOutput();

}  // namespace vorelix
