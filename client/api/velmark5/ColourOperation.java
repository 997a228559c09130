package velmark5;

/** What happens to each channel of a sprite's pixel, alpha included, before it is blended. See {@link Tint}. */
public enum ColourOperation {
  /** The pixel times the colour, in 256ths. */
  MULTIPLY(0),
  /** The pixel as it is. */
  NONE(1),
  /** A mixture: the colour's alpha, 0 to 127, says how much of the pixel stays, in 256ths. */
  MIX(2),
  /** The pixel plus the colour, at most 255. */
  ADD(3),
  /** The pixel minus the colour, at least 0. */
  SUBTRACT(4);

  private final int code;

  ColourOperation(int code) {
    this.code = code;
  }

  /**
   * The number by which the native library knows the operation.
   *
   * @return 0 to 4
   */
  public int code() {
    return code;
  }
}
