package velmark5;

/**
 * Where a drawn model stands on the screen, in pixels.
 *
 * @param topX x of its axis at its smallest y
 * @param topY y of its axis at its smallest y
 * @param bottomX x of its axis at its greatest y
 * @param bottomY y of its axis at its greatest y
 * @param radius its cylinder's radius at the end that is further along z
 */
public record ScreenPlacement(int topX, int topY, int bottomX, int bottomY, int radius) {}
