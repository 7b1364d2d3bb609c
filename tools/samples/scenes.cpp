#include "scenes.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace Qel::Lumetra::ShellExt::Samples {
namespace {

struct Point {
  double x;
  double y;
};

/// Returns random points at least `apart` from each other, as many of `wanted` as fit.
std::vector<Point> Scatter(Random& random, int width, int height, double apart, int wanted) {
  std::vector<Point> points;
  for (int attempt = 0; attempt < wanted * 20 && static_cast<int>(points.size()) < wanted; ++attempt) {
    const Point point = {random.Uniform(0, width), random.Uniform(0, height)};
    const bool isFree = std::ranges::all_of(
        points, [&](const Point& other) { return Distance(point.x - other.x, point.y - other.y) >= apart; });
    if (isFree) points.push_back(point);
  }
  return points;
}

/// Adds a complex of `units` subunits around a hole, seen along its axis. A negative `weight` makes it dark.
void AddRingParticle(Picture& picture, Point centre, double radius, int units, double turn, double weight) {
  for (int i = 0; i < units; ++i) {
    const double angle = turn + static_cast<double>(i) / units;
    const double x = centre.x + radius * 0.62 * Cosine(angle);
    const double y = centre.y + radius * 0.62 * Sine(angle);
    const double size = radius * 0.5;
    picture.AddDisc(x, y, size, [&](double distance) { return weight * Bell(distance / size); });
  }
}

/// Adds the same complex seen from the side: two short stacks of bars.
void AddSideParticle(Picture& picture, Point centre, double radius, double turn, double weight) {
  for (int layer = -1; layer <= 1; layer += 2) {
    for (int i = -2; i <= 2; ++i) {
      const double along = i * radius * 0.3;
      const double across = layer * radius * 0.32;
      const double x = centre.x + along * Cosine(turn) - across * Sine(turn);
      const double y = centre.y + along * Sine(turn) + across * Cosine(turn);
      const double size = radius * 0.42;
      picture.AddDisc(x, y, size, [&](double distance) { return weight * 0.7 * Bell(distance / size); });
    }
  }
}

/// Adds the ring of a membrane with two leaflets.
void AddMembrane(Picture& picture, Point centre, double radius, double thickness, double weight) {
  const double reach = radius + 2 * thickness;
  picture.AddDisc(centre.x, centre.y, reach, [&](double distance) {
    return weight * (Bell(std::abs(distance - radius + thickness / 2) / (thickness * 0.6)) +
                     Bell(std::abs(distance - radius - thickness / 2) / (thickness * 0.6)));
  });
}

}  // namespace

Picture Micrograph(int width, int height, std::uint64_t seed) {
  Random random(seed);
  Picture picture(width, height, 0.55);
  // The ice is thicker on one side.
  picture.Fill([&](int x, int y) { return 0.62 - 0.10 * x / width - 0.05 * y / height; });
  picture.AddClouds(random, width / 5.0, 0.02);
  const double radius = width / 34.0;
  for (const Point& point : Scatter(random, width, height, radius * 2.6, 110)) {
    const double turn = random.Uniform();
    const double weight = -random.Uniform(0.13, 0.2);
    if (random.Uniform() < 0.6) {
      AddRingParticle(picture, point, radius, 7, turn, weight);
    } else {
      AddSideParticle(picture, point, radius, turn, weight);
    }
  }
  // A few crystals of ice on the specimen.
  for (const Point& point : Scatter(random, width, height, radius * 6, 4)) {
    const double size = random.Uniform(0.8, 1.6) * radius;
    picture.AddDisc(point.x, point.y, size,
                    [&](double distance) { return -0.35 * SmoothStep(size, size * 0.7, distance); });
  }
  picture.AddClouds(random, 3, 0.06);
  picture.AddNoise(random, 0.10);
  return picture;
}

