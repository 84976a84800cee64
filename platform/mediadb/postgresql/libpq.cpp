#include "libpq.h"

#include <dlfcn.h>
#include <zanoplatform/error.h>

#include <string>

#include "../catalogue.h"

namespace zano::mediadb::postgresql {
namespace {

constexpr const char *kLibrary = "libpq.so.5";

[[noreturn]] void fail() {
    const char *words = dlerror();
    throw DatabaseError(KLIB_ERR_DATABASE_OPEN,
                        std::string("PostgreSQL's client library could not be loaded: ") +
                            (words != nullptr ? words : kLibrary));
}

template <typename Function>
void find(void *library, const char *name, Function &function) {
    function = reinterpret_cast<Function>(dlsym(library, name));
    if (function == nullptr) {
        fail();
    }
}

Libpq load() {
    void *library = dlopen(kLibrary, RTLD_NOW | RTLD_LOCAL);
    if (library == nullptr) {
        fail();
    }
    Libpq made{};
    find(library, "PQclear", made.clear);
    find(library, "PQfinish", made.finish);
    find(library, "PQconnectdbParams", made.connectdbParams);
    find(library, "PQsetNoticeReceiver", made.setNoticeReceiver);
    find(library, "PQstatus", made.status);
    find(library, "PQerrorMessage", made.errorMessage);
    find(library, "PQparameterStatus", made.parameterStatus);
    find(library, "PQresultStatus", made.resultStatus);
    find(library, "PQresultErrorField", made.resultErrorField);
    find(library, "PQexec", made.exec);
    find(library, "PQexecParams", made.execParams);
    find(library, "PQsendQuery", made.sendQuery);
    find(library, "PQsendQueryPrepared", made.sendQueryPrepared);
    find(library, "PQgetResult", made.getResult);
    find(library, "PQenterPipelineMode", made.enterPipelineMode);
    find(library, "PQpipelineSync", made.pipelineSync);
    find(library, "PQexitPipelineMode", made.exitPipelineMode);
    find(library, "PQprepare", made.prepare);
    find(library, "PQdescribePrepared", made.describePrepared);
    find(library, "PQnparams", made.nparams);
    find(library, "PQparamtype", made.paramtype);
    find(library, "PQexecPrepared", made.execPrepared);
    find(library, "PQgetvalue", made.getvalue);
    find(library, "PQgetisnull", made.getisnull);
    find(library, "PQgetlength", made.getlength);
    find(library, "PQfformat", made.fformat);
    find(library, "PQftype", made.ftype);
    find(library, "PQntuples", made.ntuples);
    find(library, "PQputCopyData", made.putCopyData);
    find(library, "PQputCopyEnd", made.putCopyEnd);
    return made;
}

}  // namespace

const Libpq &libpq() {
    static const Libpq functions = load();
    return functions;
}

}  // namespace zano::mediadb::postgresql
