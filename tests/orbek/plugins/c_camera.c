/* A camera that does what its name says. */

#include "orbek/camera_plugin.h"

#include <stdlib.h>
#include <string.h>

static unsigned char pixels[64];
static char name_of_camera[20];
static int shots;

static int shoot(void* self, orbekFrame* frame, char* error) {
    unsigned int i;
    for (i = 0; i < sizeof pixels; ++i) pixels[i] = (unsigned char)(10 * i + (self == pixels));
    if (strcmp(name_of_camera, "dark") == 0) {
        memset(error, 'x', ORBEK_CAMERA_ERROR_SIZE);
        return 7;
    }
    frame->width = 2;
    frame->height = 2;
    frame->stride = 10;
    frame->pixels = pixels;
    frame->format = ORBEK_GRAY8;
    if (strcmp(name_of_camera, "bgr") == 0) frame->format = ORBEK_BGR24;
    if (strcmp(name_of_camera, "rgb") == 0) frame->format = ORBEK_RGB24;
    if (strcmp(name_of_camera, "bgra") == 0) frame->format = ORBEK_BGRA32;
    if (strcmp(name_of_camera, "format") == 0) frame->format = 5;
    if (strcmp(name_of_camera, "wide") == 0) frame->width = 11;
    if (strcmp(name_of_camera, "huge") == 0) frame->height = 65536;
    if (strcmp(name_of_camera, "flat") == 0) frame->height = 0;
    if (strcmp(name_of_camera, "null") == 0) frame->pixels = NULL;
    return 0;
}

static int take(void* self, orbekFrame* frame, char* error) {
    (void)self;
    ++shots;
    return shoot(pixels, frame, error);
}
static unsigned int gain(void* self) {
    return self ? 11u : 12u;
}
static unsigned int exposure(void* self) {
    return self ? 13u : 14u;
}
static void close_camera(void* self) {
    setenv("ORBEK_TEST_CAMERA", self == &shots ? "closed" : "closed wrongly", 1);
}

__attribute__((visibility("default"))) int orbekOpenCamera(unsigned int interface_version, const char* name,
                                                           orbekCamera* camera, char* error) {
    if (interface_version != ORBEK_CAMERA_INTERFACE) return 1;
    strncpy(name_of_camera, name, sizeof name_of_camera - 1);
    if (strcmp(name, "refused") == 0) {
        strcpy(error, "it is unplugged");
        return 1;
    }
    if (strcmp(name, "silent") == 0) return 1;
    if (strcmp(name, "empty") == 0) return 0;
    camera->self = &shots;
    camera->grab = shoot;
    if (strcmp(name, "plain") == 0) return 0;
    camera->take = take;
    camera->gain = gain;
    camera->exposure = exposure;
    camera->close = close_camera;
    return 0;
}
