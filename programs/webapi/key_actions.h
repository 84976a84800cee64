/* Actions on the custom keys. */
#pragma once

#include "action.h"

namespace webapi {

class KeysAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class KeySetAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

}  // namespace webapi
