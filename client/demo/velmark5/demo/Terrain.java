package velmark5.demo;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.HashMap;
import java.util.LinkedHashSet;
import java.util.List;
import java.util.Map;
import java.util.Set;
import java.util.TreeMap;
import java.util.function.ToIntFunction;
import velmark5.Colour;
import velmark5.Hsl;
import velmark5.Material;
import velmark5.TextureMapping;

/**
 * The land as triangles: small tiles, their corners moved about so that no grid shows, cut along the lines where one
 * kind of ground meets the next, so that shores, banks and the feet of cliffs are smooth lines.
 */
final class Terrain {
  /** Half the side of the square of land. */
  static final double REACH = 3456;

  private static final double TILE = 108;
  private static final int TILES = (int) (2 * REACH / TILE);
  private static final int TILES_PER_PATCH = 11;

  /** Ground that lies deeper is not built: the sea above it lets nothing through. */
  private static final double DEEPEST = -168;

  // Kinds of ground, as bits of a face.
  private static final int GREEN = 1;
  private static final int ROCKY = 2;
  private static final int SNOWY = 4;
  private static final int NOTHING = 0;

  /** A value for a place at x, up, z that is positive on one side of a line over the land. */
  private interface Field {
    double at(double x, double up, double z);
  }

  /** A triangle between three points, with the bits of its kind. */
  private record Face(int a, int b, int c, int kind) {}

  private final List<double[]> points = new ArrayList<>();
  private List<Face> faces = new ArrayList<>();
  private final Map<Integer, List<Face>> byTile = new HashMap<>();

  Terrain() {
    layTiles();
    cut(NOTHING, (x, up, z) -> Island.riverDistance(x, z) - Island.RIVER_EDGE);
    cut(NOTHING, (x, up, z) -> Island.riverDistance(x, z) - Island.RIVER_BED);
    cut(GREEN, (x, up, z) -> up - 24 - 14 * patch(x, z));
    cut(ROCKY, Terrain::rockiness);
    cut(SNOWY, (x, up, z) -> Math.min(up - 1010 - 160 * patch(x, z), 400 * (2.3 - Island.slope(x, z))));
    for (Face face : faces) {
      for (int tile : tilesUnder(points.get(face.a), points.get(face.b), points.get(face.c))) {
        byTile.computeIfAbsent(tile, key -> new ArrayList<>()).add(face);
      }
    }
  }

  private static double patch(double x, double z) {
    return Noise.smooth(91, x / 240 + 50, z / 240 + 50);
  }

  private static double rockiness(double x, double up, double z) {
    double bank = Island.step(420, 250, Island.riverDistance(x, z)) * Island.step(1000, 880, z);
    return Math.max(Island.slope(x, z) - 0.95 - 2 * bank, (up - 830) / 100);
  }

  private int point(double x, double z) {
    points.add(new double[] {x, Island.height(x, z), z});
    return points.size() - 1;
  }

  private void layTiles() {
    int[][] grid = new int[TILES + 1][TILES + 1];
    for (int row = 0; row <= TILES; row++) {
      for (int column = 0; column <= TILES; column++) {
        int seed = row * 131 + column;
        grid[row][column] = point(
            column * TILE - REACH + (Noise.hash(seed) - 0.5) * TILE * 0.55,
            row * TILE - REACH + (Noise.hash(seed + 77777) - 0.5) * TILE * 0.55);
      }
    }
    for (int row = 0; row < TILES; row++) {
      for (int column = 0; column < TILES; column++) {
        int a = grid[row][column];
        int b = grid[row][column + 1];
        int c = grid[row + 1][column + 1];
        int d = grid[row + 1][column];
        boolean even = (row + column) % 2 == 0;
        lay(a, b, even ? c : d);
        lay(even ? a : b, c, d);
      }
    }
  }

  private void lay(int a, int b, int c) {
    if (Math.max(points.get(a)[1], Math.max(points.get(b)[1], points.get(c)[1])) > DEEPEST) {
      faces.add(new Face(a, b, c, 0));
    }
  }

  /**
   * Cuts every face along the line where a field is 0, and sets a bit in those on its positive side. Neighbours share
   * the points of their cuts, so no gap opens.
   */
  private void cut(int bit, Field field) {
    double[] values = new double[points.size()];
    for (int i = 0; i < values.length; i++) {
      double[] p = points.get(i);
      values[i] = field.at(p[0], p[1], p[2]);
    }
    pullOntoLine(values);
    Map<Long, Integer> cuts = new HashMap<>();
    List<Face> result = new ArrayList<>();
    for (Face face : faces) {
      int[] corners = {face.a, face.b, face.c};
      List<Integer> above = new ArrayList<>();
      List<Integer> below = new ArrayList<>();
      for (int i = 0; i < 3; i++) {
        int p = corners[i];
        int q = corners[(i + 1) % 3];
        if (values[p] >= 0) {
          above.add(p);
        }
        if (values[p] <= 0) {
          below.add(p);
        }
        if (values[p] * values[q] < 0) {
          long edge = (long) Math.min(p, q) << 32 | Math.max(p, q);
          int middle = cuts.computeIfAbsent(edge, key -> cross(p, q, field));
          above.add(middle);
          below.add(middle);
        }
      }
      fan(above, face.kind | bit, result);
      // A face that lies on the line as a whole counts once, as above.
      if (values[face.a] < 0 || values[face.b] < 0 || values[face.c] < 0) {
        fan(below, face.kind, result);
      }
    }
    faces = result;
  }

