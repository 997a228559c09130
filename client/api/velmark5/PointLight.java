package velmark5;

/**
 * A lamp.
 *
 * @param x where it is, in units of the world
 * @param y where it is, down
 * @param z where it is
 * @param range how far its light reaches
 * @param colour 0xRRGGBB
 * @param strength 0 dark to 1 full; more counts as 1
 */
public record PointLight(int x, int y, int z, int range, int colour, float strength) {}
