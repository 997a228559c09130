package velmark5.demo;

/** Smooth pseudo-random functions, the same in every run. */
final class Noise {
  private Noise() {}

  /** An evenly spread value of 0 to 1 for a whole number. */
  static double hash(int n) {
    int h = n * 0x9E3779B1;
    h = (h ^ h >>> 15) * 0x85EBCA6B;
    h = (h ^ h >>> 13) * 0xC2B2AE35;
    return ((h ^ h >>> 16) & 0xFFFFFF) / (double) 0x1000000;
  }

  /** Values of 0 to 1 that change smoothly along x, one bump per unit. */
  static double smooth(int seed, double x) {
    int cell = (int) Math.floor(x);
    double t = x - cell;
    double eased = t * t * (3 - 2 * t);
    double a = hash(cell * 31 + seed * 7919);
    double b = hash((cell + 1) * 31 + seed * 7919);
    return a + (b - a) * eased;
  }

  /** Several octaves of smooth noise, 0 to 1: the outline of a hill. */
  static double fractal(int seed, double x, int octaves) {
    double sum = 0;
    double weight = 0.5;
    double total = 0;
    for (int i = 0; i < octaves; i++) {
      sum += smooth(seed + i, x) * weight;
      total += weight;
      weight *= 0.5;
      x *= 2.03;
    }
    return sum / total;
  }

  /** Values of 0 to 1 that change smoothly over a plane. */
  static double smooth(int seed, double x, double y) {
    int row = (int) Math.floor(y);
    double t = y - row;
    double a = smooth(seed + row * 57, x);
    double b = smooth(seed + (row + 1) * 57, x);
    return a + (b - a) * t * t * (3 - 2 * t);
  }

  /** Creases: octaves of noise folded at its middle, 0 to 1 with sharp crests at 1. */
  static double creased(int seed, double x, double y, int octaves) {
    double sum = 0;
    double weight = 0.5;
    for (int i = 0; i < octaves; i++) {
      double folded = 1 - Math.abs(2 * smooth(seed + i * 13, x, y) - 1);
      sum += folded * folded * weight;
      weight *= 0.5;
      x = x * 2.1 + 3.7;
      y = y * 2.1 + 1.3;
    }
    return sum;
  }
}
