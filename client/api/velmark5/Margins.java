package velmark5;

/**
 * Transparent columns and rows that were trimmed from a sprite's edges. They count for its full size and for where its
 * stored pixels go, and cost no memory.
 *
 * @param left columns at the left
 * @param top rows at the top
 * @param right columns at the right
 * @param bottom rows at the bottom
 */
public record Margins(int left, int top, int right, int bottom) {
  /** No margins. */
  public static final Margins NONE = new Margins(0, 0, 0, 0);
}
