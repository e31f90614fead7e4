// Pieces of GLSL ES that several modules are put together from. Each is a string literal; a module's source
// is a row of them.
#pragma once

// Where a vertex goes. Both families of modules, the static and the skinned ones, have placeVertex, which
// puts the vertex on the screen, passes its texture coordinate on and returns its world position, and
// worldVector, which turns a direction of the mesh into one of the world, not of length 1.
// In the variants for instances they come from QEX_GLSL_INSTANCES, which stands in front.
#define QEX_GLSL_VERTEX_ATTRIBUTES         \
    "attribute highp vec3 inVertex;\n"     \
    "attribute mediump vec2 inTexCoord;\n" \
    "varying mediump vec2 fTexCoord;\n"

#define QEX_GLSL_STATIC_VERTEX                              \
    "#ifndef QEX_INSTANCES\n" QEX_GLSL_VERTEX_ATTRIBUTES    \
    "uniform highp mat4 mvpMatrix;\n"                       \
    "uniform highp mat4 transMatrix;\n"                     \
    "uniform highp mat3 normalMatrix;\n"                    \
    "highp vec3 placeVertex() {\n"                          \
    "    fTexCoord = inTexCoord;\n"                         \
    "    gl_Position = mvpMatrix * vec4(inVertex, 1.0);\n"  \
    "    return (transMatrix * vec4(inVertex, 1.0)).xyz;\n" \
    "}\n"                                                   \
    "highp vec3 worldVector(highp vec3 v) {\n"              \
    "    return normalMatrix * v;\n"                        \
    "}\n"                                                   \
    "#endif\n"

// The same for modules without lights, which want no world.
#define QEX_GLSL_UNLIT_VERTEX                              \
    "#ifndef QEX_INSTANCES\n" QEX_GLSL_VERTEX_ATTRIBUTES   \
    "uniform highp mat4 mvpMatrix;\n"                      \
    "void placeVertex() {\n"                               \
    "    fTexCoord = inTexCoord;\n"                        \
    "    gl_Position = mvpMatrix * vec4(inVertex, 1.0);\n" \
    "}\n"                                                  \
    "#endif\n"

// The mesh is there QEX_INSTANCES times, and inInstance says which one a vertex belongs to: each has the
// first three rows of its matrix to the world, and a colour. A direction is turned by the matrix's cofactors,
// which are its inverse's transpose times its determinant.
#define QEX_GLSL_INSTANCES                                                                                \
    QEX_GLSL_VERTEX_ATTRIBUTES                                                                            \
    "attribute highp float inInstance;\n"                                                                 \
    "uniform highp mat4 viewProjMatrix;\n"                                                                \
    "uniform highp vec4 instanceRows[3 * QEX_INSTANCES];\n"                                               \
    "#ifdef QEX_INSTANCE_COLOURS\n"                                                                       \
    "uniform lowp vec4 instanceColours[QEX_INSTANCES];\n"                                                 \
    "varying lowp vec4 fInstanceColour;\n"                                                                \
    "#endif\n"                                                                                            \
    "highp vec3 placeVertex() {\n"                                                                        \
    "    int i = int(inInstance);\n"                                                                      \
    "    highp vec4 v = vec4(inVertex, 1.0);\n"                                                           \
    "    highp vec3 p = vec3(dot(instanceRows[3 * i], v), dot(instanceRows[3 * i + 1], v),\n"             \
    "                        dot(instanceRows[3 * i + 2], v));\n"                                         \
    "#ifdef QEX_INSTANCE_COLOURS\n"                                                                       \
    "    fInstanceColour = instanceColours[i];\n"                                                         \
    "#endif\n"                                                                                            \
    "    fTexCoord = inTexCoord;\n"                                                                       \
    "    gl_Position = viewProjMatrix * vec4(p, 1.0);\n"                                                  \
    "    return p;\n"                                                                                     \
    "}\n"                                                                                                 \
    "highp vec3 worldVector(highp vec3 v) {\n"                                                            \
    "    int i = 3 * int(inInstance);\n"                                                                  \
    "    highp vec3 x = instanceRows[i].xyz, y = instanceRows[i + 1].xyz, z = instanceRows[i + 2].xyz;\n" \
    "    highp vec3 yz = cross(y, z);\n"                                                                  \
    "    return sign(dot(x, yz)) * vec3(dot(yz, v), dot(cross(z, x), v), dot(cross(x, y), v));\n"         \
    "}\n"

