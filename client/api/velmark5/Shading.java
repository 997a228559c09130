package velmark5;

/** How a face takes light. */
public enum Shading {
  /** Each corner by the mean normal of the smooth faces around it. */
  SMOOTH(0),
  /** All corners by the face's own normal. */
  FLAT(1),
  /** Not drawn; a face that only carries a billboard. */
  HIDDEN(2);

  private final int code;

  Shading(int code) {
    this.code = code;
  }

  /**
   * The number by which the native library knows the kind.
   *
   * @return 0 to 2
   */
  public int code() {
    return code;
  }
}
