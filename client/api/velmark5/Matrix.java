package velmark5;

import java.util.Arrays;

/**
 * Four rows of four floats that move points. Points are rows: a point (x, y, z, 1) becomes x times row 0, plus y times
 * row 1, plus z times row 2, plus row 3, which is the translation. The world's y points down, and so does the screen's;
 * seen by the camera x points right and z into the screen. Matrices do not change.
 */
public final class Matrix {
  /** Leaves every point where it is. */
  public static final Matrix IDENTITY = of(1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1);

  private final float[] rows;

  /**
   * Where a point appears.
   *
   * @param x column in pixels
   * @param y row in pixels
   * @param depth 0 at the near plane to 1 at the far plane
   * @param visible whether the point lies in front of the camera, between the planes
   */
  public record ScreenPoint(double x, double y, double depth, boolean visible) {}

  private Matrix(float[] rows) {
    this.rows = rows;
  }

  /**
   * A matrix by its numbers.
   *
   * @param rows sixteen numbers, row after row
   * @return the matrix
   * @throws IllegalArgumentException if there are not sixteen
   */
  public static Matrix of(float... rows) {
    if (rows.length != 16) {
      throw new IllegalArgumentException("rows: " + rows.length + " numbers, not 16");
    }
    return new Matrix(rows.clone());
  }

  private static Matrix of(double... rows) {
    float[] floats = new float[16];
    for (int i = 0; i < 16; i++) {
      floats[i] = (float) rows[i];
    }
    return new Matrix(floats);
  }

  /**
   * Moves points.
   *
   * @param x to the right
   * @param y down
   * @param z into the screen
   * @return the matrix
   */
  public static Matrix translation(double x, double y, double z) {
    return of(1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, x, y, z, 1d);
  }

  /**
   * Stretches points away from the origin.
   *
   * @param x factor along x
   * @param y factor along y
   * @param z factor along z
   * @return the matrix
   */
  public static Matrix scaling(double x, double y, double z) {
    return of(x, 0, 0, 0, 0, y, 0, 0, 0, 0, z, 0, 0, 0, 0, 1d);
  }

  /**
   * Turns points around the x axis, y towards z.
   *
   * @param angle radians
   * @return the matrix
   */
  public static Matrix rotationX(double angle) {
    double c = Math.cos(angle);
    double s = Math.sin(angle);
    return of(1, 0, 0, 0, 0, c, s, 0, 0, -s, c, 0, 0, 0, 0, 1d);
  }

  /**
   * Turns points around the y axis, z towards x.
   *
   * @param angle radians
   * @return the matrix
   */
  public static Matrix rotationY(double angle) {
    double c = Math.cos(angle);
    double s = Math.sin(angle);
    return of(c, 0, -s, 0, 0, 1, 0, 0, s, 0, c, 0, 0, 0, 0, 1d);
  }

  /**
   * Turns points around the z axis, x towards y.
   *
   * @param angle radians
   * @return the matrix
   */
  public static Matrix rotationZ(double angle) {
    double c = Math.cos(angle);
    double s = Math.sin(angle);
    return of(c, s, 0, 0, -s, c, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1d);
  }