  /** Points very near to the line count as on it, so that no slivers are cut off. */
  private void pullOntoLine(double[] values) {
    for (Face face : faces) {
      int[] corners = {face.a, face.b, face.c};
      for (int i = 0; i < 3; i++) {
        int p = corners[i];
        int q = corners[(i + 1) % 3];
        if (values[p] * values[q] < 0) {
          double part = values[p] / (values[p] - values[q]);
          if (part < 0.12) {
            values[p] = 0;
          } else if (part > 0.88) {
            values[q] = 0;
          }
        }
      }
    }
  }

  /** A new point where the field is 0 between two points. */
  private int cross(int p, int q, Field field) {
    double[] low = points.get(p);
    double[] high = points.get(q);
    boolean rising = field.at(low[0], low[1], low[2]) < 0;
    double from = 0.1;
    double to = 0.9;
    double x = 0;
    double z = 0;
    for (int i = 0; i < 6; i++) {
      double t = (from + to) / 2;
      x = Island.mix(low[0], high[0], t);
      z = Island.mix(low[2], high[2], t);
      if (field.at(x, Island.height(x, z), z) < 0 == rising) {
        from = t;
      } else {
        to = t;
      }
    }
    return point(x, z);
  }

  private static void fan(List<Integer> corners, int kind, List<Face> result) {
    for (int i = 1; i + 1 < corners.size(); i++) {
      result.add(new Face(corners.get(0), corners.get(i), corners.get(i + 1), kind));
    }
  }

  private static int tile(double value) {
    return Math.max(0, Math.min(TILES - 1, (int) ((value + REACH) / TILE)));
  }

  private static int[] tilesUnder(double[]... corners) {
    int[] box = new int[4];
    for (int axis = 0; axis < 2; axis++) {
      int at = 2 * axis;
      box[at] = tile(Arrays.stream(corners).mapToDouble(p -> p[at]).min().orElse(0));
      box[at + 1] = tile(Arrays.stream(corners).mapToDouble(p -> p[at]).max().orElse(0));
    }
    int[] tiles = new int[(box[1] - box[0] + 1) * (box[3] - box[2] + 1)];
    int count = 0;
    for (int row = box[2]; row <= box[3]; row++) {
      for (int column = box[0]; column <= box[1]; column++) {
        tiles[count++] = row * TILES + column;
      }
    }
    return tiles;
  }

  /** The parts of the land's triangles inside a convex outline, pairs of x and z: three points of x, height, z each. */
  List<double[][]> within(double[][] outline) {
    double[][] flat = Arrays.stream(outline).map(p -> new double[] {p[0], 0, p[1]}).toArray(double[][]::new);
    double turn = 0;
    for (int i = 0; i < outline.length; i++) {
      double[] p = outline[i];
      double[] q = outline[(i + 1) % outline.length];
      turn += p[0] * q[1] - q[0] * p[1];
    }
    Set<Face> touched = new LinkedHashSet<>();
    for (int tile : tilesUnder(flat)) {
      touched.addAll(byTile.getOrDefault(tile, List.of()));
    }
    List<double[][]> parts = new ArrayList<>();
    for (Face face : touched) {
      List<double[]> part = List.of(points.get(face.a), points.get(face.b), points.get(face.c));
      for (int i = 0; i < outline.length && !part.isEmpty(); i++) {
        part = side(part, outline[i], outline[(i + 1) % outline.length], Math.signum(turn));
      }
      for (int i = 1; i + 1 < part.size(); i++) {
        parts.add(new double[][] {part.get(0), part.get(i), part.get(i + 1)});
      }
    }
    return parts;
  }

  /** What of a convex piece lies on one side of a line. */
  private static List<double[]> side(List<double[]> piece, double[] from, double[] to, double sign) {
    List<double[]> kept = new ArrayList<>();
    for (int i = 0; i < piece.size(); i++) {
      double[] p = piece.get(i);
      double[] q = piece.get((i + 1) % piece.size());
      double inP = sign * ((to[0] - from[0]) * (p[2] - from[1]) - (to[1] - from[1]) * (p[0] - from[0]));
      double inQ = sign * ((to[0] - from[0]) * (q[2] - from[1]) - (to[1] - from[1]) * (q[0] - from[0]));
      if (inP >= 0) {
        kept.add(p);
      }
      if (inP * inQ < 0) {
        kept.add(Sculptor.between(p, q, inP / (inP - inQ)));
      }
    }
    return kept;
  }