Picture GridAtlas(int width, int height, std::uint64_t seed) {
  Random random(seed);
  constexpr int kSquares = 9;
  const double pitch = static_cast<double>(width) / kSquares;
  Picture brightness(kSquares + 2, kSquares + 2);
  brightness.Fill([&](int, int) {
    const double kind = random.Uniform();
    if (kind < 0.08) return 0.98;                       // torn: nothing absorbs the beam
    if (kind < 0.2) return random.Uniform(0.12, 0.25);  // thick ice
    return random.Uniform(0.45, 0.8);
  });
  Picture picture(width, height);
  picture.Fill([&](int x, int y) {
    // The grid is slightly rotated.
    const double u = (x + 0.12 * y) / pitch;
    const double v = (y - 0.12 * x) / pitch + 1;
    const int column = static_cast<int>(std::floor(u));
    const int row = static_cast<int>(std::floor(v));
    const double dx = std::abs(u - column - 0.5);
    const double dy = std::abs(v - row - 0.5);
    const double inside = SmoothStep(0.38, 0.34, std::max(dx, dy));
    const double ice = brightness.At(std::clamp(column, 0, kSquares + 1), std::clamp(row, 0, kSquares + 1));
    // Holes in the carbon film of each square.
    const double holeX = u * 6 - std::floor(u * 6) - 0.5;
    const double holeY = v * 6 - std::floor(v * 6) - 0.5;
    const double hole = 0.12 * SmoothStep(0.36, 0.26, Distance(holeX, holeY));
    const double edge = Distance(x - width / 2.0, y - height / 2.0) / (width / 2.0);
    return (0.05 + inside * (ice * 0.85 + hole)) * SmoothStep(1.04, 0.96, edge) + 0.02;
  });
  picture.AddClouds(random, width / 6.0, 0.04);
  picture.AddNoise(random, 0.015);
  return picture;
}

Picture CountedFrame(int width, int height, std::uint64_t seed) {
  Random random(seed);
  const Picture scene = Micrograph(width, height, seed + 1);
  Picture picture(width, height);
  picture.Fill([&](int x, int y) { return random.Count(60 * std::max(0.0, scene.At(x, y))); });
  return picture;
}

Picture ClassAverage(int width, int height, std::uint64_t seed) {
  Random random(seed);
  Picture picture(width, height, 0.5);
  const Point centre = {width / 2.0, height / 2.0};
  const double radius = width * 0.3;
  picture.AddClouds(random, width / 12.0, 0.05);
  picture.AddClouds(random, width / 30.0, 0.03);
  picture.AddDisc(centre.x, centre.y, radius * 1.7,
                  [&](double distance) { return -0.18 * Bell(distance / (radius * 1.7)); });
  AddRingParticle(picture, centre, radius, 7, 0.03, 0.5);
  AddRingParticle(picture, centre, radius * 0.62, 7, 0.03 + 1 / 14.0, 0.22);
  // The average is masked by a soft circle.
  picture.Fill([&](int x, int y) {
    const double distance = Distance(x - centre.x, y - centre.y) / (width / 2.0);
    return 0.5 + (picture.At(x, y) - 0.5) * SmoothStep(0.98, 0.86, distance);
  });
  return picture;
}

Picture TiltedView(int width, int height, double tilt, std::uint64_t seed) {
  Random random(seed);
  // Tilting foreshortens the specimen perpendicular to the axis, which is vertical.
  const double squeeze = std::sqrt(1 - 0.75 * tilt * tilt);
  const double middle = width / 2.0;
  const auto seenAt = [&](Point point, double depth) {
    return Point{middle + (point.x - middle) * squeeze + depth * tilt, point.y};
  };
  Picture picture(width, height, 0.7 - 0.15 * tilt * tilt);
  picture.Fill([&](int x, int y) {
    const double across = (x - middle) / squeeze + middle;
    const double border = width * (0.45 + 0.12 * Sine(y / (height * 1.3)) + 0.03 * Sine(y / (height * 0.31)));
    const double film = Bell(std::abs(across - border) / (width * 0.02)) +
                        Bell(std::abs(across - border - width * 0.035) / (width * 0.02));
    return picture.At(x, y) - 0.22 * SmoothStep(0, width * 0.05, border - across) - 0.2 * film;
  });
  for (const Point& point : Scatter(random, width / 2, height, width / 20.0, 60)) {
    const Point seen = seenAt(point, random.Uniform(-20, 20));
    const double size = width * 0.018;
    picture.AddDisc(seen.x, seen.y, size, [&](double distance) { return -0.14 * Bell(distance / size); });
  }
  for (const Point& point : Scatter(random, width, height, width / 9.0, 16)) {
    const Point seen = seenAt(point, random.Uniform(-25, 25));
    const double size = width * 0.017;
    picture.AddDisc(seen.x, seen.y, size,
                    [&](double distance) { return -0.55 * SmoothStep(size, size * 0.6, distance); });
  }
  Random shot(seed + static_cast<std::uint64_t>((tilt + 2) * 1000));
  picture.AddNoise(shot, 0.05 + 0.03 * tilt * tilt);
  return picture;
}

