/* The base of the actions: what each of them has to pass, and how it answers. */
#pragma once

#include <json/value.h>
#include <vorelix/web/actionhandler.h>
#include <memory>

#include "request.h"

namespace webapi {

enum Methods : unsigned {
    kGet = 1U << 0,
    kHead = 1U << 1,
    kPost = 1U << 2,
    kRead = kGet | kHead,
    kChange = kPost,
    kAnyMethod = kGet | kHead | kPost,
};

/* A row of the table of actions. */
struct ActionKind {
    const char *name;
    unsigned methods;
    unsigned right;  // of AudioUsers; 0: a user is enough
    std::unique_ptr<ActionHandler> (*make)(const ActionKind &kind, const Request &request);
};

/* Lines of a header that come before the library's. Nothing for a status below 300 is needed. */
void writeStatus(int status, const std::string &headers);

class Action : public ActionHandler {
  public:
    /* Both have to outlive the action. */
    Action(const ActionKind &kind, const Request &request) : kind_(kind), request_(request) {}

    /* Answers the request whatever comes of it: the envelope of a failure too, or what
     * CheckService writes. Throws std::bad_alloc at most, with nothing written. */
    void Process() final;

  protected:
    const Request &request() const { return request_; }
    const Parameters &parameters() const { return request_.parameters; }

    /* Does the work and answers. May throw as long as nothing was written. */
    virtual void respond() = 0;

  private:
    void require() const;
    void refuse(const Refusal &refusal);

    const ActionKind &kind_;
    const Request &request_;
};

/* An action whose answer is an object in the envelope. */
class JsonAction : public Action {
  public:
    using Action::Action;

  protected:
    void respond() final;

    /* The members of the answer; null for none. */
    virtual Json::Value answer() = 0;
};

}  // namespace webapi
