// The command line of qex view.
#include "view/Command.h"

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"

void SetUpView(CLI::App* app, ViewOptions* options) {
    static const NumberShape kSize = {'x',
                                      {{NumberRange::kWhole, 1, 8192}, {NumberRange::kWhole, 1, 8192}},
                                      2,
                                      "is no size; expected WIDTHxHEIGHT, 1 to 8192 each"};
    app->add_option("FILE", options->files,
                    "scenes: POD, or what qex convert reads; Page Up and Page Down turn them");
    AddNumbers(app, "--size", "WxH of the window in pixels (as the last time)", kSize, [=](const Numbers& n) {
        options->width = static_cast<int>(n[0]);
        options->height = static_cast<int>(n[1]);
    });
    app->add_flag("--batch", options->batch)->group("");
    app->add_option("--script", options->script)->group("");
    app->add_option("--random-events", options->randomEvents)->group("");
    app->add_option("--seed", options->seed)->group("");
}
