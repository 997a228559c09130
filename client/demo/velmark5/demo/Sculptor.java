package velmark5.demo;

import java.util.ArrayList;
import java.util.Arrays;
import java.util.List;
import velmark5.Material;
import velmark5.Mesh;
import velmark5.TextureMapping;

/**
 * Builds meshes from simple solids. Heights count upward here, and the ground lies at 0; the mesh has them downward.
 * Shapes are placed around a foot point that can be moved and turned.
 */
final class Sculptor {
  private static final double CELL = 150;

  private final Mesh.Builder mesh = Mesh.builder();
  private final List<double[]> places = new ArrayList<>();
  private double footX;
  private double footUp;
  private double footZ;
  private double cos = 1;
  private double sin;

  /** What comes next stands at this point, turned around the upright axis. */
  Sculptor at(double x, double up, double z, double angle) {
    footX = x;
    footUp = up;
    footZ = z;
    cos = Math.cos(angle);
    sin = Math.sin(angle);
    return this;
  }

  /** What comes next stands at this point. */
  Sculptor at(double x, double up, double z) {
    return at(x, up, z, 0);
  }

  Mesh build() {
    return mesh.build();
  }

  int corner(double x, double up, double z) {
    double px = footX + x * cos + z * sin;
    double pz = footZ - x * sin + z * cos;
    places.add(new double[] {px, footUp + up, pz});
    return mesh.vertex((int) Math.round(px), (int) Math.round(-footUp - up), (int) Math.round(pz));
  }

  /** A triangle that is seen from the side away from a point, which is given in the coordinates of corners. */
  void face(int a, int b, int c, double fromX, double fromUp, double fromZ, Material material) {
    double[] p = places.get(a);
    double[] q = places.get(b);
    double[] r = places.get(c);
    double ux = q[0] - p[0];
    double uy = q[1] - p[1];
    double uz = q[2] - p[2];
    double vx = r[0] - p[0];
    double vy = r[1] - p[1];
    double vz = r[2] - p[2];
    double fx = footX + fromX * cos + fromZ * sin;
    double fz = footZ - fromX * sin + fromZ * cos;
    double fy = footUp + fromUp;
    // Upward heights mirror the mesh, so the front is where this product is negative.
    double side = (uy * vz - uz * vy) * (p[0] - fx) + (uz * vx - ux * vz) * (p[1] - fy) + (ux * vy - uy * vx) * (p[2] - fz);
    if (side <= 0) {
      mesh.face(a, b, c, material);
    } else {
      mesh.face(a, c, b, material);
    }
  }

  /**
   * The plane that lays one repeat of a texture over each so many units of the ground. Planes of one size fit each
   * other, whatever the place they are made for.
   */
  TextureMapping groundPlane(double size, double[] near) {
    return plane(size, near, new double[] {1, 0, 0}, new double[] {0, 0, -1});
  }

  /** The same for walls that look along z, or along x, the texture drawn out in height. */
  TextureMapping wallPlane(double size, double[] near, boolean alongZ) {
    return plane(size, near, alongZ ? new double[] {1, 0, 0} : new double[] {0, 0, 1}, new double[] {0, -3, 0});
  }

  private TextureMapping plane(double size, double[] near, double[] right, double[] down) {
    double whole = 3 * size;
    double[] origin = Arrays.stream(near).map(place -> Math.rint(place / whole) * whole).toArray();
    for (int i = 0; i < 3; i++) {
      right[i] = origin[i] + size * right[i];
      down[i] = origin[i] + size * down[i];
    }
    return new TextureMapping.Plane(corner(origin), corner(right), corner(down));
  }

