// Every shader of the engine passes the strictest compiler and the smallest GL, not only the driver at hand.
#include <GLES2/gl2.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <sstream>

#include "support/Capture.h"
#include "support/RenderFixture.h"

namespace {

// What OpenGL ES 2.0 asks of every implementation, and the parts of the language that one may leave out.
// Vertex stages may index uniforms by anything all the same.
const int kAttributes = 8, kVaryings = 8, kVertexUniforms = 128, kFragmentUniforms = 16;
const char* const kLimits =
    "MaxVertexAttribs 8 MaxVertexUniformVectors 128 MaxVaryingVectors 8 MaxVertexTextureImageUnits 0 "
    "MaxCombinedTextureImageUnits 8 MaxTextureImageUnits 8 MaxFragmentUniformVectors 16 MaxDrawBuffers 1 "
    "nonInductiveForLoops 0 whileLoops 0 doWhileLoops 0 generalUniformIndexing 0 generalVaryingIndexing 0 "
    "generalAttributeMatrixVectorIndexing 0 generalSamplerIndexing 0 generalVariableIndexing 0 "
    "generalConstantMatrixVectorIndexing 0";

// Vectors that the declarations of one storage qualifier fill: one for each variable or column of a matrix.
// Packed, scalars share vectors with variables of three components, as the language describes it.
int Vectors(const std::string& source, const std::string& storage, bool packed = false) {
    int rows[5] = {};  // by number of components
    std::istringstream words(source);
    for (std::string word, type, name; words >> word;) {
        if (word != storage) continue;
        words >> type;
        if (type == "lowp" || type == "mediump" || type == "highp") words >> type;
        words >> name;
        EXPECT_EQ(name.back(), ';') << "not a declaration of one variable: " << type << " " << name;
        const bool matrix = type.compare(0, 3, "mat") == 0, vector = type.find("vec") != std::string::npos;
        const int components = matrix || vector ? type.back() - '0' : 1;
        const size_t bracket = name.find('[');
        const int count = bracket == std::string::npos ? 1 : std::atoi(&name[bracket + 1]);
        rows[components] += count * (matrix ? components : 1);
    }
    if (!packed) return rows[1] + rows[2] + rows[3] + rows[4];
    return rows[4] + rows[3] + rows[2] + std::max(0, rows[1] - rows[3]);
}

void ExpectStrict(const std::string& limits, const std::string& vertex, const std::string& fragment) {
    std::string command = "glslangValidator -l '" + limits + "'";
    const std::pair<const char*, const std::string*> stages[] = {{"source.vert", &vertex},
                                                                 {"source.frag", &fragment}};
    for (const auto& [name, text] : stages) {
        const std::string path = OutputPath(name);
        std::ofstream(path) << (text->compare(0, 8, "#version") == 0 ? "" : "#version 100\n") << *text;
        command += " '" + path + "'";
    }
    const std::string log = OutputPath("source.log");
    command += " > '" + log + "' && ! grep -i warning '" + log + "'";
    EXPECT_EQ(std::system(command.c_str()), 0) << std::ifstream(log).rdbuf() << vertex << fragment;
    EXPECT_LE(Vectors(vertex, "attribute"), kAttributes) << vertex;
    EXPECT_LE(Vectors(vertex, "varying"), kVaryings) << vertex;
    EXPECT_LE(Vectors(vertex, "uniform", true), kVertexUniforms) << vertex;
    EXPECT_LE(Vectors(fragment, "uniform", true), kFragmentUniforms) << fragment;
    EXPECT_EQ(vertex.find("sampler"), std::string::npos) << vertex;
}

// Starts and ends everything that compiles shaders.
void UseEverything() {
    QexRuntimeContext runtime;
    QexEngineConfig config = SurfaceConfig();
    QexEngine_Init(&runtime, sizeof config, &config);
    QexModel_CreateDefaultShader();
    for (uint32_t kind = 0; kind < 32; ++kind)
        QexShaders_ReleaseShaderProgram(QexShaders_CreateShaderProgram(kind), kind);
    // The modules without a kind.
    QexShaderModule* modules[] = {QexUVDisplacementNoAlphaShader_CreateProgram(),
                                  QexDepthShader_CreateProgram(), QexSkinningDepthShader_CreateProgram()};
    for (QexShaderModule*& module : modules) QexSimpleShader_Release(&module);
    for (const uint32_t type : {QEX_PROGRAM_TEXTURE_COLOUR, QEX_PROGRAM_TEXTURE_LIGHT}) {
        QexShaderProgram program;
        QexShaderProgram_Create(&program, type);
        QexShaderProgram_Release(&program);
    }
    QexBillboard_Release(QexBillboard_Create(nullptr));
    QexParticleSet set;
    QexParticleSet_Create(&set, nullptr, nullptr, 1, 1, 1);
    QexParticleSet_Release(&set);
    QexPostProcessing_Initialize(&runtime);
    QexPostProcessing_Finalize();
    QexCamera camera = {};
    QexSkyBox sky = {};
    sky.camera = &camera;
    sky.skyTexture = Qextexture_GetDefault();
    QexSkyBox_Create(&sky);
    QexSkyBox_Release();
    QexEngine_Shutdown(&runtime);
}

TEST(GlslTest, EveryProgramIsStrictGlslEs100) {
    if (std::system("glslangValidator --version > /dev/null"))
        GTEST_SKIP() << "glslangValidator is not installed";
    gltapSetMode(GLTAP_NULL);
    gltapReset();
    Capture quiet(STDERR_FILENO);
    const GLCalls calls(UseEverything);
    gltapSetMode(GLTAP_FORWARD);
    const std::string limits = OutputPath("limits.conf");
    // The validator's own limits with those in place.
    const std::string write = "{ glslangValidator -c && echo '" + std::string(kLimits) + "'; } > '" + limits;
    ASSERT_EQ(std::system((write + "'").c_str()), 0);
    std::map<int64_t, int64_t> types;
    std::map<int64_t, std::string> sources;                    // of shaders
    std::map<int64_t, std::map<int64_t, std::string>> stages;  // of programs
    size_t programs = 0;
    for (const gltapCall* call :
         calls.Of({"glCreateShader", "glShaderSource", "glAttachShader", "glLinkProgram"})) {
        const std::string function = gltapFunctionName(call->function);
        const int64_t first = call->argument[0].i, second = call->argument[1].i;
        if (function == "glCreateShader") types[call->result.i] = first;
        if (function == "glShaderSource") sources[first] = static_cast<const char*>(call->data);
        if (function == "glAttachShader") stages[first][types[second]] = sources[second];
        if (function != "glLinkProgram") continue;
        ExpectStrict(limits, stages[first][GL_VERTEX_SHADER], stages[first][GL_FRAGMENT_SHADER]);
        ++programs;
    }
    EXPECT_GE(programs, 30u);
}

}  // namespace
