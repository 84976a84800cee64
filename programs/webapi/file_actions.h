/* Actions on the songs' files. */
#pragma once

#include "action.h"

namespace webapi {

class MimetypeAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class StreamAction : public Action {
  public:
    using Action::Action;

  private:
    void respond() override;
};

}  // namespace webapi