Picture TomogramSection(int width, int height, double depth, std::uint64_t seed) {
  Random random(seed);
  Picture picture(width, height, 0.62);
  picture.AddClouds(random, width / 8.0, 0.03);
  for (const Point& point : Scatter(random, width, height, width / 4.2, 12)) {
    const double radius = random.Uniform(0.07, 0.13) * width;
    const double fromMiddle = (depth - random.Uniform(0.25, 0.75)) * 2.2;
    const double cut = radius * std::sqrt(std::max(0.0, 1 - fromMiddle * fromMiddle));
    if (cut > radius * 0.25) {
      AddMembrane(picture, point, cut, width * 0.011, -0.26);
      AddMembrane(picture, point, cut * 0.55, width * 0.009, -0.16);
    }
  }
  for (const Point& point : Scatter(random, width, height, width / 16.0, 90)) {
    const double size = width * 0.022 * random.Uniform(0.6, 1.1);
    const double weight = -0.22 * Bell((depth - random.Uniform()) * 1.6);
    picture.AddDisc(point.x, point.y, size, [&](double distance) { return weight * Bell(distance / size); });
  }
  Random grain(seed + static_cast<std::uint64_t>(depth * 1000) + 7);
  picture.AddClouds(grain, 2.5, 0.05);
  picture.AddNoise(grain, 0.03);
  return picture;
}

Picture DiffractionPattern(int width, int height, std::uint64_t seed) {
  Random random(seed);
  const Point centre = {width * 0.5, height * 0.5};
  const double unit = width / 22.0;
  Picture picture(width, height);
  // Diffuse scattering around the beam, and rings of ice.
  picture.Fill([&](int x, int y) {
    const double distance = Distance(x - centre.x, y - centre.y) / unit;
    return 3.0 / (1 + 0.25 * distance * distance) + 0.35 * Bell(std::abs(distance - 5.5) / 0.5) +
           0.2 * Bell(std::abs(distance - 8.6) / 0.5);
  });
  for (int h = -12; h <= 12; ++h) {
    for (int k = -12; k <= 12; ++k) {
      const double x = centre.x + unit * (0.98 * h + 0.31 * k);
      const double y = centre.y + unit * (-0.22 * h + 0.84 * k);
      const double distance = Distance(x - centre.x, y - centre.y) / (width / 2.0);
      if (distance > 0.97) continue;
      const double factor = random.Uniform(0.03, 1);
      const double strength = 12 * factor * factor * Bell(distance * 0.95) + 0.15;
      const double size = 3.2 + 1.2 * factor;
      picture.AddDisc(x, y, size, [&](double r) { return strength * Bell(r / size); });
    }
  }
  picture.AddDisc(centre.x, centre.y, unit * 1.1,
                  [&](double distance) { return 10 * Bell(distance / (unit * 1.1)); });
  picture.AddNoise(random, 0.06);
  // The beam stop comes from the top.
  picture.Fill([&](int x, int y) {
    const double side = std::abs(x - centre.x) / (unit * 0.42);
    const double tip = Distance(x - centre.x, y - centre.y) / (unit * 0.75);
    const bool hidden = tip < 1 || (side < 1 && y < centre.y);
    return hidden ? 0.05 * picture.At(x, y) : std::max(0.0, picture.At(x, y));
  });
  return picture;
}

Picture SpectrumImage(int width, int height, std::uint64_t seed) {
  Random random(seed);
  Picture picture(width, height);
  picture.Fill([&](int x, int y) {
    const double energy = static_cast<double>(x) / width;
    const double layer =
        SmoothStep(0.42, 0.52, static_cast<double>(y) / height + 0.02 * Sine(3.0 * y / height));
    const double background = 0.9 / (1 + 9 * energy * energy * 2);
    const auto edge = [&](double onset, double jump) {
      const double above = energy - onset;
      return above < 0 ? 0
                       : jump * (SmoothStep(0, 0.02, above) / (1 + 6 * above) + 0.9 * Bell(above / 0.035));
    };
    const double oxide = edge(0.30, 0.35) + edge(0.62, 0.3) + 0.25 * edge(0.66, 0.5);
    const double metal = edge(0.46, 0.5) + edge(0.51, 0.28);
    return random.Count(400 * (background + oxide * (1 - layer) + metal * layer));
  });
  return picture;
}

