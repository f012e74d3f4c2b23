#pragma once

#include "cmp/face/face.h"
#include "kx/cut_box.h"

/// Cuts portraits to the token image of ISO/IEC 19794-5: the eyes stand level at fixed fractions of the
/// picture, a quarter of its width apart, and the picture is 4 wide to 3 high.
///
///     const Cmp::Face token = Kx::TokenFace::produceImage(face, 1, {192, 192, 192});
///
/// produceImage() keeps the scale of the image, produceMinimalImage() gives 240 by 320 pixels. Where the box
/// passes the border of the image, the picture has the padding's colour. An image whose eyes coincide is
/// returned as it is, with the eyes at the places of a token image of its size. Any number of threads may
/// call these functions.
namespace Kx::TokenFace {

/// The settings of a caller.
struct CropTokenImage : Padding {
    static std::string typeId() { return "CropToTokenImage"; }
    static Fn::Deployment::Type define();

    using Padding::Padding;
};

/// A gray face becomes one of 16 bits or of floats, every other one bgra32. It has both eyes, or else the
/// face finder's location, at the places that a token image has them.
/// @param paddingRatio greatest share of the picture that may be padding; 1 and above for any
/// @throws FNEBadArg for more padding, and for eyes that are no places in an image or too far apart;
/// FNEBadFunCall for a face without eyes
Cmp::Face produceImage(const Cmp::Face& face, float paddingRatio, const Fn::Bgra32& color);
Cmp::Face produceMinimalImage(const Cmp::Face& face, float paddingRatio, const Fn::Bgra32& color);

/// The same for images of `unsigned char`, `unsigned short`, `float` and Fn::Bgra32.
template <class T>
FNImage<T> produceImage(const FNImage<T>& image, FNPos left, FNPos right, float paddingRatio,
                        const T& padding);
template <class T>
FNImage<T> produceMinimalImage(const FNImage<T>& image, FNPos left, FNPos right, float paddingRatio,
                               const T& padding);

} // namespace Kx::TokenFace
