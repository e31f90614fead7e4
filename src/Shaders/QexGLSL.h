// Pieces of GLSL ES that several modules are put together from. Each is a string literal; a module's source
// is a row of them.
#pragma once

// Skinned positions and directions: a vertex follows boneCount bones, and the bone matrices lead straight
// into the world.
#define QEX_GLSL_SKIN                                                                         \
    "attribute highp vec3 inVertex;\n"                                                        \
    "attribute mediump vec4 inBoneIndex;\n"                                                   \
    "attribute mediump vec4 inBoneWeight;\n"                                                  \
    "uniform lowp int boneCount;\n"                                                           \
    "uniform highp mat4 boneMatrixArray[16];\n"                                               \
    "highp vec4 skinPosition() {\n"                                                           \
    "    highp vec4 p = vec4(0.0);\n"                                                         \
    "    highp vec4 v = vec4(inVertex, 1.0);\n"                                               \
    "    if (boneCount > 0) p += boneMatrixArray[int(inBoneIndex.x)] * v * inBoneWeight.x;\n" \
    "    if (boneCount > 1) p += boneMatrixArray[int(inBoneIndex.y)] * v * inBoneWeight.y;\n" \
    "    if (boneCount > 2) p += boneMatrixArray[int(inBoneIndex.z)] * v * inBoneWeight.z;\n" \
    "    if (boneCount > 3) p += boneMatrixArray[int(inBoneIndex.w)] * v * inBoneWeight.w;\n" \
    "    return p;\n"                                                                         \
    "}\n"

// Needs QEX_GLSL_SKIN. The result is not of length 1.
#define QEX_GLSL_SKIN_VECTOR                                                                     \
    "uniform highp mat3 boneVecMatrixArray[16];\n"                                               \
    "highp vec3 skinVector(highp vec3 v) {\n"                                                    \
    "    highp vec3 r = vec3(0.0);\n"                                                            \
    "    if (boneCount > 0) r += boneVecMatrixArray[int(inBoneIndex.x)] * v * inBoneWeight.x;\n" \
    "    if (boneCount > 1) r += boneVecMatrixArray[int(inBoneIndex.y)] * v * inBoneWeight.y;\n" \
    "    if (boneCount > 2) r += boneVecMatrixArray[int(inBoneIndex.z)] * v * inBoneWeight.z;\n" \
    "    if (boneCount > 3) r += boneVecMatrixArray[int(inBoneIndex.w)] * v * inBoneWeight.w;\n" \
    "    return r;\n"                                                                            \
    "}\n"

// The direction from a point to light i. Type 0 is a point light, the others are directional.
#define QEX_GLSL_LIGHT_VECTOR                                                               \
    "uniform highp int lightType[4];\n"                                                     \
    "uniform highp vec3 lightPosDir[4];\n"                                                  \
    "highp vec3 lightVector(int i, highp vec3 point) {\n"                                   \
    "    return normalize(lightType[i] == 0 ? lightPosDir[i] - point : -lightPosDir[i]);\n" \
    "}\n"

// Diffuse light at a point of the world, for vertex stages: the first `limit` lights count. `precision` is
// that of lightCount and lightColor, which must be the same in both stages where both use them. Needs
// QEX_GLSL_LIGHT_VECTOR.
#define QEX_GLSL_DIFFUSE(limit, precision)                                                          \
    "uniform " precision                                                                            \
    " int lightCount;\n"                                                                            \
    "uniform " precision                                                                            \
    " vec4 lightColor[4];\n"                                                                        \
    "highp vec3 diffuseLight(highp vec3 point, highp vec3 normal) {\n"                              \
    "    highp vec3 sum = vec3(0.0);\n"                                                             \
    "    for (int i = 0; i < " limit                                                                \
    "; ++i)\n"                                                                                      \
    "        if (i < lightCount)\n"                                                                 \
    "            sum += clamp(dot(normal, lightVector(i, point)), 0.0, 1.0) * lightColor[i].rgb;\n" \
    "    return sum;\n"                                                                             \
    "}\n"

// Alpha of the modules with an alpha texture.
#define QEX_GLSL_ALPHA                                                         \
    "uniform sampler2D sTexture;\n"                                            \
    "uniform sampler2D alphaTexture;\n"                                        \
    "uniform lowp float opacity;\n"                                            \
    "uniform lowp float alphaThreshold;\n"                                     \
    "varying mediump vec2 fTexCoord;\n"                                        \
    "lowp float surfaceAlpha() {\n"                                            \
    "    lowp float alpha = opacity * texture2D(alphaTexture, fTexCoord).r;\n" \
    "    return alpha <= alphaThreshold ? 0.0 : alpha;\n"                      \
    "}\n"

// Texture colour in diffuse and ambient light. Needs QEX_GLSL_ALPHA.
#define QEX_GLSL_SURFACE                                                                        \
    "uniform lowp vec3 sceneAmbient;\n"                                                         \
    "uniform lowp vec3 sceneDiffuse;\n"                                                         \
    "mediump vec4 surfaceColour(mediump vec3 light) {\n"                                        \
    "    return texture2D(sTexture, fTexCoord) * vec4(light + sceneAmbient, surfaceAlpha());\n" \
    "}\n"

// Fragments take the best precision that there is.
#define QEX_GLSL_FRAGMENT_PRECISION       \
    "#ifdef GL_FRAGMENT_PRECISION_HIGH\n" \
    "precision highp float;\n"            \
    "#else\n"                             \
    "precision mediump float;\n"          \
    "#endif\n"

// Clip-space depth as 0 to 1 between near and far, for vertex stages.
#define QEX_GLSL_DEPTH                                                \
    "uniform highp float near;\n"                                     \
    "uniform highp float far;\n"                                      \
    "varying highp float fDepth;\n"                                   \
    "highp float depthValue(highp float z) {\n"                       \
    "    return z < near ? 0.0 : z > far ? 1.0 : z / (far - near);\n" \
    "}\n"