// A vertex follows boneCount bones, and the bone matrices lead straight into the world.
#define QEX_GLSL_SKINNED_VERTEX                                                               \
    "attribute highp vec3 inVertex;\n"                                                        \
    "attribute mediump vec2 inTexCoord;\n"                                                    \
    "attribute mediump vec4 inBoneIndex;\n"                                                   \
    "attribute mediump vec4 inBoneWeight;\n"                                                  \
    "uniform highp mat4 viewProjMatrix;\n"                                                    \
    "uniform lowp int boneCount;\n"                                                           \
    "uniform highp mat4 boneMatrixArray[16];\n"                                               \
    "varying mediump vec2 fTexCoord;\n"                                                       \
    "highp vec3 placeVertex() {\n"                                                            \
    "    highp vec4 p = vec4(0.0);\n"                                                         \
    "    highp vec4 v = vec4(inVertex, 1.0);\n"                                               \
    "    if (boneCount > 0) p += boneMatrixArray[int(inBoneIndex.x)] * v * inBoneWeight.x;\n" \
    "    if (boneCount > 1) p += boneMatrixArray[int(inBoneIndex.y)] * v * inBoneWeight.y;\n" \
    "    if (boneCount > 2) p += boneMatrixArray[int(inBoneIndex.z)] * v * inBoneWeight.z;\n" \
    "    if (boneCount > 3) p += boneMatrixArray[int(inBoneIndex.w)] * v * inBoneWeight.w;\n" \
    "    fTexCoord = inTexCoord;\n"                                                           \
    "    gl_Position = viewProjMatrix * p;\n"                                                 \
    "    return p.xyz;\n"                                                                     \
    "}\n"

// Needs QEX_GLSL_SKINNED_VERTEX.
#define QEX_GLSL_SKINNED_VECTOR                                                                  \
    "uniform highp mat3 boneVecMatrixArray[16];\n"                                               \
    "highp vec3 worldVector(highp vec3 v) {\n"                                                   \
    "    highp vec3 r = vec3(0.0);\n"                                                            \
    "    if (boneCount > 0) r += boneVecMatrixArray[int(inBoneIndex.x)] * v * inBoneWeight.x;\n" \
    "    if (boneCount > 1) r += boneVecMatrixArray[int(inBoneIndex.y)] * v * inBoneWeight.y;\n" \
    "    if (boneCount > 2) r += boneVecMatrixArray[int(inBoneIndex.z)] * v * inBoneWeight.z;\n" \
    "    if (boneCount > 3) r += boneVecMatrixArray[int(inBoneIndex.w)] * v * inBoneWeight.w;\n" \
    "    return r;\n"                                                                            \
    "}\n"

// Normals of modules that light with the mesh's own.
#define QEX_GLSL_NORMAL(precision) "attribute " precision " vec3 inNormal;\n"

// The direction from a point to light i. Type 0 is a point light, the others are directional.
#define QEX_GLSL_LIGHT_VECTOR                                                               \
    "uniform highp int lightType[4];\n"                                                     \
    "uniform highp vec3 lightPosDir[4];\n"                                                  \
    "highp vec3 lightVector(int i, highp vec3 point) {\n"                                   \
    "    return normalize(lightType[i] == 0 ? lightPosDir[i] - point : -lightPosDir[i]);\n" \
    "}\n"

// The loop over the first `limit` lights, up to lightCount; its body is the statement behind. Strict
// compilers take a constant limit and i++, but not ++i.
#define QEX_GLSL_EACH_LIGHT(limit)   \
    "    for (int i = 0; i < " limit \
    "; i++)\n"                       \
    "      if (i < lightCount)\n"

