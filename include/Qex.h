/* Qex: a real-time 3D engine for OpenGL ES 2.0.
 *
 * This header declares everything that the library exports: functions, records, constants and data, for
 * C and C++. The functions come in families, one page each, which this header includes; a record's fields
 * are described where it is declared.
 *
 * Pages:
 *   Qex/base.h             the base: diagnostics, memory, time and float animation
 *   Qex/math.h             vectors, matrices, scalars, rotations
 *   Qex/geometry.h         boxes, planes, equations, random numbers, the camera
 *   Qex/resources.h        whole files in memory, the bounded reading cursor, caches
 *   Qex/pod.h              POD scenes: records, reading, vertex access
 *   Qex/pod_animation.h    POD scenes that move: bone batching, animation and world matrices
 *   Qex/meshes.h           meshes of plain arrays
 *   Qex/images.h           images in files: codes of their pixels, the PVR header, decoders
 *   Qex/renderer.h         the context record, render state, renderer settings, stereo, shaders and programs
 *   Qex/textures.h         textures and render targets
 *   Qex/shader_modules.h   the built-in shader modules, and the records that they draw
 *   Qex/models.h           models: loading, from arrays, rendering
 *   Qex/shadows.h          shadows and planar reflection of models
 *   Qex/scene_nodes.h      nodes of a model, picking, and the tree of scene nodes
 *   Qex/overlay.h          text, textures and pictures on the screen, billboards
 *   Qex/effects.h          sky box and water, particles, post-processing
 *   Qex/engine.h           the engine: start and end
 *
 * Conventions that hold throughout:
 * - One thread. Every call comes from the thread that owns the GL context; nothing is locked. Functions
 *   that say "no GL context needed" issue no GL call.
 * - Matrices are column-major, vectors are columns: in a * b the transform b applies first. Space is
 *   right-handed; a camera looks down -Z with +Y up. Projected depth is 0 at the near plane, 1 at the far.
 * - Angles: degrees in the matrix rotation builders and node rotations, radians elsewhere; each function
 *   says which.
 * - Results: 0 for success and a negative code for failure, unless a function says otherwise. Pointers must
 *   not be null unless a function says that they may be.
 * - A GL error is fatal: it is logged with the module and line that found it, and the process ends with
 *   exit status 255. A library that was built with QEX_GL_CHECKS off does not look for them.
 * - GL object names and enumerants appear as uint32_t, so this header needs no GL header.
 * - Names begin with Qex, or with the record that they work on. A few others are exported as well
 *   (createWindow, fontdata, ...), where a program's own names may be the same: they are declared where
 *   QEX_UNPREFIXED_NAMES is defined before this header is included.
 */
#ifndef QEX_H
#define QEX_H

#include "Qex/base.h"
#include "Qex/effects.h"
#include "Qex/engine.h"
#include "Qex/geometry.h"
#include "Qex/images.h"
#include "Qex/math.h"
#include "Qex/meshes.h"
#include "Qex/models.h"
#include "Qex/overlay.h"
#include "Qex/pod.h"
#include "Qex/pod_animation.h"
#include "Qex/renderer.h"
#include "Qex/resources.h"
#include "Qex/scene_nodes.h"
#include "Qex/shader_modules.h"
#include "Qex/shadows.h"
#include "Qex/textures.h"

#endif
