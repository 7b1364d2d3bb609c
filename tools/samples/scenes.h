// What an electron microscope delivers, drawn: each function makes one kind of picture, with values from
// about 0 to 1 unless it says otherwise. The same seed gives the same picture.
#pragma once

#include <cstdint>
#include <vector>

#include "picture.h"

namespace Qel::Lumetra::ShellExt::Samples {

/// Macromolecules in a thin layer of ice: dark particles in strong noise.
Picture Micrograph(int width, int height, std::uint64_t seed);

/// A whole specimen grid at low magnification: squares between bars, some of them torn.
Picture GridAtlas(int width, int height, std::uint64_t seed);

/// Single electrons counted by a detector: small whole numbers.
Picture CountedFrame(int width, int height, std::uint64_t seed);

/// The average of many images of a ring-shaped complex.
Picture ClassAverage(int width, int height, std::uint64_t seed);

/// A cell's edge with gold beads, tilted by `tilt` (-1 to 1).
Picture TiltedView(int width, int height, double tilt, std::uint64_t seed);

/// A section through vesicles with double membranes at height `depth` (0 to 1).
Picture TomogramSection(int width, int height, double depth, std::uint64_t seed);

/// Reflections of a crystal behind a beam stop. The strongest are a thousand times the weakest.
Picture DiffractionPattern(int width, int height, std::uint64_t seed);

/// A line of energy-loss spectra across an interface: energies to the right, positions downwards.
Picture SpectrumImage(int width, int height, std::uint64_t seed);

/// Columns of atoms in a scanned image, two kinds of them, with a grain boundary.
Picture AtomLattice(int width, int height, std::uint64_t seed);

/// Particles of a catalyst on carbon, in a bright field.
Picture Nanoparticles(int width, int height, std::uint64_t seed);

/// The transform of a micrograph, with the rings of its defocus.
struct ComplexPicture {
  Picture real;
  Picture imaginary;
};
ComplexPicture Transform(int width, int height, std::uint64_t seed);

/// How much of three elements there is at each place.
struct ElementMaps {
  Picture red;
  Picture green;
  Picture blue;
};
ElementMaps ElementMap(int width, int height, std::uint64_t seed);

}  // namespace Qel::Lumetra::ShellExt::Samples
