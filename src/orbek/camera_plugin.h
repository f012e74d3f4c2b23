#pragma once

/** @file
 * What a camera needs to become a device of the configuration: a shared library in C, or in any language that
 * exports C functions, built with this header alone. See examples/camera.
 *
 * It exports orbekOpenCamera(), which fills in the functions of one camera. The library calls the functions
 * of one camera from one thread at a time, and stays loaded until the last camera is closed.
 */

#ifdef __cplusplus
extern "C" {
#endif

/** What the library calls; a plug-in refuses what it does not know. */
#define ORBEK_CAMERA_INTERFACE 1u

/** Bytes that there are for the reason of a failure, with the 0 at its end. */
#define ORBEK_CAMERA_ERROR_SIZE 256

/** How pixels lie in memory: bytes in this order. */
enum orbekPixelFormat { ORBEK_GRAY8 = 1, ORBEK_BGR24 = 2, ORBEK_RGB24 = 3, ORBEK_BGRA32 = 4 };

/** An image. */
typedef struct orbekFrame {
    unsigned int width, height; /**< pixels, 1 to 65535 */
    unsigned int format;        /**< an orbekPixelFormat */
    unsigned int stride;        /**< bytes from one row to the next */
    const void* pixels; /**< the upper row first; read before the next call for this camera, and not later */
} orbekFrame;

/** A camera. Functions that may fail return 0, or else something else and the reason in `error`. */
typedef struct orbekCamera {
    /** The plug-in's own; comes with each call. */
    void* self;
    /** The image of the moment; waits for it. Frames come zeroed. */
    int (*grab)(void* self, orbekFrame* frame, char* error);
    /** A single picture, of a higher quality if the camera can tell the two apart; null for that of grab().
     */
    int (*take)(void* self, orbekFrame* frame, char* error);
    /** Present settings in the camera's own units; null for 0. */
    unsigned int (*gain)(void* self);
    unsigned int (*exposure)(void* self);
    /** Called once, last; null for nothing. */
    void (*close)(void* self);
} orbekCamera;

/** What a plug-in exports under the name "orbekOpenCamera". It is told the ORBEK_CAMERA_INTERFACE of the
 * library and the name of the device in the configuration, and fills in a camera, which comes zeroed. It
 * returns 0, or something else and the reason in `error`; the camera is not closed then. */
typedef int orbekOpenCameraFunction(unsigned int interfaceVersion, const char* name, orbekCamera* camera,
                                    char* error);

#ifdef __cplusplus
}
#endif
