// Drawn pictures of electron-microscopy subjects. Each function draws one kind of picture, with values from
// about 0 to 1 unless its comment says otherwise. The same seed gives the same picture.
#pragma once

#include <cstdint>
#include <vector>

#include "picture.h"

namespace Qel::Lumetra::ShellExt::Samples {

/// Draws macromolecules in a thin layer of ice: dark particles in strong noise.
Picture Micrograph(int width, int height, std::uint64_t seed);

/// Draws a whole specimen grid at low magnification: squares between bars, some of them torn.
Picture GridAtlas(int width, int height, std::uint64_t seed);

/// Draws single electrons that a detector counts: small whole numbers.
Picture CountedFrame(int width, int height, std::uint64_t seed);

/// Draws the average of many images of a ring-shaped complex.
Picture ClassAverage(int width, int height, std::uint64_t seed);

/// Draws the edge of a cell with gold beads, tilted by `tilt` (-1 to 1).
Picture TiltedView(int width, int height, double tilt, std::uint64_t seed);

/// Draws a section through vesicles with double membranes at height `depth` (0 to 1).
Picture TomogramSection(int width, int height, double depth, std::uint64_t seed);

/// Draws reflections of a crystal and a beam stop. The strongest are a thousand times as strong as the
/// weakest.
Picture DiffractionPattern(int width, int height, std::uint64_t seed);

/// Draws a line of energy-loss spectra across an interface: energy to the right, position downwards.
Picture SpectrumImage(int width, int height, std::uint64_t seed);

/// Draws a scanned image of two kinds of atom columns with a grain boundary.
Picture AtomLattice(int width, int height, std::uint64_t seed);

/// Draws catalyst particles on carbon in bright field.
Picture Nanoparticles(int width, int height, std::uint64_t seed);

/// The transform of a micrograph, with the rings of its defocus.
struct ComplexPicture {
  Picture real;
  Picture imaginary;
};
ComplexPicture Transform(int width, int height, std::uint64_t seed);

/// The amounts of three elements at each position.
struct ElementMaps {
  Picture red;
  Picture green;
  Picture blue;
};
ElementMaps ElementMap(int width, int height, std::uint64_t seed);

}  // namespace Qel::Lumetra::ShellExt::Samples
