// What a GL of less abilities answers to the questions after them.
#include <map>
#include <vector>

#include "Tap.h"

namespace gltap {

namespace {

std::map<GLenum, GLint> g_integers;
std::vector<std::string> g_hidden;
std::string g_extensions;  // the last answer

}  // namespace

void ForgetPoorer() {
    g_integers.clear();
    g_hidden.clear();
}

void MakePoorer(GLenum name, GLint* out) {
    const auto found = g_integers.find(name);
    if (found != g_integers.end()) *out = found->second;
}

const GLubyte* MakePoorer(GLenum name, const GLubyte* text) {
    if (name != GL_EXTENSIONS || !text || g_hidden.empty()) return text;
    g_extensions = ' ' + std::string(reinterpret_cast<const char*>(text)) + ' ';
    for (const std::string& extension : g_hidden) {
        const size_t at = g_extensions.find(' ' + extension + ' ');
        if (at != std::string::npos) g_extensions.erase(at, extension.size() + 1);
    }
    return reinterpret_cast<const GLubyte*>(g_extensions.c_str());
}

}  // namespace gltap

void gltapSetInteger(uint32_t name, int32_t value) {
    gltap::g_integers[name] = value;
}

void gltapHideExtension(const char* name) {
    gltap::g_hidden.emplace_back(name);
}
