/* usage: answer ACTION
 * Answers one request as a CGI program does. */
#include <vorelix/vorelix.h>

#include <cstdio>
#include <functional>
#include <map>
#include <memory>
#include <string>

namespace {

constexpr const char *kJson = "application/json; charset=\"UTF-8\"";

using Work = std::function<void(ActionHandler &, Json::Value &)>;

class Action : public ActionHandler {
  public:
    explicit Action(const Work &work) : work_(work) {}
    ~Action() override { std::fputs("~Action\n", stderr); }
    void Process() override {
        if (!CheckService()) {
            return;
        }
        Json::Value answer;
        work_(*this, answer);
        PrintResponse(answer, kJson);
    }

  private:
    const Work &work_;
};

const std::map<std::string, Work> kActions{
    {"list",
     [](ActionHandler &action, Json::Value &answer) {
         answer["songs"].append("Caf\xC3\xA9 <b>\"\x01");
         answer["songs"].append("bad \xE9\xFF\xC3\" end");
         answer["total"] = 2;
         for (const double number : {5.1, 1.0 / 3, -0.1, 3.0, 123456789.123456, 1e21}) {
             answer["numbers"].append(number);
         }
         action.SetSuccess(answer, true);
     }},
    {"fail",
     [](ActionHandler &action, Json::Value &answer) {
         action.SetSuccess(answer, true);
         action.SetSuccess(answer, false);
         action.SetError(answer, "first", "one", 1);
         answer["errno"]["more"] = true;
         action.SetError(answer, "playlist", "id", 120);
     }},
    {"only_error", [](ActionHandler &action,
                      Json::Value &answer) { action.SetError(answer, "playlist", "id", -1); }},
    {"other_shape",
     [](ActionHandler &action, Json::Value &answer) {
         answer.append("an array");
         action.SetSuccess(answer, false);
         answer["errno"] = "a text";
         action.SetError(answer, "a", "b", 3);
     }},
    {"text",
     [](ActionHandler &action, Json::Value &answer) {
         answer = "a text";
         action.SetError(answer, "a", "b", 3);
     }},
};

}  // namespace

int main(int argc, char **argv) {
    const std::string name = argc == 2 ? argv[1] : "";
    if (name == "cached") {
        WebMan output(true);
        output.WriteHeader("text/plain\r\nSet-Cookie: a=b");
        output.WriteBody(Json::Value());
        return 0;
    }
    const std::unique_ptr<ActionHandler> action = std::make_unique<Action>(kActions.at(name));
    action->Process();
    return 0;
}
