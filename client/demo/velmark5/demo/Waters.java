package velmark5.demo;

import java.util.ArrayList;
import java.util.List;
import velmark5.Material;
import velmark5.Mesh;
import velmark5.TextureMapping;

/** The meshes of the water: the sea, the river, the fall. */
final class Waters {
  /** How far a ring of the sea lies out from the shore, and how much the water inside it lets through. */
  private record Ring(double out, int transparency) {}

  private static final int SECTORS = 12;
  private static final int STEPS = 8;
  private static final double FARTHEST = 12000;

  private Waters() {}

  /**
   * The sea in sectors around the island: rings along the shore, clear in the shallows, small where the camera comes
   * near.
   */
  static List<Patch.Shape> sea() {
    List<Ring> near = new ArrayList<>();
    for (double out = -380; out < 2200; out += out < 340 ? 80 : out < 600 ? 120 : 200) {
      near.add(new Ring(out, (int) (125 * Math.min(1, Math.max(0, 1 - out / 560)))));
    }
    double last = near.get(near.size() - 1).out;
    List<Ring> far = new ArrayList<>();
    for (double out = last; out < last + 7200; out += 300 + (out - last) * 0.4) {
      far.add(new Ring(out, 0));
    }
    far.add(new Ring(FARTHEST, 0));
    List<Patch.Shape> shapes = new ArrayList<>();
    for (int sector = 0; sector < SECTORS; sector++) {
      double from = 2 * Math.PI * sector / SECTORS;
      shapes.add(s -> sector(s, from, near));
      shapes.add(s -> sector(s, from, far));
    }
    return shapes;
  }

  private static void sector(Sculptor s, double from, List<Ring> rings) {
    int[][] rows = new int[rings.size()][STEPS + 1];
    double[] middle = null;
    for (int i = 0; i < rows.length; i++) {
      for (int k = 0; k <= STEPS; k++) {
        double angle = from + 2 * Math.PI / SECTORS * k / STEPS;
        double far = Island.shore(angle, rings.get(i).out);
        rows[i][k] = s.corner(far * Math.cos(angle), 0, far * Math.sin(angle));
        if (middle == null) {
          middle = new double[] {far * Math.cos(angle), 0, far * Math.sin(angle)};
        }
      }
    }
    TextureMapping waves = s.groundPlane(520, middle);
    for (int i = 0; i + 1 < rows.length; i++) {
      Material water = Carpentry.plain(0xFFFFFF, Textures.WAVES).textured(Textures.WAVES, waves);
      s.strip(rows[i], rows[i + 1], water.transparent(rings.get(i + 1).transparency));
    }
  }

  /** The river below the fall, in pieces. */
  static List<Patch.Shape> river() {
    List<Patch.Shape> shapes = new ArrayList<>();
    int piece = 11;
    for (int from = 0; from + 1 < Island.RIVER.size(); from += piece) {
      int first = from;
      int last = Math.min(from + piece, Island.RIVER.size() - 1);
      shapes.add(s -> reach(s, first, last));
    }
    return shapes;
  }

  private static void reach(Sculptor s, int first, int last) {
    int[][] rows = new int[5][last - first + 1];
    for (int i = first; i <= last; i++) {
      double[] p = Island.RIVER.get(i);
      double[] across = across(Island.RIVER, i);
      for (int k = 0; k < rows.length; k++) {
        double side = (k - 2) / 2.0 * Math.max(Island.RIVER_EDGE + 26, 190 - 8 * i * i);
        rows[k][i - first] = s.corner(p[0] + across[0] * side, p[2], p[1] + across[1] * side);
      }
    }
    double[] p = Island.RIVER.get(first);
    TextureMapping flow = s.groundPlane(260, new double[] {p[0], p[2], p[1]});
    Material water = Carpentry.plain(0xFFFFFF, Textures.STREAM).textured(Textures.STREAM, flow).transparent(80);
    for (int k = 0; k + 1 < rows.length; k++) {
      s.strip(rows[k], rows[k + 1], water);
    }
  }

  /** The direction to the right of a line of x and z at one of its points. */
  static double[] across(List<double[]> line, int i) {
    double[] q = line.get(Math.min(i + 1, line.size() - 1));
    double[] o = line.get(Math.max(i - 1, 0));
    double dx = q[0] - o[0];
    double dz = q[1] - o[1];
    double length = Math.hypot(dx, dz);
    return new double[] {-dz / length, dx / length};
  }

  /** The waterfall: down the mountain's steps, then free, in two sheets one behind the other. */
  static Mesh fall() {
    Sculptor s = new Sculptor();
    List<double[]> steps = new ArrayList<>();
    for (int i = 0; i < 6; i++) {
      double z = 1590 - 38 * i;
      double up = 0;
      for (int k = -1; k <= 1; k++) {
        up = Math.max(up, Island.height(Island.FALL_X + 55 * k, z + 10));
      }
      steps.add(new double[] {up + 22, z, 40 + 8 * i});
    }
    sheet(s, steps);
    double[] rim = steps.get(steps.size() - 1);
    for (int sheet = 0; sheet < 2; sheet++) {
      List<double[]> free = new ArrayList<>();
      int rows = 8;
      for (int i = 0; i <= rows; i++) {
        double t = i / (double) rows;
        double wide = (sheet == 0 ? rim[2] : 0.75 * rim[2]) + 26 * t;
        free.add(new double[] {Island.mix(rim[0], 80, t), rim[1] - (134 + 40 * sheet) * Math.sqrt(t), wide});
      }
      sheet(s, free);
    }
    return s.build();
  }

  /** Falling water between level edges: height, z and half the width of each, from the top down. */
  private static void sheet(Sculptor s, List<double[]> edges) {
    double x = Island.FALL_X;
    for (int i = 0; i + 1 < edges.size(); i++) {
      double[] a = edges.get(i);
      double[] b = edges.get(i + 1);
      s.panel(
          new double[] {x - a[2], a[0], a[1], x - b[2], b[0], b[1], x + b[2], b[0], b[1], x + a[2], a[0], a[1]},
          Carpentry.plain(0xFFFFFF, Textures.FALL), 1, 1);
    }
  }
}
