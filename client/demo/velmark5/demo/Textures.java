package velmark5.demo;

import velmark5.Colour;
import velmark5.Hsl;
import velmark5.TextureMetrics;
import velmark5.TextureSource;

/** The demo's textures, computed when the library asks for them. */
final class Textures implements TextureSource {
  /** Grey rock with cracks and lichen. */
  static final int ROCK = 0;

  /** Carved signs that shine, whatever the light. */
  static final int SIGNS = 1;

  /** How many there are. */
  static final int COUNT = 2;

  private static final int UNLIT = 6;

  @Override
  public TextureMetrics metrics(int id) {
    TextureMetrics metrics = TextureMetrics.PLAIN.withAverage(Hsl.ofRgb(0x6A7180));
    return id == SIGNS ? metrics.withLighting(UNLIT) : metrics;
  }

  @Override
  public int[] pixels(int id) {
    int[] pixels = new int[SIZE * SIZE];
    for (int i = 0; i < pixels.length; i++) {
      int x = i % SIZE;
      int y = i / SIZE;
      pixels[i] = id == SIGNS ? sign(x, y) : rock(x, y);
    }
    return pixels;
  }

  /** Noise that repeats: two samples a texture apart, faded over into each other along both axes. */
  private static double repeating(int seed, double x, double y, double scale) {
    double u = x / SIZE;
    double v = y / SIZE;
    double top = mix(Noise.creased(seed, x * scale, y * scale, 5), Noise.creased(seed, (x - SIZE) * scale, y * scale, 5), u);
    double low = mix(
        Noise.creased(seed, x * scale, (y - SIZE) * scale, 5),
        Noise.creased(seed, (x - SIZE) * scale, (y - SIZE) * scale, 5),
        u);
    return mix(top, low, v);
  }

  private static double mix(double a, double b, double amount) {
    return a + (b - a) * amount;
  }

  private static int rock(int x, int y) {
    double rough = repeating(31, x, y, 0.06);
    double crack = repeating(47, x, y, 0.035);
    int stone = Colour.mix(0xFF3A4152, 0xFFC4CAD6, rough * 1.7 - 0.35);
    stone = Colour.mix(stone, 0xFF14171F, Math.max(0, crack * 6 - 3.9));
    return Colour.mix(stone, 0xFF5C7A58, Math.max(0, repeating(83, x, y, 0.03) * 3 - 1.9));
  }

  /** Strokes on a grid, different in each cell, that glow into the dark around them. */
  private static int sign(int x, int y) {
    int cell = x / 32 + 4 * (y / 32);
    double px = x % 32 - 15.5;
    double py = y % 32 - 15.5;
    double nearest = 99;
    for (int stroke = 0; stroke < 3; stroke++) {
      double angle = Math.PI / 4 * (int) (8 * Noise.hash(cell * 9 + stroke));
      double along = px * Math.cos(angle) + py * Math.sin(angle);
      double beyond = Math.max(0, Math.max(-along - (stroke == 0 ? 10 : 0), along - 10));
      nearest = Math.min(nearest, Math.hypot(-px * Math.sin(angle) + py * Math.cos(angle), beyond));
    }
    double light = Math.min(1, 2.2 / (0.6 + nearest * nearest * 0.55));
    return Colour.mix(0xFF0B1A22, light > 0.8 ? 0xFFE8FFF4 : 0xFF38F0B0, light);
  }
}