// Diffuse light at a point of the world, for vertex stages: the first `limit` lights count. `precision` is
// that of lightCount and lightColor, which must be the same in both stages where both use them. Needs
// QEX_GLSL_LIGHT_VECTOR.
#define QEX_GLSL_DIFFUSE(limit, precision) \
    "uniform " precision " int lightCount;\n" \
    "uniform " precision " vec4 lightColor[4];\n" \
    "highp vec3 diffuseLight(highp vec3 point, highp vec3 normal) {\n" \
    "    highp vec3 sum = vec3(0.0);\n" \
    QEX_GLSL_EACH_LIGHT(limit) \
    "        sum += clamp(dot(normal, lightVector(i, point)), 0.0, 1.0) * lightColor[i].rgb;\n" \
    "    return sum;\n" \
    "}\n"

// The diffuse texture's colour, white in the variants for nodes without one, in the instance's colour.
#define QEX_GLSL_TEXEL                                           \
    "varying mediump vec2 fTexCoord;\n"                          \
    "#ifdef QEX_INSTANCE_COLOURS\n"                              \
    "varying lowp vec4 fInstanceColour;\n"                       \
    "#define tinted(c) (vec4(fInstanceColour.rgb, 1.0) * (c))\n" \
    "#else\n"                                                    \
    "#define tinted(c) (c)\n"                                    \
    "#endif\n"                                                   \
    "#ifdef QEX_NO_TEXTURE\n"                                    \
    "#define texel() tinted(vec4(1.0))\n"                        \
    "#else\n"                                                    \
    "uniform sampler2D sTexture;\n"                              \
    "#define texel() tinted(texture2D(sTexture, fTexCoord))\n"   \
    "#endif\n"

// Opacity times `source`, 0 up to the threshold. In the variants for nodes whose alpha is the same
// everywhere, that is what opacity holds; instances may each have an alpha of their own.
#define QEX_GLSL_ALPHA_OF(source)                                        \
    "uniform lowp float opacity;\n"                                      \
    "uniform lowp float alphaThreshold;\n"                               \
    "lowp float aboveThreshold(lowp float alpha) {\n"                    \
    "    return alpha <= alphaThreshold ? 0.0 : alpha;\n"                \
    "}\n"                                                                \
    "lowp float surfaceAlpha() {\n"                                      \
    "#if defined(QEX_CONSTANT_ALPHA) && defined(QEX_INSTANCE_COLOURS)\n" \
    "    return aboveThreshold(opacity * fInstanceColour.a);\n"          \
    "#elif defined(QEX_CONSTANT_ALPHA)\n"                                \
    "    return opacity;\n"                                              \
    "#elif defined(QEX_INSTANCE_COLOURS)\n"                              \
    "    return aboveThreshold(opacity * fInstanceColour.a * " source    \
    ");\n"                                                               \
    "#else\n"                                                            \
    "    return aboveThreshold(opacity * " source                        \
    ");\n"                                                               \
    "#endif\n"                                                           \
    "}\n"

// Colour and alpha of the modules with an alpha texture.
#define QEX_GLSL_ALPHA                  \
    QEX_GLSL_TEXEL                      \
    "#ifndef QEX_CONSTANT_ALPHA\n"      \
    "uniform sampler2D alphaTexture;\n" \
    "#endif\n" QEX_GLSL_ALPHA_OF("texture2D(alphaTexture, fTexCoord).r")

// Texture colour in diffuse and ambient light. Needs QEX_GLSL_ALPHA.
#define QEX_GLSL_SURFACE                                                 \
    "uniform lowp vec3 sceneAmbient;\n"                                  \
    "uniform lowp vec3 sceneDiffuse;\n"                                  \
    "mediump vec4 surfaceColour(mediump vec3 light) {\n"                 \
    "    return texel() * vec4(light + sceneAmbient, surfaceAlpha());\n" \
    "}\n"

