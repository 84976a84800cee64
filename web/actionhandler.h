/* The base of every action of the web interface, and the JSON in which actions answer:
 *
 *     {"success": true, ...}
 *     {"success": false, "errno": {"section": "playlist", "key": "id", "line": 120}, ...}
 *
 * A program makes one object of its own subclass for each request. The action calls CheckService
 * and stops when that is false, for the browser has its answer then. Otherwise it fills one value,
 * marks it with SetSuccess and, when it failed, SetError, and sends it with one PrintResponse.
 * Nothing is logged. For one thread. C++ only. */
#ifndef VORELIX_WEB_ACTIONHANDLER_H
#define VORELIX_WEB_ACTIONHANDLER_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <json/json.h>
#include <vorelix/export.h>
#include <zanoplatform/settings.h>
#include <zanoplatform/web_output.h>

class VORELIX_API ActionHandler {
  public:
    /* Reads the settings. Answers are kept by no cache. */
    ActionHandler();
    virtual ~ActionHandler();
    ActionHandler(const ActionHandler &) = delete;
    ActionHandler &operator=(const ActionHandler &) = delete;

    /* The action's own work. The library never calls it. */
    virtual void Process() = 0;

    /* Writes the header and then the value, as it is, to standard output
     * (zanoplatform/web_output.h). contentType may not be null. */
    void PrintResponse(Json::Value value, const char *contentType);

    /* Says in value["errno"] where a failure was found: the area, the item in it, and the line of
     * the caller's source. The texts may not be null. "success" is not set. */
    void SetError(Json::Value &value, const char *section, const char *key, int line);

    /* Sets value["success"].
     * Both keep the other members and write over what was set before. A value that is not an
     * object becomes one; so does "errno". They throw std::bad_alloc and nothing else. */
    void SetSuccess(Json::Value &value, bool success);

    /* Whether the audio service is switched on: the setting `runvorelix` is "yes" in capitals or
     * small letters. When it is not, {"success": false} is sent, as plain text. */
    bool CheckService();

  private:
    WebMan output_;
    ZanoConf settings_;
};

#endif
