// A conversion, where the file is no POD scene, and a rendering.
#include "thumbnail/Command.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include <CLI/CLI.hpp>

#include "common/CommandLine.h"
#include "common/TextureFiles.h"
#include "convert/Command.h"
#include "render/Command.h"

namespace {

// A folder that goes with this object.
class TemporaryFolder {
  public:
    TemporaryFolder() {
        std::string pattern = (std::filesystem::temp_directory_path() / "qex-thumbnail-XXXXXX").string();
        if (mkdtemp(&pattern[0])) path_ = pattern;
    }
    ~TemporaryFolder() {
        std::error_code ignored;
        if (!path_.empty()) std::filesystem::remove_all(path_, ignored);
    }
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;
    const std::string& Path() const { return path_; }

  private:
    std::string path_;
};

}  // namespace

void SetUpThumbnail(CLI::App* app, ThumbnailOptions* options) {
    app->add_option("FILE", options->input, "scene: POD, or what qex convert reads")->required();
    app->add_option("OUT", options->output, "PNG, JPEG, BMP or TGA file, by its extension")->required();
    app->add_option("--size", options->size, "pixels of each side (256)")->check(WholeNumberFrom(1, 8192));
}

int RunThumbnail(const ThumbnailOptions& options) {
    RenderOptions render;
    render.input = options.input;
    const TemporaryFolder folder;
    if (Extension(options.input) != "pod") {
        if (folder.Path().empty())
            return Fail("thumbnail", std::string("no temporary folder: ") + strerror(errno), 1);
        ConvertOptions convert;
        convert.input = options.input;
        convert.output = render.input = folder.Path() + "/scene.pod";
        convert.textureFormat = TextureFormat::kRgb888;  // nothing is encoded
        convert.quiet = true;
        if (const int status = RunConvert(convert)) return status;
    }
    render.output = options.output;
    render.width = render.height = options.size;
    render.autoCamera = render.quiet = true;
    return RunRender(render);
}
