#pragma once

#include "fn/imagefile/image_limits.h"
#include "shapeimg/textured_point_set.h"

#include <iosfwd>
#include <string>

/// Reading of scans with their textures. docs/scan_formats.md tells the forms of the files.
///
/// In all of these functions, `name` is the file that the bytes come from: for messages, and to find the
/// texture near it. `removeOutliers` is passed to the point set. Unless said otherwise they throw FNEBadArg
/// for a damaged file, FNEBadFormat for one that exceeds the limits, FNEIOError if a file cannot be opened,
/// and what Fn::readImage() throws for the texture.
namespace ShapeImage {

/// Reads a scan of any format: names that end in "tif", "obj" and ".3d" (in either case) tell theirs, and
/// otherwise the first line does. An IGD or Siemens scan is read from the named file, not from the stream.
/// A grid of points whose format has no texture gets the picture that lies beside it under its name with the
/// ending of a picture, or else a black one.
/// @throws FNEBadArg for an unknown format.
TexturedPointSet readTexturedPointSet(std::istream& stream, bool removeOutliers, const std::string& name,
                                      const Fn::ImageLimits& limits = {});
/// @throws FNEBadArg also if there are no valid points.
TexturedPointSet readTexturedPointSet(const std::string& fileName, bool removeOutliers = false,
                                      const Fn::ImageLimits& limits = {});

/// A Wavefront mesh with its material.
TexturedPointSet readOBJFile(std::istream& stream, bool removeOutliers, const std::string& name,
                             const Fn::ImageLimits& limits = {});

/// A VRML 2.0 scene of indexed face sets. Transformations of nodes are not applied.
TexturedPointSet readVRMLFile(std::istream& stream, bool removeOutliers, const std::string& name,
                              const Fn::ImageLimits& limits = {});

/// A Siemens grid of vectors, with its texture beside it.
TexturedPointSet readSiemensData(std::istream& stream, bool removeOutliers, const std::string& name,
                                 const Fn::ImageLimits& limits = {});
TexturedPointSet readSiemensData(const std::string& fileName, bool removeOutliers = false,
                                 const Fn::ImageLimits& limits = {});

/// An IGD scan: a TIFF file of a texture and a range image, with the calibration of the camera.
TexturedPointSet readIGDScan(std::istream& stream, bool removeOutliers, const std::string& name,
                             const Fn::ImageLimits& limits = {});
TexturedPointSet readIGDScan(const std::string& fileName, bool removeOutliers = false,
                             const Fn::ImageLimits& limits = {});

} // namespace ShapeImage
