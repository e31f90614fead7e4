// The document as tables and lines for a terminal.
#include <algorithm>
#include <cstdio>

#include "info/Info.h"

namespace {

constexpr uint32_t kMostIndent = 40;  // levels of the tree that are set in

// A value in words: numbers short, lists with commas.
std::string Words(const Json& value) {
    if (value.is_null()) return "none";
    if (value.is_string()) return value.get<std::string>();
    if (value.is_boolean()) return value.get<bool>() ? "yes" : "no";
    if (value.is_number_float()) {
        char text[32];
        snprintf(text, sizeof text, "%.6g", value.get<double>());
        return text;
    }
    if (!value.is_array()) return value.dump();
    std::string text;
    for (const Json& item : value) text += (text.empty() ? "" : ", ") + Words(item);
    return text;
}

// "keyValueBytes" to "key value bytes".
std::string Spaced(const std::string& name) {
    std::string text;
    for (const char c : name) {
        const bool upper = c >= 'A' && c <= 'Z';
        if (upper) text += ' ';
        text += upper ? static_cast<char>(c - 'A' + 'a') : c;
    }
    return text;
}

std::string Plural(const Json& count, const std::string& noun) {
    return Words(count) + " " + noun + (count == 1 ? "" : "s");
}

std::string Named(const Json& entry) {
    const std::string name = entry["name"].is_null() ? "" : Words(entry["name"]);
    return Words(entry["index"]) + (name.empty() ? "" : " " + name);
}

void Line(const char* name, const std::string& text) {
    printf("%-16s %s\n", name, text.c_str());
}

void Heading(const char* name, const Json& list) {
    if (!list.empty()) printf("\n%s\n", name);
}

std::string BoundsText(const Json& bounds) {
    if (bounds.is_null()) return "none";
    return "(" + Words(bounds["low"]) + ") to (" + Words(bounds["high"]) + ")";
}

void PrintOverview(const Json& d) {
    const Json& counts = d["counts"];
    if (d.contains("exporter")) Line("exporter", Words(d["exporter"]));
    if (d.contains("exportOptions")) Line("export options", Words(d["exportOptions"]));
    if (d.contains("flipTextureV"))
        Line("textures", d["flipTextureV"].get<bool>() ? "V runs down the pictures (bFlipTextureV=1)"
                                                       : "V runs up the pictures (bFlipTextureV=0)");
    Line("holds", Plural(counts["nodes"], "node") + " (" + Plural(counts["meshNodes"], "mesh node") + "), " +
                      Words(counts["meshes"]) + (counts["meshes"] == 1 ? " mesh, " : " meshes, ") +
                      Plural(counts["materials"], "material") + ", " + Plural(counts["textures"], "texture") +
                      ", " + Plural(counts["lights"], "light") + ", " + Plural(counts["cameras"], "camera"));
    Line("animation", d["frames"].get<uint32_t>() > 1
                          ? Plural(d["frames"], "frame") + ", " + Words(d["framesPerSecond"]) + " a second"
                          : "none");
    Line("background", Words(d["backgroundColour"]));
    Line("ambient", Words(d["ambientColour"]));
    Line("bounds", BoundsText(d["bounds"]) + (d.contains("boundsOverFrames") ? " at frame 0" : ""));
    if (d.contains("boundsOverFrames")) Line("", BoundsText(d["boundsOverFrames"]) + " over all frames");
}

void PrintNodes(const Json& nodes) {
    Heading("Nodes", nodes);
    for (const Json& node : nodes) {
        const uint32_t depth = std::min(node["depth"].get<uint32_t>(), kMostIndent);
        std::string text = Named(node) + ": " + Words(node["kind"]);
        if (node.contains("mesh")) {
            text += " " + Words(node["mesh"]);
            text += node["material"] == -1 ? ", no material" : ", material " + Words(node["material"]);
        }
        if (node.contains("animated")) text += ", animated " + Words(node["animated"]);
        printf("  %*s%s\n", static_cast<int>(2 * depth), "", text.c_str());
    }
}

void PrintMeshes(const Json& meshes) {
    Heading("Meshes", meshes);
    for (const Json& mesh : meshes) {
        const uint32_t bits = mesh["indexBits"].get<uint32_t>();
        std::string text = Plural(mesh["faces"], "face");
        if (mesh["strips"] != 0) text += " in " + Plural(mesh["strips"], "strip");
        text += bits ? ", " + std::to_string(bits) + "-bit indices" : ", no indices";
        text += mesh["interleaved"].get<bool>() ? ", interleaved" : ", not interleaved";
        if (mesh["skinned"].get<bool>()) text += ", skinned";
        if (mesh["unpackMatrix"].get<bool>()) text += ", unpack matrix";
        printf("  %s: %s vertices, %s\n", Words(mesh["index"]).c_str(), Words(mesh["vertices"]).c_str(),
               text.c_str());
        for (const Json& element : mesh["elements"])
            printf("     %-14s %s x %s, stride %s\n", Words(element["name"]).c_str(),
                   Words(element["components"]).c_str(), Words(element["type"]).c_str(),
                   Words(element["stride"]).c_str());
        if (mesh.contains("boneBatches"))
            printf("     %-14s %s, at most %s bones\n", "bone batches",
                   Words(mesh["boneBatches"]["count"]).c_str(),
                   Words(mesh["boneBatches"]["mostBones"]).c_str());
    }
}

void PrintMaterials(const Json& materials) {
    Heading("Materials", materials);
    for (const Json& material : materials) {
        printf("  %s: opacity %s, diffuse %s, ambient %s, specular %s, shininess %s\n",
               Named(material).c_str(), Words(material["opacity"]).c_str(),
               Words(material["diffuse"]).c_str(), Words(material["ambient"]).c_str(),
               Words(material["specular"]).c_str(), Words(material["shininess"]).c_str());
        for (const auto& slot : material["textures"].items())
            printf("     %-14s texture %s %s\n", Spaced(slot.key()).c_str(),
                   Words(slot.value()["texture"]).c_str(), Words(slot.value()["name"]).c_str());
        for (const char* member : {"effectFile", "effect"})
            if (material.contains(member))
                printf("     %-14s %s\n", Spaced(member).c_str(), Words(material[member]).c_str());
    }
}

void PrintTranslucent(const Json& materials) {
    Heading("Translucent", materials);
    for (const Json& material : materials) {
        std::string text = "opacity " + Words(material["opacity"]);
        if (material.contains("alphaFile")) text += ", alpha from " + Words(material["alphaFile"]);
        printf("  %s: %s; drawn after the opaque ones, over what is behind\n", Named(material).c_str(),
               text.c_str());
    }
}

// What a PVR or KTX file that stands for a texture is.
std::string ContainerText(const Json& content) {
    std::string text = Words(content["format"]);
    if (content.contains("pixelType")) text += " " + Words(content["pixelType"]);
    if (content.contains("glInternalFormat")) text += " " + Words(content["glInternalFormat"]);
    if (content.contains("width")) text += ", " + Words(content["width"]) + " x " + Words(content["height"]);
    return text + (content["loads"].get<bool>() ? "" : ", refused");
}

std::string PictureText(const Json& picture) {
    if (!picture["loads"].get<bool>()) return "a picture, damaged";
    return "a picture, " + Words(picture["width"]) + " x " + Words(picture["height"]) +
           ": qex render decodes it, the engine alone does not";
}

void PrintTextures(const Json& textures) {
    Heading("Textures", textures);
    for (const Json& texture : textures) {
        std::string text = Named(texture) + ": ";
        if (!texture["found"].get<bool>()) {
            text += "missing";
        } else {
            text += Words(texture["file"]);
            if (texture.contains("content")) text += " (" + ContainerText(texture["content"]) + ")";
            if (texture.contains("picture")) text += " (" + PictureText(texture["picture"]) + ")";
        }
        if (texture.contains("alphaFile")) text += ", alpha from " + Words(texture["alphaFile"]);
        printf("  %s\n", text.c_str());
    }
}

std::string TargetText(const Json& entry) {
    return ", node " + Words(entry["node"]) +
           (entry["target"] == -1 ? "" : ", target node " + Words(entry["target"]));
}

void PrintLightsAndCameras(const Json& document) {
    Heading("Lights", document["lights"]);
    for (const Json& light : document["lights"])
        printf("  %s: %s, colour %s%s\n", Words(light["index"]).c_str(), Words(light["type"]).c_str(),
               Words(light["colour"]).c_str(), TargetText(light).c_str());
    Heading("Cameras", document["cameras"]);
    for (const Json& camera : document["cameras"])
        printf("  %s: field of view %s degrees%s, near %s, far %s%s\n", Words(camera["index"]).c_str(),
               Words(camera["fovDegrees"]).c_str(), camera["animatedFov"].get<bool>() ? " (animated)" : "",
               Words(camera["near"]).c_str(), Words(camera["far"]).c_str(), TargetText(camera).c_str());
}

// A texture's members one by one; lists of their own come below.
void PrintTexture(const Json& document) {
    for (const auto& member : document.items()) {
        const bool shown = member.key() == "file" || member.key() == "format" || member.key() == "bytes";
        if (shown || member.value().is_array()) continue;
        printf("%-24s %s\n", Spaced(member.key()).c_str(), Words(member.value()).c_str());
    }
    if (!document.contains("levelSizes")) return;
    Heading("Levels", document["levelSizes"]);
    for (const Json& level : document["levelSizes"])
        printf("  %s x %s, %s bytes\n", Words(level["width"]).c_str(), Words(level["height"]).c_str(),
               Words(level["bytes"]).c_str());
    Heading("Key and value pairs", document["keyValues"]);
    for (const Json& pair : document["keyValues"])
        printf("  %s: %s\n", Words(pair["key"]).c_str(), Words(pair["value"]).c_str());
}

}  // namespace

std::string CleanText(const std::string& text) {
    const auto replace = Json::error_handler_t::replace;
    std::string clean = Json::parse(Json(text).dump(-1, ' ', false, replace)).get<std::string>();
    for (char& c : clean)
        if ((c >= 0 && c < ' ') || c == 127) c = c == '\n' || c == '\r' || c == '\t' ? ' ' : '?';
    return clean;
}

void PrintInfo(const Json& document) {
    printf("%s: %s, %s bytes\n", Words(document["file"]).c_str(), Words(document["format"]).c_str(),
           Words(document["bytes"]).c_str());
    if (document["format"] == "POD") {
        PrintOverview(document);
        PrintNodes(document["nodes"]);
        PrintMeshes(document["meshes"]);
        PrintMaterials(document["materials"]);
        PrintTranslucent(document["translucent"]);
        PrintTextures(document["textures"]);
        PrintLightsAndCameras(document);
    } else {
        PrintTexture(document);
    }
    printf("\nWould draw wrong or not at all%s\n", document["problems"].empty() ? ": nothing found" : "");
    for (const Json& problem : document["problems"]) printf("  - %s\n", Words(problem).c_str());
}
