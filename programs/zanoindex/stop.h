/* A wish of the user to stop: Ctrl-C, or the signals that end services and terminals.
 *
 * The first one is noted, and the program ends at the next good moment; the second one ends it
 * at once, which the database survives. */
#pragma once

namespace zano::index {

class StopRequest {
  public:
    /* From now on the signals are noted, but for those that were ignored before. */
    StopRequest();

    /* The signal, 0 while there was none. */
    int signal() const;
    bool isMade() const { return signal() != 0; }

    /* Readable once the request was made; for poll(). */
    int descriptor() const;
};

}  // namespace zano::index
