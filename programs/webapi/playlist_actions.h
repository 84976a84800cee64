/* Actions on the shared playlists. */
#pragma once

#include "action.h"

namespace webapi {

class PlaylistsAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class PlaylistAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class PlaylistCreateAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class PlaylistAppendAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class PlaylistRemoveAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class PlaylistMoveAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

class PlaylistDeleteAction : public JsonAction {
  public:
    using JsonAction::JsonAction;

  private:
    Json::Value answer() override;
};

}  // namespace webapi
