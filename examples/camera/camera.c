/* A camera for the configuration that needs no camera: a gray bar that moves to the right. Built as a shared
 * library:
 *
 *     ORBEK.CaptureDevices = bar
 *     ORBEK.CaptureDevices.bar = VideoForLinux2
 *     ORBEK.FgDllCache.DllPaths.VideoForLinux2 = /path/libcamera_example.so */

#include <orbek/camera_plugin.h>

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

enum { width = 320, height = 240 };

struct bar {
    unsigned int frames;
    unsigned char pixels[width * height];
};

static int grab(void* self, orbekFrame* frame, char* error) {
    struct bar* bar = self;
    unsigned int x, y;
    (void)error;
    for (y = 0; y < height; ++y)
        for (x = 0; x < width; ++x) bar->pixels[y * width + x] = x == bar->frames % width ? 255 : 64;
    ++bar->frames;
    frame->width = width;
    frame->height = height;
    frame->format = ORBEK_GRAY8;
    frame->stride = width;
    frame->pixels = bar->pixels;
    return 0;
}

static void close_bar(void* self) {
    free(self);
}

__attribute__((visibility("default"))) int orbekOpenCamera(unsigned int interface_version, const char* name,
                                                           orbekCamera* camera, char* error) {
    if (interface_version != ORBEK_CAMERA_INTERFACE) {
        snprintf(error, ORBEK_CAMERA_ERROR_SIZE, "%s: built for another version of the library", name);
        return 1;
    }
    camera->self = calloc(1, sizeof(struct bar));
    if (!camera->self) {
        snprintf(error, ORBEK_CAMERA_ERROR_SIZE, "%s: no memory", name);
        return 1;
    }
    camera->grab = grab;
    camera->close = close_bar;
    return 0;
}
