/* Actions that show the songs, and one that shows who may what. */
#pragma once

#include "action.h"

namespace webapi {

class RightsAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class SongsAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class BrowseAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class RandomAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

}  // namespace webapi