// Light per vertex: the material's colours in diffuse and ambient light, and its opacity. Needs a vertex,
// QEX_GLSL_NORMAL and QEX_GLSL_DIFFUSE.
#define QEX_GLSL_GOURAUD_VERTEX                                                       \
    "uniform lowp vec3 sceneAmbient;\n"                                               \
    "uniform lowp vec3 sceneDiffuse;\n"                                               \
    "uniform lowp float opacity;\n"                                                   \
    "varying mediump vec4 fSurface;\n"                                                \
    "void main() {\n"                                                                 \
    "    highp vec3 point = placeVertex();\n"                                         \
    "    highp vec3 light = diffuseLight(point, normalize(worldVector(inNormal)));\n" \
    "    fSurface = vec4(sceneDiffuse * light + sceneAmbient, opacity);\n"            \
    "}\n"

// Needs QEX_GLSL_ALPHA.
#define QEX_GLSL_GOURAUD_FRAGMENT                                         \
    "varying mediump vec4 fSurface;\n"                                    \
    "void main() {\n"                                                     \
    "#if defined(QEX_CONSTANT_ALPHA) && !defined(QEX_INSTANCE_COLOURS)\n" \
    "    gl_FragColor = texel() * fSurface;\n"                            \
    "#else\n"                                                             \
    "    gl_FragColor = texel() * vec4(fSurface.rgb, surfaceAlpha());\n"  \
    "#endif\n"                                                            \
    "}\n"

// The vertex stage of specular highlights by the first `limit` lights. Needs a vertex, inNormal,
// QEX_GLSL_LIGHT_VECTOR and QEX_GLSL_DIFFUSE.
#define QEX_GLSL_SPECULAR_VERTEX(limit) \
    "uniform mediump vec3 cameraPos;\n" \
    "varying mediump vec3 fHalf[" limit "];\n" \
    "varying mediump vec3 fNormal;\n" \
    "varying mediump vec3 fDiffuse;\n" \
    "void main() {\n" \
    "    highp vec3 point = placeVertex();\n" \
    "    highp vec3 normal = normalize(worldVector(inNormal));\n" \
    "    highp vec3 toCamera = normalize(cameraPos - point);\n" \
    QEX_GLSL_EACH_LIGHT(limit) \
    "        fHalf[i] = normalize(toCamera + lightVector(i, point));\n" \
    "    fNormal = normal;\n" \
    "    fDiffuse = diffuseLight(point, normal);\n" \
    "}\n"

// The highlight of a fragment. Shininess reaches 256, more than low precision holds.
#define QEX_GLSL_HIGHLIGHT(limit) \
    "uniform mediump int lightCount;\n" \
    "uniform mediump vec4 lightColor[4];\n" \
    "uniform lowp vec3 sceneSpecular;\n" \
    "uniform mediump float shininess;\n" \
    "varying mediump vec3 fHalf[" limit "];\n" \
    "varying mediump vec3 fNormal;\n" \
    "varying mediump vec3 fDiffuse;\n" \
    "mediump vec3 highlight() {\n" \
    "    mediump vec3 sum = vec3(0.0);\n" \
    QEX_GLSL_EACH_LIGHT(limit) \
    "        sum += pow(clamp(dot(fNormal, fHalf[i]), 0.0, 1.0), shininess) * lightColor[i].rgb;\n" \
    "    return sceneSpecular * sum;\n" \
    "}\n"

// Both stages of diffuse light from a normal map by the first `limit` lights. The vertex stage needs a vertex
// and QEX_GLSL_LIGHT_VECTOR, the fragment stage QEX_GLSL_ALPHA and QEX_GLSL_SURFACE.
#define QEX_GLSL_NORMAL_MAP_VARYINGS(limit) \
    "uniform mediump int lightCount;\n"     \
    "varying mediump vec3 fTangent;\n"      \
    "varying mediump vec3 fBinormal;\n"     \
    "varying mediump vec3 fNormal;\n"       \
    "varying mediump vec3 fLight[" limit "];\n"

