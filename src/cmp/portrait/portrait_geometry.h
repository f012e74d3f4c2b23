#pragma once

#include "cmp/face/face.h"

/// The upright portraits that measures are taken on, and the windows of the standard one.

namespace Cmp::Portrait {

/// A square portrait with the eyes at equal height, mirror images of each other about the vertical centre
/// line.
struct PortraitFormat {
    unsigned int side;
    FNPos eye; ///< the one at the smaller x
};

inline constexpr PortraitFormat standardPortrait{108, {38, 32}};
inline constexpr PortraitFormat genderPortrait{160, {56.0f, 58.6666f}};
inline constexpr PortraitFormat agePortrait{160, {48.0f, 58.6666f}};
inline constexpr PortraitFormat ethnicityPortrait{64, {16.0f, 21.3333f}};

/// Windows of the standard portrait.
namespace Window {

inline constexpr FNBox glasses{18, 12, 90, 52};
inline constexpr FNBox pose{0, 0, 108, 108};
inline constexpr FNBox head{14, 0, 94, 96};
inline constexpr FNBox mouth{14, 34, 94, 98};
inline constexpr FNBox exposure{22, 11, 86, 75};
inline constexpr FNBox sharpness{14, 3, 94, 83};
inline constexpr FNBox eye0{62, 24, 78, 40};
inline constexpr FNBox eye1{30, 24, 46, 40};
inline constexpr FNBox lighting{22, 11, 86, 75};

} // namespace Window

/// The portrait of a face, pixels from 0 to 1; black beyond the image. The eyes are those of the eyes finder
/// or else those that the face finder's location implies.
/// @throws FNEBadFunCall if neither both eyes nor a location are there; FNEBadArg if the eyes are not apart
/// in x.
FNImage<float> portraitOf(const Face& face, const PortraitFormat& format);

/// The pixels of a box that lies inside of the image.
FNImage<float> windowOf(const FNImage<float>& portrait, const FNBox& box);

} // namespace Cmp::Portrait