  /**
   * A flat panel, cut into small faces. Its corners, three numbers each, run from the upper left one down, right and up
   * as it is seen from its front; its texture is repeated across and down.
   */
  void panel(double[] corners, Material material, double across, double down) {
    double[] topLeft = {corners[0], corners[1], corners[2]};
    double[] topRight = {corners[9], corners[10], corners[11]};
    double[] bottomLeft = {corners[3], corners[4], corners[5]};
    double[] bottomRight = {corners[6], corners[7], corners[8]};
    Material mapped = material;
    if (material.texture() != Material.NO_TEXTURE && material.mapping() == null) {
      mapped =
          material.textured(
              material.texture(),
              new TextureMapping.Plane(
                  corner(between(topLeft, topRight, 0)),
                  corner(between(topLeft, topRight, 1 / across)),
                  corner(between(topLeft, bottomLeft, 1 / down))));
    }
    int columns = cells(topLeft, topRight, bottomLeft, bottomRight);
    int rows = cells(topLeft, bottomLeft, topRight, bottomRight);
    int[][] grid = new int[rows + 1][columns + 1];
    for (int row = 0; row <= rows; row++) {
      double[] left = between(topLeft, bottomLeft, row / (double) rows);
      double[] right = between(topRight, bottomRight, row / (double) rows);
      for (int column = 0; column <= columns; column++) {
        grid[row][column] = corner(between(left, right, column / (double) columns));
      }
    }
    for (int row = 0; row < rows; row++) {
      for (int column = 0; column < columns; column++) {
        mesh.quad(
            grid[row][column], grid[row + 1][column], grid[row + 1][column + 1], grid[row][column + 1], mapped);
      }
    }
  }

  private static int cells(double[] a, double[] b, double[] c, double[] d) {
    return Math.max(1, (int) Math.ceil(Math.max(distance(a, b), distance(c, d)) / CELL));
  }

  private static double distance(double[] a, double[] b) {
    return Math.hypot(Math.hypot(b[0] - a[0], b[1] - a[1]), b[2] - a[2]);
  }

  private int corner(double[] p) {
    return corner(p[0], p[1], p[2]);
  }

  static double[] between(double[] a, double[] b, double t) {
    double[] result = new double[a.length];
    for (int i = 0; i < result.length; i++) {
      result[i] = a[i] + (b[i] - a[i]) * t;
    }
    return result;
  }

  /** A triangle of its own, with one repeat of a texture over its box; corners as for a panel, the tip first. */
  void gable(double[] corners, Material material) {
    int tip = corner(corners[0], corners[1], corners[2]);
    int left = corner(corners[3], corners[4], corners[5]);
    int right = corner(corners[6], corners[7], corners[8]);
    double rise = corners[1] - corners[4];
    int origin = corner(corners[3], corners[4] + rise, corners[5]);
    int across = corner(corners[6], corners[4] + rise, corners[8]);
    mesh.face(tip, left, right, material.textured(material.texture(), new TextureMapping.Plane(origin, across, left)));
  }

  /** A box that stands on a height, centred over a point; its texture is repeated every so many units. */
  void box(double x, double up, double z, double wide, double tall, double deep, Material material, double repeat) {
    double l = x - wide / 2;
    double r = x + wide / 2;
    double n = z - deep / 2;
    double f = z + deep / 2;
    double t = up + tall;
    double tallRepeats = tall / repeat;
    panel(new double[] {l, t, n, l, up, n, r, up, n, r, t, n}, material, wide / repeat, tallRepeats);
    panel(new double[] {r, t, f, r, up, f, l, up, f, l, t, f}, material, wide / repeat, tallRepeats);
    panel(new double[] {l, t, f, l, up, f, l, up, n, l, t, n}, material, deep / repeat, tallRepeats);
    panel(new double[] {r, t, n, r, up, n, r, up, f, r, t, f}, material, deep / repeat, tallRepeats);
    panel(new double[] {l, t, f, l, t, n, r, t, n, r, t, f}, material, wide / repeat, deep / repeat);
  }

