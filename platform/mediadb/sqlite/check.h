/* Whether a media database in SQLite is sound. */
#pragma once

#include "handle.h"

namespace zano::mediadb::sqlite {

/* As Catalogue::check(), for one moment: within a transaction, which is to be undone, since it has
 * temporary tables then. */
void checkDatabase(Connection &connection);

}  // namespace zano::mediadb::sqlite
