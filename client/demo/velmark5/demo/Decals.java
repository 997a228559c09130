package velmark5.demo;

import java.util.ArrayList;
import java.util.HashMap;
import java.util.List;
import java.util.Map;
import velmark5.Hsl;
import velmark5.Material;
import velmark5.Mesh;
import velmark5.TextureMapping;

/**
 * What lies flat on the land: shadows, the light of lamps, trodden ground, the river's bed. Each is cut out of the
 * land's own triangles and a little raised, so that it follows every bend; its texture fades at its edge. A mesh has
 * its origin at the place that it is made for, at the height of the sea.
 */
final class Decals {
  private static final int SIDES = 7;

  /** From the middle of a path to where it has faded, and how long its straight parts are. */
  private static final double PATH_WIDTH = 66;

  private static final double PATH_PART = 170;

  /** A mesh, and the place of its origin. */
  record Decal(Mesh mesh, double x, double z) {}

  private final Terrain terrain;

  Decals(Terrain terrain) {
    this.terrain = terrain;
  }

  /** The soft shadow around what stands at a place. */
  Decal shadow(double x, double z, double radius) {
    return disc(x, z, radius * 1.2, 6, Hsl.of(0.6, 0.3, 0.02), Textures.GLOW);
  }

  /** The light that a lamp throws on the ground. */
  Decal glow(double x, double z, double radius, int rgb) {
    return disc(x, z, radius, 8, Hsl.ofRgb(rgb), Textures.GLOW);
  }

  /** Trodden ground around a place. */
  Decal square(double x, double z, double radius) {
    return disc(x, z, radius, 4, Hsl.ofRgb(0xC9A671), Textures.YARD);
  }

  private Decal disc(double x, double z, double radius, double lift, int colour, int texture) {
    Sculptor s = new Sculptor().at(-x, 0, -z);
    // Around the circle at which the texture has faded.
    double far = radius / Math.cos(Math.PI / SIDES);
    double[][] outline = new double[SIDES][];
    for (int i = 0; i < SIDES; i++) {
      double angle = 2 * Math.PI * (i + 0.5) / SIDES;
      outline[i] = new double[] {x + far * Math.cos(angle), z + far * Math.sin(angle)};
    }
    double up = Island.height(x, z);
    TextureMapping plane = new TextureMapping.Plane(
        s.corner(x - radius, up, z + radius), s.corner(x + radius, up, z + radius),
        s.corner(x - radius, up, z - radius));
    lay(s, outline, lift, Material.of(colour).textured(texture, plane), new HashMap<>());
    return new Decal(s.build(), x, z);
  }

  /** A path along a polyline of x and z, in pieces; not through the river. */
  List<Decal> path(double[][] corners) {
    List<double[]> line = new ArrayList<>();
    for (int i = 0; i + 1 < corners.length; i++) {
      double length = Math.hypot(corners[i + 1][0] - corners[i][0], corners[i + 1][1] - corners[i][1]);
      int parts = (int) Math.ceil(length / PATH_PART);
      for (int k = 0; k < parts + (i + 2 == corners.length ? 1 : 0); k++) {
        line.add(Sculptor.between(corners[i], corners[i + 1], k / (double) parts));
      }
    }
    // Rounds the corners off.
    for (int round = 0; round < 3; round++) {
      List<double[]> before = List.copyOf(line);
      for (int i = 1; i + 1 < line.size(); i++) {
        double[] chord = Sculptor.between(before.get(i - 1), before.get(i + 1), 0.5);
        line.set(i, Sculptor.between(before.get(i), chord, 0.5));
      }
    }
    return new Strip(line, PATH_WIDTH, 240, 5, Hsl.ofRgb(0xC9A671)).pieces(Island.RIVER_EDGE + 20);
  }

