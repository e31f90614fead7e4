// A window and whoever drives it.
#include "desktop/View.h"

#include "common/Talk.h"
#include "desktop/Chance.h"
#include "desktop/Drive.h"

int RunView(const ViewOptions& options) {
    Window window(options);
    std::string problem;
    if (!options.files.empty() && !options.randomEvents) window.Expect(options.files[0]);
    if (!window.Start(&problem)) return Fail("view", problem, 1);
    if (options.batch) return DriveBatch(&window, options.files);
    if (options.randomEvents) return DriveRandomly(&window, options);
    if (!options.files.empty()) window.Open(options.files[0]);
    if (!options.script.empty()) return DriveScript(&window, options.script);
    window.Run();
    return 0;
}
