// The programs of sky and water, next to m_Tex2DShader and m_PlaneTexShader.
#pragma once

#include "gl/GL.h"

struct QexSkyProgram {
    GLuint program;  // attribute 0 inVertex; CubeMap on unit 0
    GLint modelMatrix, mvpMatrix;
};

// Samplers: NormalTex on unit 0, ReflectionTex 1, RefractionTex 2, NormalisationCubeMap 3.
struct QexWaterProgram {
    GLuint program;  // attribute 0 inVertex
    GLint modelViewMatrix, mvpMatrix, eyePosition, waterColour, waveDistortion, rcpWindowSize;
    GLint bumpTranslation[2], bumpScale[2];
};

// Compiles and links all of them, up to the first that fails.
bool QexSkyBox_CreatePrograms();
void QexSkyBox_ReleasePrograms();
void QexSkyBox_ForgetPrograms();  // without GL

extern QexSkyProgram g_QexSkyProgram;
extern QexWaterProgram g_QexWaterProgram;