Picture AtomLattice(int width, int height, std::uint64_t seed) {
  Random random(seed);
  Picture picture(width, height, 0.08);
  picture.AddClouds(random, width / 4.0, 0.03);
  const double pitch = width / 17.0;
  for (int side = 0; side < 2; ++side) {
    const double turn = side == 0 ? 0.018 : 0.072;
    for (int row = -26; row <= 26; ++row) {
      for (int column = -26; column <= 26; ++column) {
        for (int kind = 0; kind < 2; ++kind) {
          const double u = (column + 0.5 * kind) * pitch;
          const double v = (row + 0.5 * kind) * pitch;
          const double x = width / 2.0 + u * Cosine(turn) - v * Sine(turn) + random.Normal() * 0.35;
          const double y = height / 2.0 + u * Sine(turn) + v * Cosine(turn) + random.Normal() * 0.35;
          const double boundary = width * 0.52 + (y - height / 2.0) * 0.25;
          if ((side == 0) != (x < boundary)) continue;
          const double size = pitch * (kind == 0 ? 0.42 : 0.34);
          const double weight = kind == 0 ? 0.85 : 0.4;
          picture.AddDisc(x, y, size, [&](double distance) { return weight * Bell(distance / size); });
        }
      }
    }
  }
  // A scan line is sometimes brighter than its neighbours.
  for (int y = 0; y < height; ++y) {
    const double flicker = 0.02 * random.Normal();
    for (int x = 0; x < width; ++x) picture.At(x, y) += flicker;
  }
  picture.AddNoise(random, 0.05);
  return picture;
}

Picture Nanoparticles(int width, int height, std::uint64_t seed) {
  Random random(seed);
  Picture picture(width, height, 0.75);
  picture.AddClouds(random, width / 3.0, 0.08);
  picture.AddClouds(random, width / 9.0, 0.05);
  for (const Point& point : Scatter(random, width, height, width / 26.0, 120)) {
    const double size = width * random.Uniform(0.010, 0.034);
    const double weight = -random.Uniform(0.18, 0.5);
    const double turn = random.Uniform();
    picture.AddDisc(point.x, point.y, size, [&](double distance) {
      return weight * std::sqrt(std::max(0.0, 1 - distance * distance / (size * size)));
    });
    // A facet of the crystal: a bright fringe.
    picture.AddDisc(point.x + size * 0.2 * Cosine(turn), point.y + size * 0.2 * Sine(turn), size * 0.5,
                    [&](double distance) { return 0.06 * Bell(distance / (size * 0.5)); });
  }
  picture.AddNoise(random, 0.03);
  return picture;
}

ComplexPicture Transform(int width, int height, std::uint64_t seed) {
  Random random(seed);
  ComplexPicture transform = {Picture(width, height), Picture(width, height)};
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      const double kx = (x - width / 2.0) / (width / 2.0);
      const double ky = (y - height / 2.0) / (height / 2.0);
      const double square = kx * kx + ky * ky;
      // Defocus that is stronger in one direction turns the rings into ellipses.
      const double astigmatism = 1 + 0.08 * (kx * kx - ky * ky) / (square + 1e-9);
      const double rings = Sine(5.5 * square * astigmatism + 0.02);
      const double envelope = 1 / (1 + 9 * square * square);
      const double amplitude = 1000 * (std::abs(rings) * envelope * 0.5 + 0.035) / (0.06 + square);
      transform.real.At(x, y) = amplitude * random.Normal();
      transform.imaginary.At(x, y) = amplitude * random.Normal();
    }
  }
  return transform;
}

ElementMaps ElementMap(int width, int height, std::uint64_t seed) {
  Random random(seed);
  ElementMaps maps = {Picture(width, height, 0.04), Picture(width, height, 0.04),
                      Picture(width, height, 0.1)};
  maps.blue.AddClouds(random, width / 5.0, 0.08);
  for (const Point& point : Scatter(random, width, height, width / 7.0, 26)) {
    const double size = width * random.Uniform(0.05, 0.1);
    maps.red.AddDisc(point.x, point.y, size,
                     [&](double distance) { return 0.75 * SmoothStep(size * 0.75, size * 0.5, distance); });
    maps.green.AddDisc(point.x, point.y, size, [&](double distance) {
      return 0.7 * SmoothStep(size, size * 0.9, distance) * SmoothStep(size * 0.5, size * 0.72, distance);
    });
  }
  for (const Point& point : Scatter(random, width, height, width / 12.0, 30)) {
    const double size = width * random.Uniform(0.012, 0.03);
    maps.blue.AddDisc(point.x, point.y, size, [&](double distance) { return 0.8 * Bell(distance / size); });
    maps.green.AddDisc(point.x, point.y, size, [&](double distance) { return 0.3 * Bell(distance / size); });
  }
  // Few quanta are counted per pixel.
  for (Picture* map : {&maps.red, &maps.green, &maps.blue}) {
    map->Fill([&](int x, int y) { return random.Count(40 * std::max(0.0, map->At(x, y))) / 40.0; });
  }
  return maps;
}

}  // namespace Qel::Lumetra::ShellExt::Samples