  /**
   * A camera that stands at one point and looks at another, upright.
   *
   * @param eyeX where the camera stands
   * @param eyeY where the camera stands, down
   * @param eyeZ where the camera stands
   * @param atX what it looks at
   * @param atY what it looks at, down
   * @param atZ what it looks at
   * @return the matrix from the world to the camera's view
   * @throws IllegalArgumentException if the camera would look straight up or down, or at itself
   */
  public static Matrix lookAt(double eyeX, double eyeY, double eyeZ, double atX, double atY, double atZ) {
    double x = atX - eyeX;
    double y = atY - eyeY;
    double z = atZ - eyeZ;
    double level = Math.hypot(x, z);
    double length = Math.hypot(level, y);
    if (!(level > length * 1e-9)) {
      throw new IllegalArgumentException("camera: it would look straight up or down, or at itself");
    }
    // The view's axes in the world: right stays level, down completes the three.
    double rightX = z / level;
    double rightZ = -x / level;
    double intoX = x / length;
    double intoY = y / length;
    double intoZ = z / length;
    double downX = intoY * rightZ;
    double downY = intoZ * rightX - intoX * rightZ;
    double downZ = -intoY * rightX;
    return of(
        rightX, downX, intoX, 0,
        0, downY, intoY, 0,
        rightZ, downZ, intoZ, 0,
        -(eyeX * rightX + eyeZ * rightZ),
        -(eyeX * downX + eyeY * downY + eyeZ * downZ),
        -(eyeX * intoX + eyeY * intoY + eyeZ * intoZ),
        1d);
  }

  /**
   * A projection with perspective.
   *
   * @param fieldOfView angle from the top to the bottom of the view, in radians, above 0 and below pi
   * @param aspect width of the viewport over its height
   * @param near distance of the near plane, above 0
   * @param far distance of the far plane, above {@code near}
   * @return the matrix from the view to the screen's space
   * @throws IllegalArgumentException if a number is out of range
   */
  public static Matrix perspective(double fieldOfView, double aspect, double near, double far) {
    if (!(fieldOfView > 0 && fieldOfView < Math.PI && aspect > 0 && near > 0 && far > near)) {
      throw new IllegalArgumentException(
          "perspective: field of view " + fieldOfView + ", aspect " + aspect + ", planes " + near + " and " + far);
    }
    double scale = 1 / Math.tan(fieldOfView / 2);
    double depth = far - near;
    return of(
        scale / aspect, 0, 0, 0,
        0, scale, 0, 0,
        0, 0, (far + near) / depth, 1,
        0, 0, -2 * far * near / depth, 0d);
  }

  /**
   * This matrix and then another.
   *
   * @param next what is applied to this one's result
   * @return the product
   */
  public Matrix then(Matrix next) {
    float[] product = new float[16];
    for (int row = 0; row < 4; row++) {
      for (int column = 0; column < 4; column++) {
        double sum = 0;
        for (int k = 0; k < 4; k++) {
          sum += (double) rows[row * 4 + k] * next.rows[k * 4 + column];
        }
        product[row * 4 + column] = (float) sum;
      }
    }
    return new Matrix(product);
  }

  /**
   * Moves a point.
   *
   * @param x the point
   * @param y the point
   * @param z the point
   * @return x, y, z and w of the moved point
   */
  public float[] transform(double x, double y, double z) {
    float[] result = new float[4];
    for (int i = 0; i < 4; i++) {
      result[i] = (float) (x * rows[i] + y * rows[4 + i] + z * rows[8 + i] + rows[12 + i]);
    }
    return result;
  }

  /**
   * Finds where a point appears, for a matrix that ends with a projection.
   *
   * @param x the point
   * @param y the point
   * @param z the point
   * @param viewport where on the screen the view goes
   * @return its place
   */
  public ScreenPoint project(double x, double y, double z, Rect viewport) {
    float[] p = transform(x, y, z);
    double w = p[3];
    return new ScreenPoint(
        viewport.x() + (p[0] / w + 1) * viewport.width() / 2,
        viewport.y() + (p[1] / w + 1) * viewport.height() / 2,
        (p[2] / w + 1) / 2,
        w > 0 && Math.abs(p[2]) <= w);
  }

  /**
   * The numbers.
   *
   * @return a new array of sixteen, row after row
   */
  public float[] toArray() {
    return rows.clone();
  }

  @Override
  public boolean equals(Object other) {
    return other instanceof Matrix matrix && Arrays.equals(rows, matrix.rows);
  }

  @Override
  public int hashCode() {
    return Arrays.hashCode(rows);
  }

  @Override
  public String toString() {
    return Arrays.toString(rows);
  }
}
