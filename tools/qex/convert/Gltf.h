// What has to be known of a glTF file before the importer sees it.
#pragma once

#include <string>

// False, with the reason in `error`, for a .gltf or .glb file that would crash the importer: it needs inverse
// bind matrices in every skin, which glTF leaves optional. True for all else, also for what is no glTF at
// all.
bool CheckGltf(const std::string& path, std::string* error);
