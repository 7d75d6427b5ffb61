// An application for the tests: writes down, one JSON line each, what the frame tells it, and does
// what the extra data "do" of a request asks for.
#include <Serialisation.h>
#include <WApp.h>
#include <WWindowController.h>
#include <app.h>
#include <app_control.h>

#include <Elementary.h>

#include <cstdlib>
#include <fcntl.h>
#include <string>
#include <unistd.h>
#include <vector>

namespace
{

// Complete before the next step: whoever waits for that step finds the line.
void record(const std::string &line)
{
    const int fd =
        open(std::getenv("RECORDER_LOG"), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0600);
    const std::string text = line + "\n";
    if (fd < 0 || write(fd, text.data(), text.size()) < 0)
        std::abort();
    close(fd);
}

std::string extra(app_control_h request, const char *key)
{
    char *value = nullptr;
    app_control_get_extra_data(request, key, &value);
    const std::string text = value ? value : "";
    free(value);
    return text;
}

int answer(app_control_h request, app_control_result_e result)
{
    app_control_h reply = nullptr;
    app_control_create(&reply);
    app_control_add_extra_data(reply, "resume_by_app", "1");
    const char *server[] = {"zorp", "second"};
    app_control_add_extra_data_array(reply, "server", server, 2);
    const int code = app_control_reply_to_launch_request(reply, request, result);
    app_control_destroy(reply);
    return code;
}

void onReply(app_control_h request, app_control_h reply, app_control_result_e result, void *)
{
    record("reply " + std::to_string(result) + " " + extra(request, "do") + " " +
           pelliko::platform::extrasToJson(reply));
}

int launchFrom(const std::string &target, const char *task, app_control_reply_cb callback)
{
    app_control_h request = nullptr;
    app_control_create(&request);
    app_control_set_app_id(request, target.c_str());
    app_control_set_operation(request, APP_CONTROL_OPERATION_VIEW);
    app_control_add_extra_data(request, "do", task);
    const int code = app_control_send_launch_request(request, callback, nullptr);
    app_control_destroy(request);
    return code;
}

class Recorder : public app_assist::WApp
{
protected:
    bool onCreate() override
    {
        record("create");
        ui_app_add_event_handler(&language_, APP_EVENT_LANGUAGE_CHANGED, onLanguage, this);
        return !std::getenv("RECORDER_REFUSES");
    }

    void onTerminate() override { record("terminate"); }
    void onPause() override { record("pause"); }
    void onResume() override { record("resume"); }

    void onAppControl(app_control_h request, bool firstLaunch) override
    {
        record(std::string(firstLaunch ? "first " : "later ") + pelliko::platform::toJson(request));
        const std::string task = extra(request, "do");
        if (task == "exit" || std::getenv("RECORDER_EXITS"))
            elm_exit();
        else if (task == "crash")
            _exit(9);
        else if (task == "keep")
            keep(request);
        else if (task == "drop")
            dropAll();
        else if (task == "window")
            showWindow();
        else
            doAnswers(request, task);
    }

private:
    static void onLanguage(app_event_info_h, void *) { record("language"); }

    void doAnswers(app_control_h request, const std::string &task)
    {
        if (task == "answer")
            record("answered " + std::to_string(answer(request, APP_CONTROL_RESULT_SUCCEEDED)));
        else if (task == "answer-failed")
            answer(request, APP_CONTROL_RESULT_FAILED);
        else if (task == "answer-twice")
            answerTwice(request);
        else if (task == "answer-clone")
            answerClone(request);
        else if (task == "ask-self")
            record("sent " + std::to_string(launchFrom(ownId(), "answer", onReply)));
        else if (task == "tell-self")
            record("sent " + std::to_string(launchFrom(ownId(), "note", nullptr)));
        else if (task == "ask-stranger")
            record("sent " + std::to_string(launchFrom("com.velmora.nobody", "answer", onReply)));
        else if (task == "ask-crash")
            record("sent " + std::to_string(launchFrom(extra(request, "whom"), "crash", onReply)));
    }

    static std::string ownId()
    {
        char *id = nullptr;
        app_get_id(&id);
        const std::string text = id;
        free(id);
        return text;
    }

    static void answerTwice(app_control_h request)
    {
        const int first = answer(request, APP_CONTROL_RESULT_SUCCEEDED);
        const int second = answer(request, APP_CONTROL_RESULT_FAILED);
        record("answers " + std::to_string(first) + " " + std::to_string(second));
    }

    // The clone answers after the request itself is gone.
    void answerClone(app_control_h request)
    {
        keep(request);
        ecore_job_add(
            [](void *self) {
                auto *recorder = static_cast<Recorder *>(self);
                answer(recorder->kept_.back(), APP_CONTROL_RESULT_SUCCEEDED);
            },
            this);
    }

    void keep(app_control_h request)
    {
        app_control_h clone = nullptr;
        app_control_clone(&clone, request);
        kept_.push_back(clone);
    }

    void dropAll()
    {
        for (app_control_h request : kept_)
            app_control_destroy(request);
        kept_.clear();
    }

    static bool fillsScreen(const Evas_Object *win)
    {
        int width = 0, height = 0, screen_width = 0, screen_height = 0;
        evas_object_geometry_get(win, nullptr, nullptr, &width, &height);
        elm_win_screen_size_get(win, nullptr, nullptr, &screen_width, &screen_height);
        return width > 1 && width == screen_width && height == screen_height;
    }

    void showWindow()
    {
        auto *controller =
            new app_assist::WWindowController("recorder", static_cast<Elm_Win_Type>(12));
        controller->setCreateWindowFn([](const char *name, Elm_Win_Type type) {
            Evas_Object *win = elm_win_add(nullptr, name, type);
            evas_object_show(win);
            return win;
        });
        controller->setCreateBaseLayoutFn([](Evas_Object *win, Evas_Object **layout) {
            *layout = nullptr;
            return win;
        });
        const bool attached = attachWindowController(controller);
        Evas_Object *win = controller->getWindow();
        record("window " + std::to_string(attached) + " type " +
               std::to_string(elm_win_type_get(win)) + " found " +
               std::to_string(getWindowController("recorder") == controller) + " full " +
               std::to_string(fillsScreen(win)));
        evas_object_hide(win);
        evas_object_del(win);
        record(controller->getWindow() ? "window stays" : "window gone");
    }

    app_event_handler_h language_ = nullptr;
    std::vector<app_control_h> kept_;
};

} // namespace

int main(int argc, char **argv)
{
    Recorder recorder;
    const int status = recorder.start(argc, argv);
    if (std::getenv("RECORDER_LOG"))
        record("ended " + std::to_string(status));
    return status;
}
