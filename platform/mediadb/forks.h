/* Connections must not be used in a process that was forked off, not even to close them. */
#pragma once

namespace zano::mediadb {

/* How many forks lie between this process and the one that loaded the library. */
unsigned forksSoFar();

}  // namespace zano::mediadb
