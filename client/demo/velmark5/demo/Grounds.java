package velmark5.demo;

import java.util.List;
import velmark5.Hsl;
import velmark5.Material;
import velmark5.Mesh;
import velmark5.TextureMapping;

/** The meshes of the land and the water around it, and what lies flat on the land. All have the island's middle as origin. */
final class Grounds {
  /** Half the side of the square of land. */
  static final double REACH = 3456;

  private static final int TILE = 96;
  private static final int TILES = (int) (2 * REACH) / TILE;

  private Grounds() {}

  /** The land in one piece: small tiles, their corners moved about so that no grid shows. */
  static Mesh land() {
    Sculptor s = new Sculptor();
    Sculptor origin = s.at(0, 0, 0);
    lengthenAxis(s);
    TextureMapping grain = origin.groundPlane(300);
    TextureMapping rock = origin.groundPlane(420);
    int[][] grid = new int[TILES + 1][TILES + 1];
    double[][][] places = new double[TILES + 1][TILES + 1][];
    for (int row = 0; row <= TILES; row++) {
      for (int column = 0; column <= TILES; column++) {
        int seed = row * 131 + column;
        double x = column * TILE - REACH + (Noise.hash(seed) - 0.5) * TILE * 0.55;
        double z = row * TILE - REACH + (Noise.hash(seed + 77777) - 0.5) * TILE * 0.55;
        places[row][column] = new double[] {x, z};
        grid[row][column] = s.corner(x, Island.height(x, z), z);
      }
    }
    for (int row = 0; row < TILES; row++) {
      for (int column = 0; column < TILES; column++) {
        int a = grid[row][column];
        int b = grid[row][column + 1];
        int c = grid[row + 1][column + 1];
        int d = grid[row + 1][column];
        double[] pa = places[row][column];
        double[] pb = places[row][column + 1];
        double[] pc = places[row + 1][column + 1];
        double[] pd = places[row + 1][column];
        if ((row + column) % 2 == 0) {
          tile(s, a, b, c, pa, pb, pc, grain, rock);
          tile(s, a, c, d, pa, pc, pd, grain, rock);
        } else {
          tile(s, a, b, d, pa, pb, pd, grain, rock);
          tile(s, b, c, d, pb, pc, pd, grain, rock);
        }
      }
    }
    return s.build();
  }

  /**
   * Whether a model gets fog follows from the ends of its axis. What spreads as far as the land has a very long one, so
   * that an end of it lies in the fog from nearly everywhere.
   */
  private static void lengthenAxis(Sculptor s) {
    s.corner(0, 20000, 0);
    s.corner(0, -20000, 0);
  }

  private static void tile(Sculptor s, int a, int b, int c, double[] pa, double[] pb, double[] pc, TextureMapping grain,
      TextureMapping rock) {
    double x = (pa[0] + pb[0] + pc[0]) / 3;
    double z = (pa[1] + pb[1] + pc[1]) / 3;
    double h = Island.height(x, z);
    if (h < -168) {
      return;
    }
    double steep = Island.slope(x, z);
    boolean bank = h < 125 && Island.riverDistance(x, z) < 260;
    boolean rocky = steep > 0.95 && !bank || h > 760;
    int rgb = colour(x, z, h, bank ? 0 : steep);
    s.face(a, b, c, x, -1e5, z, Material.of(Hsl.ofRgb(rgb)).textured(rocky ? Textures.ROCK : Textures.GRAIN, rocky ? rock : grain));
  }

  private static int colour(double x, double z, double h, double steep) {
    double patch = Noise.smooth(91, x / 240 + 50, z / 240 + 50);
    double fine = Noise.hash((int) (x * 3) * 7919 + (int) (z * 3)) - 0.5;
    if (h > 1010 + 160 * patch && steep < 2.3) {
      return 0xFFFFFF;
    }
    if (steep > 0.95 || h > 900) {
      return velmark5.Colour.mix(0xFFA9A39A, 0xFFE0D8CC, patch + fine * 0.5);
    }
    if (h < -8) {
      return velmark5.Colour.mix(0xFFD8C890, 0xFF2E6070, Math.min(1, -h / 110));
    }
    if (Island.riverDistance(x, z) < 62 && h < 100) {
      return velmark5.Colour.mix(0xFFB4A878, 0xFF98986A, patch);
    }
    if (h < 24 + 14 * patch) {
      return velmark5.Colour.mix(0xFFE8D6A0, 0xFFF2E4B8, patch + fine * 0.4);
    }
    double worn = Island.pathDistance(x, z);
    double square = Math.hypot(x - Island.VILLAGE_X, z - Island.VILLAGE_Z);
    if (worn < 42 || square < 190 + 60 * patch) {
      return velmark5.Colour.mix(0xFFCFAE7C, 0xFFBF9A68, patch + fine * 0.4);
    }
    int meadow = velmark5.Colour.mix(0xFF6E9C3C, 0xFF9CB84E, patch * 1.3 - 0.1 + fine * 0.22);
    return h > 330 ? velmark5.Colour.mix(meadow, 0xFF7F9658, Math.min(1, (h - 330) / 300)) : meadow;
  }

