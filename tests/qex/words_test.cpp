// Options to the words of a command line and back.
#include <gtest/gtest.h>
#include <CLI/CLI.hpp>

#include <algorithm>

#include "render/Command.h"

namespace {

using Words = std::vector<std::string>;

// What is printed of options that were read from these words.
Words Printed(Words words) {
    CLI::App app;
    RenderOptions options;
    SetUpRender(&app, &options);
    std::reverse(words.begin(), words.end());
    words.pop_back();  // "render"
    app.parse(words);
    return RenderWords(options);
}

}  // namespace

TEST(CommandWords, WhatIsPrintedIsReadAsTheSame) {
    const Words cases[] = {
        {},
        {"--size=1x8192", "--antialias=1", "--frame=0.1", "--camera=auto"},
        {"--frames=0:10:0.3", "--camera=3"},
        {"--orbit=-30.1,-89", "--up=-z", "--turn=7"},
        {"--look=-1,2.5,3e-07,0.1,0,-16777216,33.3", "--up=x", "--background=0a0b0c", "--text=it's \"so\""},
        {"--shader=normalmap", "--light=1,2,3", "--light=-1,0.1,3,ff8000", "--shadow", "--mirror=-0.3",
         "--floor=0"},
        {"--mirror-node=a b", "--stereo=3,-1.5"},
        {"--dof=0.25,3,2.5,7", "--dof-full"},
        {"--sky=a.png", "--water=-2"},
        {"--sky=1", "--sky=2", "--sky=3", "--sky=4", "--sky=5", "--sky=6"},
        {"--emitter=a.json", "--emitter=b", "--emitter-texture=c.png", "--emitter-time=0.7"},
        {"--node=a=b=hide", "--node=c=move:1,-2,3.3", "--node=d=rotate:0,90,0", "--node=e=face:0,0,1",
         "--node=f=shader:depth", "--material=a=diffuse:0.1,0,1", "--material=b=c=specular:1,0.2,0",
         "--material=#1=shininess:12.5", "--material=d=opacity:0.3", "--pick=1,2", "--pick=0.5,3"},
        {"--texture=skin=/dev/null/../null", "--flip-textures=no"},
        {"--drawing=described", "--stats", "--quiet"},
    };
    for (Words words : cases) {
        // The file has to be there.
        if (!words.empty() && words[0].rfind("--texture", 0) == 0) words[0] = "--texture=skin=" QEX_COMMAND;
        words.insert(words.begin(), {"render", "scene.pod", "--output=out.png"});
        EXPECT_EQ(Printed(words), words);
    }
}

TEST(CommandWords, AShellTakesThemAsTheyAre) {
    EXPECT_EQ(ShellLine({"a", "", "it's", "x y", "--n=1,2", "$HOME"}),
              "a '' 'it'\\''s' 'x y' --n=1,2 '$HOME'");
}
