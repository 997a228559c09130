package velmark5;

/** How a drawn colour combines with the pixel that is there. */
public enum BlendMode {
  /** The pixel becomes the colour, its alpha byte included. */
  REPLACE(0),
  /** The colour's alpha decides how much of the pixel shows through: 0 leaves it, 255 covers it. */
  ALPHA(1),
  /** Red, green and blue are added and end at 255. Light on light: glows, flashes, beams. */
  ADD(2);

  private final int code;

  BlendMode(int code) {
    this.code = code;
  }

  /**
   * The number by which the native library knows the mode.
   *
   * @return 0, 1 or 2
   */
  public int code() {
    return code;
  }
}
