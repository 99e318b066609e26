// The OpenGL API as this device uses it: core and compatibility entry points up to 4.5, linked
// directly through libOpenGL (GLVND), with the extension enumerations.
#pragma once

#include <GL/gl.h>
#include <GL/glext.h>
