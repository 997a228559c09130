package velmark5;

/**
 * A lamp. Its light falls with the square of the distance.
 *
 * @param x where it is, in units of the world
 * @param y where it is, down
 * @param z where it is
 * @param range the distance at which its light has its strength, in units of the world
 * @param colour 0xRRGGBB
 * @param strength 0 dark to 1 full; more counts as 1
 */
public record PointLight(int x, int y, int z, int range, int colour, float strength) {}