  /** The sea, but for the cells that the land hides. */
  static Mesh sea() {
    Sculptor s = new Sculptor();
    lengthenAxis(s);
    TextureMapping waves = s.at(0, 0, 0).groundPlane(520);
    Material water = Carpentry.plain(0xFFFFFF, Textures.WAVES).textured(Textures.WAVES, waves).transparent(70);
    // Small cells where the camera comes near, large ones out to the fog.
    int cells = 64;
    double[] lines = new double[cells + 1];
    for (int i = 0; i <= cells; i++) {
      int from = i - cells / 2;
      lines[i] = from * 176 + Math.signum(from) * Math.max(0, Math.abs(from) - 20) * 250;
    }
    int[][] grid = new int[cells + 1][cells + 1];
    for (int row = 0; row <= cells; row++) {
      for (int column = 0; column <= cells; column++) {
        grid[row][column] = s.corner(lines[column], 0, lines[row]);
      }
    }
    for (int row = 0; row < cells; row++) {
      for (int column = 0; column < cells; column++) {
        if (Island.inland((lines[column] + lines[column + 1]) / 2, (lines[row] + lines[row + 1]) / 2) < 330) {
          s.strip(
              new int[] {grid[row][column], grid[row][column + 1]},
              new int[] {grid[row + 1][column], grid[row + 1][column + 1]},
              water);
        }
      }
    }
    return s.build();
  }

  /** The river below the fall. */
  static Mesh river() {
    Sculptor s = new Sculptor();
    List<double[]> course = Island.RIVER;
    int count = course.size();
    int[][] rows = new int[4][count];
    for (int i = 0; i < count; i++) {
      double[] p = course.get(i);
      double[] q = course.get(Math.min(i + 1, count - 1));
      double[] o = course.get(Math.max(i - 1, 0));
      double dx = q[0] - o[0];
      double dz = q[1] - o[1];
      double length = Math.hypot(dx, dz);
      for (int k = 0; k < 4; k++) {
        double side = (k - 1.5) / 1.5 * (i < 4 ? 150 - 8 * i * i : 105);
        rows[k][i] = s.corner(p[0] - dz / length * side, p[2], p[1] + dx / length * side);
      }
    }
    Material water = Carpentry.plain(0xFFFFFF, Textures.STREAM).textured(Textures.STREAM, s.groundPlane(260)).transparent(80);
    for (int k = 0; k < 3; k++) {
      s.strip(rows[k], rows[k + 1], water);
    }
    return s.build();
  }

  /** The sheet of the waterfall, one behind the other. */
  static Mesh fall() {
    Sculptor s = new Sculptor();
    double top = Island.height(Island.FALL_X, 1400) + 12;
    for (int sheet = 0; sheet < 2; sheet++) {
      double wide = sheet == 0 ? 78 : 60;
      int rows = 8;
      double[][] edge = new double[rows + 1][];
      for (int i = 0; i <= rows; i++) {
        double t = i / (double) rows;
        edge[i] = new double[] {top + (80 - top) * t, 1392 - (125 + 40 * sheet) * Math.sqrt(t), wide + 26 * t};
      }
      sheet(s, edge);
    }
    // The steps above it, down the mountain's side.
    double[][] steps = new double[6][];
    for (int i = 0; i < steps.length; i++) {
      double z = 1362 + 42 * (steps.length - 1 - i);
      double up = 0;
      for (int k = -1; k <= 1; k++) {
        up = Math.max(up, Island.height(Island.FALL_X + 75 * k, z + 18));
      }
      steps[i] = new double[] {up + 34, z, 44 + 8 * i};
    }
    sheet(s, steps);
    return s.build();
  }

  /** Falling water between level edges: height, z and half the width of each, from the top down. */
  private static void sheet(Sculptor s, double[][] edges) {
    double x = Island.FALL_X;
    for (int i = 0; i + 1 < edges.length; i++) {
      double[] a = edges[i];
      double[] b = edges[i + 1];
      s.panel(
          new double[] {x - a[2], a[0], a[1], x - b[2], b[0], b[1], x + b[2], b[0], b[1], x + a[2], a[0], a[1]},
          Carpentry.plain(0xFFFFFF, Textures.FALL), 1, 1);
    }
  }

  /** A soft shadow around what stands at a place: four discs that follow the ground. */
  static void shadow(Sculptor s, double x, double z, double radius) {
    int sides = 14;
    for (int ring = 0; ring < 4; ring++) {
      double r = radius * (1.3 - 0.24 * ring);
      Material dark = Material.of(Hsl.of(0.6, 0.3, 0.02)).transparent(219);
      s.at(0, 0, 0);
      int middle = s.corner(x, Island.height(x, z) + 9, z);
      int[] rim = new int[sides];
      for (int i = 0; i < sides; i++) {
        double a = 2 * Math.PI * i / sides;
        double px = x + r * Math.cos(a);
        double pz = z + r * Math.sin(a);
        rim[i] = s.corner(px, Island.height(px, pz) + 9, pz);
      }
      for (int i = 0; i < sides; i++) {
        s.face(middle, rim[i], rim[(i + 1) % sides], x, -1e5, z, dark);
      }
    }
  }

  /** The light that a lamp throws on the ground, as a disc of its own. */
  static Mesh glow(double x, double z, double radius, int rgb) {
    Sculptor s = new Sculptor();
    int cells = 6;
    s.at(x, 0, z);
    var plane = new TextureMapping.Plane(
        s.corner(-radius, 0, radius), s.corner(radius, 0, radius), s.corner(-radius, 0, -radius));
    Material light = Material.of(Hsl.ofRgb(rgb)).textured(Textures.GLOW, plane);
    int[][] grid = new int[cells + 1][cells + 1];
    for (int row = 0; row <= cells; row++) {
      for (int column = 0; column <= cells; column++) {
        double dx = (column * 2.0 / cells - 1) * radius * 0.999;
        double dz = (row * 2.0 / cells - 1) * radius * 0.999;
        grid[row][column] = s.corner(dx, Island.height(x + dx, z + dz) + 13, dz);
      }
    }
    for (int row = 0; row < cells; row++) {
      s.strip(grid[row], grid[row + 1], light);
    }
    return s.build();
  }
}
