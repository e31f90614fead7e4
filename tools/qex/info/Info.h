// The parts of qex info. A file is first described as one JSON document; the text is printed from that
// document, so both say the same. Names of the document's members are camelCase; a member that does not apply
// is left out.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "common/EngineOutput.h"
#include "Qex.h"
#include "texture/Container.h"

using Json = nlohmann::ordered_json;

// Text from a file, made fit for a terminal and for JSON: valid UTF-8 without control characters.
std::string CleanText(const std::string& text);

// Scene.cpp. False, with the reason, when the file is no sound scene.
bool DescribeScene(const std::string& path, Json* document, std::string* error);

// Problems.cpp. A line for each thing that would draw wrong or not at all. `textures` is the document's
// list of the textures; `engine` holds what the engine said while it read the scene.
std::vector<std::string> FindSceneProblems(QexPODModel* scene, const Json& textures,
                                           const EngineOutput& engine);

// The frames at which a scene is looked into: 0, and when it is animated others up to just before
// its last.
std::vector<float> SampleFrames(const QexPODModel& scene);

// Texture.cpp and TextureKtx.cpp. Each describes a whole file in memory, with "loads" (whether the
// engine takes it) and "problems". False, with the reason, when it is too short to have a header.
bool DescribePvr(const std::vector<uint8_t>& file, Json* document, std::string* error);
bool DescribeTga(const std::vector<uint8_t>& file, Json* document, std::string* error);
bool DescribeKtx(const std::vector<uint8_t>& file, Json* document, std::string* error);

constexpr char kPartialChain[] = "its mipmap chain is not whole: it is decoded, and the rest is made";
constexpr char kNoMipmaps[] = "its sides are no powers of two: a plain GL ES 2.0 has no mipmaps for it";

// Command.cpp. Describes a PVR or KTX file by its content; false when it is neither, or cannot be read.
bool DescribeContainer(const std::string& path, Json* document, std::string* error);

// Text.cpp. Prints the document on standard output.
void PrintInfo(const Json& document);
