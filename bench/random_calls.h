/* Calls of the listing interface as chance makes them, for comparing engines over the songs of the
 * generator. */
#pragma once

#include <string>

namespace zano::bench {

struct Call {
    std::string select;
    std::string condition;
    std::string distinct;
    std::string order;
    int offset = 0;
    int limit = 0;

    std::string text() const;
};

/* The call of a number: always the same one, over a catalogue of so many songs. */
Call randomCall(unsigned number, int songs);

/* All rows of the call in the database that the settings name, with every field, one a line, and
 * the total where the interface gives one; or why it failed. */
std::string answerOf(const Call &call);

}  // namespace zano::bench