  /** The land in patches that are drawn one by one. */
  List<Patch.Shape> patches() {
    ToIntFunction<Face> home = face -> {
      double x = (points.get(face.a)[0] + points.get(face.b)[0] + points.get(face.c)[0]) / 3;
      double z = (points.get(face.a)[2] + points.get(face.b)[2] + points.get(face.c)[2]) / 3;
      return tile(z) / TILES_PER_PATCH * TILES + tile(x) / TILES_PER_PATCH;
    };
    Map<Integer, List<Face>> own = new TreeMap<>();
    Map<Integer, Set<Integer>> users = new HashMap<>();
    for (Face face : faces) {
      int patch = home.applyAsInt(face);
      own.computeIfAbsent(patch, key -> new ArrayList<>()).add(face);
      for (int corner : new int[] {face.a, face.b, face.c}) {
        users.computeIfAbsent(corner, key -> new LinkedHashSet<>()).add(patch);
      }
    }
    // Faces that touch a patch come with it unseen, so that its edge is lit like the inside.
    Map<Integer, Set<Face>> around = new HashMap<>();
    for (Face face : faces) {
      for (int corner : new int[] {face.a, face.b, face.c}) {
        for (int patch : users.get(corner)) {
          if (patch != home.applyAsInt(face)) {
            around.computeIfAbsent(patch, key -> new LinkedHashSet<>()).add(face);
          }
        }
      }
    }
    List<Patch.Shape> shapes = new ArrayList<>();
    own.forEach(
        (patch, inside) -> {
          int[] colours = inside.stream().mapToInt(face -> Hsl.ofRgb(colour(face))).toArray();
          shapes.add(s -> carve(s, inside, colours, around.getOrDefault(patch, Set.of())));
        });
    return shapes;
  }

  private void carve(Sculptor s, List<Face> inside, int[] colours, Set<Face> around) {
    double[] middle = points.get(inside.get(0).a);
    TextureMapping grain = s.groundPlane(300, middle);
    TextureMapping[] rock = {
      s.groundPlane(420, middle), s.wallPlane(420, middle, true), s.wallPlane(420, middle, false)
    };
    Map<Integer, Integer> corners = new HashMap<>();
    for (int i = 0; i < colours.length; i++) {
      Face face = inside.get(i);
      boolean rocky = (face.kind & (ROCKY | SNOWY)) == ROCKY;
      TextureMapping mapping = rocky ? rock[facing(face)] : grain;
      add(s, face, corners, Material.of(colours[i]).textured(rocky ? Textures.ROCK : Textures.GRAIN, mapping));
    }
    Material unseen = Material.of(0).transparent(255);
    around.forEach(face -> add(s, face, corners, unseen));
  }

  /** Where a face looks: 0 more or less upward, 1 along z, 2 along x. */
  private int facing(Face face) {
    double[] p = points.get(face.a);
    double[] q = points.get(face.b);
    double[] r = points.get(face.c);
    double x = (q[1] - p[1]) * (r[2] - p[2]) - (q[2] - p[2]) * (r[1] - p[1]);
    double up = (q[2] - p[2]) * (r[0] - p[0]) - (q[0] - p[0]) * (r[2] - p[2]);
    double z = (q[0] - p[0]) * (r[1] - p[1]) - (q[1] - p[1]) * (r[0] - p[0]);
    if (Math.abs(up) > 0.8 * Math.hypot(x, z)) {
      return 0;
    }
    return Math.abs(z) > Math.abs(x) ? 1 : 2;
  }

  private void add(Sculptor s, Face face, Map<Integer, Integer> corners, Material material) {
    int[] numbers = new int[3];
    int[] from = {face.a, face.b, face.c};
    for (int i = 0; i < 3; i++) {
      double[] p = points.get(from[i]);
      numbers[i] = corners.computeIfAbsent(from[i], key -> s.corner(p[0], p[1], p[2]));
    }
    double[] p = points.get(face.a);
    s.face(numbers[0], numbers[1], numbers[2], p[0], -1e5, p[2], material);
  }

  private int colour(Face face) {
    double x = (points.get(face.a)[0] + points.get(face.b)[0] + points.get(face.c)[0]) / 3;
    double up = (points.get(face.a)[1] + points.get(face.b)[1] + points.get(face.c)[1]) / 3;
    double z = (points.get(face.a)[2] + points.get(face.b)[2] + points.get(face.c)[2]) / 3;
    double patch = patch(x, z);
    double fine = Noise.hash((int) (x * 3) * 7919 + (int) (z * 3)) - 0.5;
    if ((face.kind & SNOWY) != 0) {
      return 0xFFFFFF;
    }
    if ((face.kind & ROCKY) != 0) {
      return Colour.mix(0xFFA9A39A, 0xFFE0D8CC, patch + fine * 0.5);
    }
    if ((face.kind & GREEN) == 0) {
      int sand = Colour.mix(0xFFE8D6A0, 0xFFF2E4B8, patch + fine * 0.4);
      return up > -8 ? sand : Colour.mix(0xFFD8C890, 0xFF2E6070, Math.min(1, -up / 110));
    }
    int meadow = Colour.mix(0xFF6E9C3C, 0xFF9CB84E, patch * 1.3 - 0.1 + fine * 0.22);
    return up > 330 ? Colour.mix(meadow, 0xFF7F9658, Math.min(1, (up - 330) / 300)) : meadow;
  }
}
