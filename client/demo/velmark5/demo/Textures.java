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

  /** Light grains that let the colour of the face through. */
  static final int GRAIN = 2;

  /** Leaves with dark gaps, tinted by the face. */
  static final int LEAVES = 3;

  /** Upright furrows. */
  static final int BARK = 4;

  /** Plaster between beams. */
  static final int TIMBER = 5;

  /** Rows of shingles. */
  static final int SHINGLES = 6;

  /** Boards. */
  static final int PLANKS = 7;

  /** Blocks of stone. */
  static final int BLOCKS = 8;

  /** Waves that drift. */
  static final int WAVES = 9;

  /** Streaks of falling water with gaps between. */
  static final int FALL = 10;

  /** A glowing veil that drifts. */
  static final int VEIL = 11;

  /** Light on the ground around a lamp: a disc that fades to nothing. */
  static final int GLOW = 12;

  /** A window by day. */
  static final int DARK_WINDOW = 13;

  /** A window by night. */
  static final int LIT_WINDOW = 14;

  /** Flames that rise. */
  static final int FLAMES = 15;

  /** A river's waves, which run faster. */
  static final int STREAM = 16;

  /** Puffs of smoke or spray: the first of three, each thinner than the one before. */
  static final int PUFF = 17;

  /** Trodden or washed ground along a line: whole in the middle, frayed at the left and the right edge. */
  static final int TRACK = 20;

  /** Trodden ground around a place, frayed at its rim. */
  static final int YARD = 21;

  /** How many there are. */
  static final int COUNT = 22;

  private static final int UNLIT = 6;

  @Override
  public TextureMetrics metrics(int id) {
    TextureMetrics metrics = TextureMetrics.PLAIN.withAverage(Hsl.ofRgb(0x6A7180));
    return switch (id) {
      case SIGNS, LIT_WINDOW -> metrics.withLighting(UNLIT);
      case WAVES -> metrics.withScroll(3, -2);
      case STREAM -> metrics.withScroll(0, -26);
      case FALL -> metrics.withScroll(0, -72).withAlpha(TextureMetrics.Alpha.BLENDED);
      case VEIL -> metrics.withScroll(6, 14).withAlpha(TextureMetrics.Alpha.BLENDED).withLighting(UNLIT);
      case GLOW -> metrics.withAlpha(TextureMetrics.Alpha.BLENDED).withLighting(UNLIT).withWrap(false, false);
      case PUFF, PUFF + 1, PUFF + 2, YARD -> metrics.withAlpha(TextureMetrics.Alpha.BLENDED).withWrap(false, false);
      case TRACK -> metrics.withAlpha(TextureMetrics.Alpha.BLENDED);
      case FLAMES -> metrics.withScroll(0, 100).withAlpha(TextureMetrics.Alpha.BLENDED).withLighting(UNLIT);
      default -> metrics;
    };
  }

  @Override
  public int[] pixels(int id) {
    int[] pixels = new int[SIZE * SIZE];
    for (int i = 0; i < pixels.length; i++) {
      pixels[i] = pixel(id, i % SIZE, i / SIZE);
    }
    return pixels;
  }

  private static int pixel(int id, int x, int y) {
    return switch (id) {
      case SIGNS -> sign(x, y);
      case GRAIN -> grey(0.80 + 0.30 * (repeating(5, x, y, 0.09) - 0.5) + 0.10 * (speck(id, x, y) - 0.5));
      case LEAVES -> leaves(x, y);
      case BARK -> grey(0.45 + 0.55 * repeating(17, x * 2.0, y * 0.5, 0.09));
      case TIMBER -> timber(x, y);
      case SHINGLES -> shingles(x, y);
      case PLANKS -> planks(x, y);
      case BLOCKS -> blocks(x, y);
      case WAVES, STREAM -> waves(x, y);
      case FALL -> fall(x, y);
      case VEIL -> veil(x, y);
      case GLOW -> glow(x, y);
      case DARK_WINDOW, LIT_WINDOW -> window(x, y, id == LIT_WINDOW);
      case FLAMES -> flames(x, y);
      case PUFF, PUFF + 1, PUFF + 2 -> puff(x, y, 0.62 - 0.22 * (id - PUFF));
      case TRACK -> frayed(1 - Math.abs(x - 63.5) / 63.5, x, y);
      case YARD -> frayed(1 - Math.hypot(x - 63.5, y - 63.5) / 63.5, x, y);
      default -> rock(x, y);
    };
  }

  private static int grey(double level) {
    int v = (int) (255 * Math.max(0, Math.min(1, level)));
    return Colour.rgb(v, v, v);
  }

  private static double speck(int seed, int x, int y) {
    return Noise.hash(seed * 40503 + y * SIZE + x);
  }

  /** Scattered strokes, the later ones brighter. */
  private static int leaves(int x, int y) {
    double light = 0.42;
    for (int i = 0; i < 170; i++) {
      double dx = wrapped(x - SIZE * Noise.hash(i * 4 + 900));
      double dy = wrapped(y - SIZE * Noise.hash(i * 4 + 901));
      double angle = Math.PI * Noise.hash(i * 4 + 902);
      double along = (dx * Math.cos(angle) + dy * Math.sin(angle)) / 11;
      double across = (dy * Math.cos(angle) - dx * Math.sin(angle)) / 5.5;
      if (along * along + across * across < 1) {
        light = 0.50 + 0.50 * i / 170 - 0.10 * Math.abs(across);
      }
    }
    return grey(light);
  }

  private static double wrapped(double d) {
    return d - SIZE * Math.rint(d / SIZE);
  }

  private static int timber(int x, int y) {
    boolean beam = x < 9 || x >= 119 || y < 10 || y >= 118 || Math.abs(x - y * 0.55 - 28) < 5.5 || Math.abs(y - 62) < 4;
    double rough = repeating(23, x, y, 0.07);
    return beam
        ? Colour.mix(0xFF3B2615, 0xFF6B4A2C, rough)
        : Colour.mix(0xFFCDBD9B, 0xFFF6EBD0, rough * 1.2);
  }

  private static int shingles(int x, int y) {
    int row = y / 16;
    int shifted = (x + (row % 2) * 8) % SIZE;
    double edge = Math.min(1, Math.min(shifted % 16, 15 - shifted % 16) / 1.5) * (y % 16 == 15 ? 0.35 : 1);
    double tone = 0.62 + 0.30 * Noise.hash(row * 8 + shifted / 16 + 300) + 0.10 * (y % 16) / 16.0;
    return grey(tone * (0.45 + 0.55 * edge) * (0.86 + 0.28 * (repeating(29, x, y, 0.09) - 0.4)));
  }

  private static int planks(int x, int y) {
    int board = y / 16;
    double grain = repeating(37, x * 0.5, y * 2.0, 0.10);
    double edge = y % 16 < 2 || (x + board * 53) % SIZE < 2 ? 0.45 : 1;
    return Colour.scale(Colour.mix(0xFF6E4E30, 0xFFB98F60, grain * 0.8 + 0.3 * Noise.hash(board + 77)), edge);
  }

  private static int blocks(int x, int y) {
    int row = y / 32;
    int shifted = (x + (row % 2) * 32) % SIZE;
    double edge = Math.min(Math.min(shifted % 64, 63 - shifted % 64), Math.min(y % 32, 31 - y % 32));
    double tone = 0.66 + 0.22 * Noise.hash(row * 2 + shifted / 64 + 410) + 0.35 * (repeating(41, x, y, 0.08) - 0.5);
    return grey(tone * (edge < 2 ? 0.55 : 1));
  }

  private static int waves(int x, int y) {
    double crest = repeating(53, x, y, 0.045);
    int water = Colour.mix(0xFF1D5A74, 0xFF4FA3B4, crest * 1.25);
    return Colour.mix(water, 0xFFE9FBFF, Math.max(0, crest * 5 - 3.55));
  }

  private static int fall(int x, int y) {
    double streak = repeating(59, x * 2.0, y * 0.35, 0.055);
    return Colour.withAlpha(Colour.mix(0xFF9CCFE0, 0xFFFFFFFF, streak * 1.3), (int) (170 + 85 * Math.min(1, streak * 1.5)));
  }

  private static int veil(int x, int y) {
    double swirl = repeating(61, x, y, 0.04);
    int light = Colour.mix(0xFF2450D8, 0xFF66FFE8, swirl * 1.5 - 0.2);
    return Colour.withAlpha(Colour.mix(light, 0xFFFFFFFF, Math.max(0, swirl * 4 - 2.7)), (int) (120 + 130 * swirl));
  }

  private static int glow(int x, int y) {
    double far = Math.hypot(x - 63.5, y - 63.5) / 63;
    double light = Math.pow(Math.max(0, 1 - far), 1.6);
    return Colour.argb((int) (150 * light), 255, 255, 255);
  }

  /** Grains of earth, for 0 at the edge of what they cover to 1 in its middle. */
  private static int frayed(double inside, int x, int y) {
    double rough = repeating(73, x, y, 0.08);
    double whole = Island.step(0, 1, inside * 2.6 + 1.6 * (rough - 0.55));
    int earth = grey(0.74 + 0.34 * (repeating(5, x, y, 0.11) - 0.4) + 0.12 * (speck(TRACK, x, y) - 0.5));
    return Colour.withAlpha(earth, (int) (255 * whole * Math.min(1, inside * 6)));
  }

  private static int puff(int x, int y, double dense) {
    double rough = Noise.creased(71, x * 0.05, y * 0.05, 4);
    double far = Math.hypot(x - 63.5, y - 63.5) / 62 + 0.45 * (rough - 0.5);
    double alpha = Math.max(0, Math.min(1, 1.15 - 1.15 * far));
    alpha *= Math.max(0, Math.min(1, (63 - Math.max(Math.abs(x - 63.5), Math.abs(y - 63.5))) / 8));
    return Colour.withAlpha(grey(0.86 + 0.14 * rough), (int) (255 * dense * alpha * alpha));
  }

  private static int window(int x, int y, boolean lit) {
    boolean frame = x < 12 || x >= 116 || y < 12 || y >= 116 || Math.abs(x - 64) < 6 || Math.abs(y - 60) < 6;
    if (frame) {
      return lit ? 0xFF5A3A1C : 0xFF4A3220;
    }
    double high = y / 128.0;
    return lit
        ? Colour.mix(0xFFFFE9A8, 0xFFFF9E3A, high + 0.15 * (speck(3, x, y) - 0.5))
        : Colour.mix(0xFF9FB8C8, 0xFF2C3A48, Math.min(1, high * 1.3));
  }

  private static int flames(int x, int y) {
    double heat = repeating(67, x, y, 0.06);
    return Colour.withAlpha(Colour.mix(0xFFFF5A10, 0xFFFFF0A0, heat * 1.5 - 0.2), (int) (255 * Math.min(1, heat * 1.6)));
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