  /** A bar between two points of the plane at z, its middle line at their heights. */
  void beam(double x0, double up0, double x1, double up1, double z, double tall, double deep, Material material) {
    double h = tall / 2;
    double n = z - deep / 2;
    double f = z + deep / 2;
    double down = tall / Math.hypot(x1 - x0, up1 - up0);
    panel(new double[] {x0, up0 + h, n, x0, up0 - h, n, x1, up1 - h, n, x1, up1 + h, n}, material, 1, down);
    panel(new double[] {x1, up1 + h, f, x1, up1 - h, f, x0, up0 - h, f, x0, up0 + h, f}, material, 1, down);
    panel(new double[] {x0, up0 + h, f, x0, up0 + h, n, x1, up1 + h, n, x1, up1 + h, f}, material, 1, down);
    panel(new double[] {x0, up0 - h, n, x0, up0 - h, f, x1, up1 - h, f, x1, up1 - h, n}, material, 1, down);
  }

  /** What a profile, pairs of radius and height from the bottom up, sweeps around the foot's axis. */
  void lathe(int sides, Material material, double... profile) {
    lathe(sides, 0, 0, material, profile);
  }

  /** The same, with a bumpy surface. */
  void lathe(int sides, double bumps, int seed, Material material, double... profile) {
    int rings = profile.length / 2;
    int[][] ring = new int[rings][sides];
    for (int i = 0; i < rings; i++) {
      double r = profile[2 * i];
      int first = 0;
      for (int k = 0; k < sides; k++) {
        double angle = 2 * Math.PI * (k + 0.5 * (i % 2) * Math.signum(bumps)) / sides;
        double bump = 1 + bumps * (2 * Noise.hash(seed * 1009 + i * 31 + k) - 1);
        // A radius of 0 is one corner.
        ring[i][k] = r == 0 && k > 0 ? first : corner(r * bump * Math.cos(angle), profile[2 * i + 1], r * bump * Math.sin(angle));
        first = ring[i][0];
      }
    }
    for (int i = 0; i + 1 < rings; i++) {
      double middle = (profile[2 * i + 1] + profile[2 * i + 3]) / 2;
      double slant = profile[2 * i] - profile[2 * i + 2];
      double rise = profile[2 * i + 3] - profile[2 * i + 1];
      // A point on the axis that lies behind the surface: where the line across it meets the axis, if it does.
      double across = (profile[2 * i] + profile[2 * i + 2]) / 2 * slant / rise;
      double behind = middle - (rise > 0 && Math.abs(across) < 1e4 ? across : Math.signum(slant) * 1e4);
      for (int k = 0; k < sides; k++) {
        int next = (k + 1) % sides;
        // Bumpy rings are turned by half a step against each other; the diagonals follow.
        boolean even = i % 2 == 0;
        if (profile[2 * i] != 0) {
          face(ring[i][k], ring[i][next], ring[i + 1][even ? k : next], 0, behind, 0, material);
        }
        if (profile[2 * i + 2] != 0) {
          face(ring[i][even ? next : k], ring[i + 1][next], ring[i + 1][k], 0, behind, 0, material);
        }
      }
    }
  }

  /** A bumpy ball around a height above the foot. */
  void ball(double up, double radius, double squash, double bumps, int seed, Material material) {
    int rings = 6;
    double[] profile = new double[2 * rings];
    for (int i = 0; i < rings; i++) {
      double angle = Math.PI * i / (rings - 1) - Math.PI / 2;
      profile[2 * i] = i == 0 || i == rings - 1 ? 0 : radius * Math.cos(angle);
      profile[2 * i + 1] = up + radius * squash * Math.sin(angle);
    }
    lathe(8, bumps, seed, material, profile);
  }

  /** A strip of quadrangles between two rows of corners, seen from above: left and right as one walks along. */
  void strip(int[] left, int[] right, Material material) {
    for (int i = 0; i + 1 < left.length; i++) {
      double[] p = places.get(left[i]);
      face(left[i], right[i], right[i + 1], p[0] - footX, p[1] - footUp - 1e4, p[2] - footZ, material);
      face(left[i], right[i + 1], left[i + 1], p[0] - footX, p[1] - footUp - 1e4, p[2] - footZ, material);
    }
  }
}
