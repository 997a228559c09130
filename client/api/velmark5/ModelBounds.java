package velmark5;

/**
 * How far a model reaches, in its own units.
 *
 * @param minX smallest x
 * @param maxX greatest x
 * @param minY smallest y, the top
 * @param maxY greatest y, the bottom
 * @param minZ smallest z
 * @param maxZ greatest z
 * @param cylinder radius of the upright cylinder about the origin that holds it
 * @param sphere radius of the sphere about the origin that holds it
 */
public record ModelBounds(
    int minX, int maxX, int minY, int maxY, int minZ, int maxZ, int cylinder, int sphere) {}
