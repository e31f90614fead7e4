// A small GLES2 program that knows nothing of the tap: the test preloads it. Clears to green, then to red,
// and prints the errors it met and the colour in the end. With "--no-context" it opens no context, which only
// the null driver survives.

#include <GLES2/gl2.h>

#include <cstdio>
#include <cstring>

#include "Headless.h"

int main(int argc, char** argv) {
    const bool withContext = argc < 2 || std::strcmp(argv[1], "--no-context") != 0;
    std::string error;
    const auto context = qex::HeadlessContext::Create(
        4, 4, &error, withContext ? qex::HeadlessGL::kContext : qex::HeadlessGL::kNone);
    if (!context) {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 77;
    }
    GLuint textures[2] = {};
    glGenTextures(2, textures);
    glBindTexture(GL_TEXTURE_2D, textures[1]);
    for (int i = 0; i < 3; ++i) {
        const GLfloat red = i ? 1.0f : 0.0f;
        glClearColor(red, 1 - red, 0, 1);
        if (i < 2) glClear(GL_COLOR_BUFFER_BIT);
        std::printf("error %04x\n", glGetError());
    }
    GLubyte pixel[4] = {};
    glReadPixels(0, 0, 1, 1, GL_RGBA, GL_UNSIGNED_BYTE, pixel);
    std::printf("pixel %d %d %d %d\n", pixel[0], pixel[1], pixel[2], pixel[3]);
    glDeleteTextures(1, textures);
    return 0;
}
