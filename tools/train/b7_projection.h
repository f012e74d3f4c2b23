#pragma once

#include "b7_factors.h"
#include "train/b7_samples.h"

namespace Train {

/// Learns the projection of B7 from the train part of raw vectors.
///
/// The face is divided into 16 regions; in each one a discriminant analysis over raw components of all scales
/// finds the directions in which persons differ most in proportion to the pictures of one person, of all
/// regions together the 5912 with the largest ratios. On those a probabilistic linear discriminant analysis
/// follows (Prince and Elder 2007; Ioffe 2006): what differs between pictures of one person is whitened (with
/// a share of its mean variance added), and directions are weighted with b / (1 + b), where b is their
/// variance between persons after that, estimated without bias from pairs of different pictures. A constant
/// is added to these weights: it keeps the whitened product of all directions, which holds what is alike in
/// very similar pictures, beside the learned ones. The root of this metric becomes a diagonal and a product
/// of low rank.
///
/// Features are scaled to a share of the magnitudes that a record keeps, beyond which it cuts them, and their
/// components are ordered by variance, as the magnitudes of the record's blocks are.
Orbek::Models::B7Factors learnProjection(const RawVectors& raw);

} // namespace Train