#define QEX_GLSL_NORMAL_MAP_VERTEX(limit) \
    QEX_GLSL_NORMAL_MAP_VARYINGS(limit)   \
    "attribute mediump vec3 inTangent;\n" \
    "attribute mediump vec3 inBiNormal;\n" \
    "attribute mediump vec3 inNormal;\n" \
    "void main() {\n" \
    "    highp vec3 point = placeVertex();\n" \
    QEX_GLSL_EACH_LIGHT(limit) \
    "        fLight[i] = lightVector(i, point);\n" \
    "    fTangent = normalize(worldVector(inTangent));\n" \
    "    fBinormal = normalize(worldVector(inBiNormal));\n" \
    "    fNormal = normalize(worldVector(inNormal));\n" \
    "}\n"

// The map holds the direction in the order green, red, blue.
#define QEX_GLSL_NORMAL_MAP_FRAGMENT(limit) \
    QEX_GLSL_NORMAL_MAP_VARYINGS(limit)     \
    "uniform mediump vec4 lightColor[4];\n" \
    "uniform sampler2D sNormalMap;\n" \
    "void main() {\n" \
    "    mediump vec3 texel = normalize((texture2D(sNormalMap, fTexCoord).grb - 0.5) * 2.0);\n" \
    "    mediump vec3 normal = mat3(fTangent, fBinormal, fNormal) * texel;\n" \
    "    mediump vec3 diffuse = vec3(0.0);\n" \
    QEX_GLSL_EACH_LIGHT(limit) \
    "        diffuse += clamp(dot(normal, fLight[i]), 0.0, 1.0) * lightColor[i].rgb;\n" \
    "    gl_FragColor = surfaceColour(sceneDiffuse * diffuse);\n" \
    "}\n"

// The vertex stage of the modules that receive a shadow.
#define QEX_GLSL_SHADOW_VERTEX                                                                   \
    "uniform mediump vec3 shadowLightDir;\n"                                                     \
    "uniform highp mat4 shadowSpaceMatrix;\n"                                                    \
    "uniform mediump float biasValue;\n"                                                         \
    "varying highp vec3 fShadow;\n"                                                              \
    "varying mediump float fFacing;\n"                                                           \
    "varying mediump vec3 fDiffuse;\n"                                                           \
    "void main() {\n"                                                                            \
    "    highp vec3 point = placeVertex();\n"                                                    \
    "    highp vec3 normal = normalize(worldVector(inNormal));\n"                                \
    "    fDiffuse = diffuseLight(point, normal);\n"                                              \
    "    fShadow = (shadowSpaceMatrix * vec4(inVertex, 1.0)).xyz - vec3(0.0, 0.0, biasValue);\n" \
    "    fFacing = dot(normal, normalize(-shadowLightDir));\n"                                   \
    "}\n"

// A fragment is in shadow when it faces the light, lies within the map, and the map holds something nearer:
// the depth between the two, or 0. Needs QEX_GLSL_FRAGMENT_PRECISION.
#define QEX_GLSL_SHADOW_DEPTH                                                                          \
    "uniform sampler2D shadowTexture;\n"                                                               \
    "uniform mediump float shadowIntensity;\n"                                                         \
    "varying mediump vec3 fDiffuse;\n"                                                                 \
    "varying vec3 fShadow;\n"                                                                          \
    "varying mediump float fFacing;\n"                                                                 \
    "float shadowDepth() {\n"                                                                          \
    "    float depth = texture2D(shadowTexture, fShadow.xy).r;\n"                                      \
    "    bool inMap = fShadow.x >= 0.0 && fShadow.x <= 1.0 && fShadow.y >= 0.0 && fShadow.y <= 1.0;\n" \
    "    return depth < 1.0 && inMap && fFacing > 0.0 ? max(fShadow.z - depth, 0.0) : 0.0;\n"          \
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

// The vertex stage of the programs that draw quads over the screen.
#define QEX_GLSL_SCREEN_VERTEX                           \
    "attribute highp vec4 a_v4Position;\n"               \
    "attribute mediump vec2 a_v2TexCoord;\n"             \
    "uniform highp mat4 u_m4Projection;\n"               \
    "varying mediump vec2 v_v2TexCoord;\n"               \
    "void main() {\n"                                    \
    "    gl_Position = u_m4Projection * a_v4Position;\n" \
    "    v_v2TexCoord = a_v2TexCoord;\n"                 \
    "}\n"