  /** The gravel on the river's bed and banks, in pieces. */
  List<Decal> riverBed() {
    List<double[]> line = new ArrayList<>();
    for (int i = 0; i < Island.RIVER.size(); i += 3) {
      line.add(Island.RIVER.get(i));
    }
    return new Strip(line, Island.RIVER_EDGE + 55, 420, 3, Hsl.ofRgb(0xB9AB7E)).pieces(-1);
  }

  /** A strip along a line of x and z; its texture runs across it once, and on along it from piece to piece. */
  private final class Strip {
    private static final int PARTS_PER_PIECE = 8;

    private final List<double[]> line;
    private final double wide;
    private final double repeat;
    private final double lift;
    private final int colour;

    Strip(List<double[]> line, double wide, double repeat, double lift, int colour) {
      this.line = line;
      this.wide = wide;
      this.repeat = repeat;
      this.lift = lift;
      this.colour = colour;
    }

    /** The strip in pieces, without the parts nearer to the river than a distance. */
    List<Decal> pieces(double clear) {
      List<Decal> pieces = new ArrayList<>();
      double way = 0;
      for (int i = 0; i + 1 < line.size(); ) {
        double[] origin = line.get(i);
        Sculptor s = new Sculptor().at(-origin[0], 0, -origin[1]);
        Map<List<Long>, Integer> corners = new HashMap<>();
        int laid = 0;
        boolean open = true;
        while (open && laid < PARTS_PER_PIECE && i + 1 < line.size()) {
          double[] middle = Sculptor.between(line.get(i), line.get(i + 1), 0.5);
          open = Island.riverDistance(middle[0], middle[1]) >= clear;
          if (open) {
            layPart(s, i, way, corners);
            laid++;
          }
          way += Math.hypot(line.get(i + 1)[0] - line.get(i)[0], line.get(i + 1)[1] - line.get(i)[1]);
          i++;
        }
        if (laid > 0) {
          pieces.add(new Decal(s.build(), origin[0], origin[1]));
        }
      }
      return pieces;
    }

    /** The part from one point of the line to the next, a way from its start. */
    private void layPart(Sculptor s, int i, double way, Map<List<Long>, Integer> corners) {
      double[] p = line.get(i);
      double[] q = line.get(i + 1);
      double[] a = Waters.across(line, i);
      double[] b = Waters.across(line, i + 1);
      double[][] outline = {
        {p[0] - a[0] * wide, p[1] - a[1] * wide}, {q[0] - b[0] * wide, q[1] - b[1] * wide},
        {q[0] + b[0] * wide, q[1] + b[1] * wide}, {p[0] + a[0] * wide, p[1] + a[1] * wide}
      };
      double length = Math.hypot(q[0] - p[0], q[1] - p[1]);
      double dx = (q[0] - p[0]) / length;
      double dz = (q[1] - p[1]) / length;
      double back = way % repeat;
      double x = p[0] - dx * back + dz * wide;
      double z = p[1] - dz * back - dx * wide;
      double up = Island.height(p[0], p[1]);
      TextureMapping plane = new TextureMapping.Plane(
          s.corner(x, up, z), s.corner(x - 2 * dz * wide, up, z + 2 * dx * wide),
          s.corner(x + dx * repeat, up, z + dz * repeat));
      lay(s, outline, lift, Material.of(colour).textured(Textures.TRACK, plane), corners);
    }
  }

  private void lay(Sculptor s, double[][] outline, double lift, Material material, Map<List<Long>, Integer> corners) {
    for (double[][] part : terrain.within(outline)) {
      int[] numbers = new int[3];
      for (int i = 0; i < 3; i++) {
        double[] p = part[i];
        // Corners at one place are one, so that light runs on over the edges.
        List<Long> place = List.of(Math.round(p[0] * 4), Math.round(p[2] * 4));
        numbers[i] = corners.computeIfAbsent(place, key -> s.corner(p[0], p[1] + lift, p[2]));
      }
      s.face(numbers[0], numbers[1], numbers[2], part[0][0], -1e5, part[0][2], material);
    }
  }
}
