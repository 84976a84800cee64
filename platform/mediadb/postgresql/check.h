/* Whether a media database in PostgreSQL is sound. */
#pragma once

#include "handle.h"

namespace zano::mediadb::postgresql {

/* As Catalogue::check(), within a transaction of one moment. */
void checkDatabase(Connection &connection);

}  // namespace zano::mediadb::postgresql
