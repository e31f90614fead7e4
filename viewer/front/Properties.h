// A viewer's scene and properties as JSON, for shells in another language: what is shown, and everything that
// people change.
#pragma once

#include <string>

class Viewer;

// The parts of the scene that is shown: {"name", "frames", "perSecond", "cameras": count, "nodes": [{"name",
// "parent": index or -1, "mesh": whether it is one}], "materials": [{"name", "diffuse", "specular": [r, g, b]
// from 0 to 1, "shininess", "opacity", "texture": null or {"name", "width", "height", "format"}}]}, or null.
std::string DescribeScene(Viewer* viewer);

// The names of shader modules, axes and keys that never change: {"shaders", "axes", "overlays", "help"}.
std::string DescribeChoices();

// All properties and what goes on: {"loads", "failed": loads that ended well and badly, "loading": share or
// null, "messages", "selected": node or -1, "frame", ...}.
std::string DescribeState(Viewer* viewer);

// The emitters that are drawn with the scene: [{"name", "fields": as in their descriptions}].
std::string DescribeEmitters(Viewer* viewer);

// Sets the properties of an object as in DescribeState; besides, "frameAll": true, "camera": index,
// "material": {"index", ...}, "emitter": {"index", "fields"}. False, and a message of the viewer, for what is
// no such property or value.
bool SetProperties(Viewer* viewer, const std::string& json);
