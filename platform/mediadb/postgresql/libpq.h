/* The functions of libpq that are used, from a library that is loaded when a PostgreSQL database is
 * first asked for: it brings two dozen others along, whose loading would cost every start of a
 * program on SQLite more than all else together. */
#pragma once

#include <libpq-fe.h>

namespace zano::mediadb::postgresql {

struct Libpq {
    decltype(&::PQclear) clear;
    decltype(&::PQfinish) finish;
    decltype(&::PQconnectdbParams) connectdbParams;
    decltype(&::PQsetNoticeReceiver) setNoticeReceiver;
    decltype(&::PQstatus) status;
    decltype(&::PQerrorMessage) errorMessage;
    decltype(&::PQparameterStatus) parameterStatus;
    decltype(&::PQresultStatus) resultStatus;
    decltype(&::PQresultErrorField) resultErrorField;
    decltype(&::PQexec) exec;
    decltype(&::PQexecParams) execParams;
    decltype(&::PQsendQuery) sendQuery;
    decltype(&::PQsendQueryPrepared) sendQueryPrepared;
    decltype(&::PQgetResult) getResult;
    decltype(&::PQenterPipelineMode) enterPipelineMode;
    decltype(&::PQpipelineSync) pipelineSync;
    decltype(&::PQexitPipelineMode) exitPipelineMode;
    decltype(&::PQprepare) prepare;
    decltype(&::PQdescribePrepared) describePrepared;
    decltype(&::PQnparams) nparams;
    decltype(&::PQparamtype) paramtype;
    decltype(&::PQexecPrepared) execPrepared;
    decltype(&::PQgetvalue) getvalue;
    decltype(&::PQgetisnull) getisnull;
    decltype(&::PQgetlength) getlength;
    decltype(&::PQfformat) fformat;
    decltype(&::PQftype) ftype;
    decltype(&::PQntuples) ntuples;
    decltype(&::PQputCopyData) putCopyData;
    decltype(&::PQputCopyEnd) putCopyEnd;
};

/* Throws DatabaseError when the library is not there. It stays until the program ends. */
const Libpq &libpq();

}  // namespace zano::mediadb::postgresql
