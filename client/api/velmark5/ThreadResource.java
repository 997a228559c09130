package velmark5;

import java.util.Optional;

/**
 * What one thread needs to draw models, triangles and thick lines. Each worker thread of the client has its own. Made
 * and closed on the control thread, used by one thread at a time.
 *
 * <p>Nothing here locks, so this is what several threads may draw at the same time, into different pixels of the
 * target, while the control thread changes nothing: triangles, lines, and models without textures that have been drawn
 * before. The first draw of a model takes memory of its pool, and a textured face moves its texture in the list of
 * those used last: both belong to one thread at a time.
 */
public interface ThreadResource extends AutoCloseable {
  /** Tells the library that the calling thread starts to draw with this resource. Call it on the thread that draws. */
  void begin();

  /** Tells the library that the calling thread has done its drawing with this resource. */
  void end();

  /**
   * Draws a model on the toolkit's target; without a target, nothing.
   *
   * <p>A model is in the distance fog as a whole or not at all: when an end of its upright axis lies beyond where the
   * fog begins. Its light is that of its mesh as it was built: the matrix does not turn the sun's effect along.
   *
   * <p>Draw the nearest models first: with a depth buffer, what they hide costs a fraction of what shows.
   *
   * @param model the model, whose pool is open
   * @param matrix from the model to the world
   * @throws IllegalStateException if the model or its pool is closed
   */
  void draw(Model model, Matrix matrix);

  /**
   * Draws a model and tells where it stands.
   *
   * @param model the model
   * @param matrix from the model to the world, as for {@link #draw}
   * @return its place, or nothing when it is out of view
   * @throws IllegalStateException if the model or its pool is closed
   */
  Optional<ScreenPlacement> drawPlaced(Model model, Matrix matrix);

  /**
   * Draws a triangle on the toolkit's target, cut to its clip rectangle, in front of everything. Colours run smoothly
   * from corner to corner; the corners may come in any order.
   *
   * @param x0 column of the first corner
   * @param y0 row of the first corner
   * @param colour0 0xAARRGGBB at the first corner
   * @param x1 column of the second corner
   * @param y1 row of the second corner
   * @param colour1 0xAARRGGBB at the second corner
   * @param x2 column of the third corner
   * @param y2 row of the third corner
   * @param colour2 0xAARRGGBB at the third corner
   */
  void fillTriangle(
      float x0, float y0, int colour0, float x1, float y1, int colour1, float x2, float y2, int colour2);

  /**
   * Draws a line of some thickness on the toolkit's target. Its ends are taken from the clip rectangle's corner.
   *
   * @param x0 column of one end
   * @param y0 row of one end
   * @param x1 column of the other end
   * @param y1 row of the other end
   * @param colour 0xAARRGGBB
   * @param thickness pixels
   * @param mode how it combines with the frame; {@link BlendMode#ADD} draws as {@link BlendMode#REPLACE}
   */
  void line(int x0, int y0, int x1, int y1, int colour, int thickness, BlendMode mode);

  /** Gives the memory back. No thread may be drawing with it. */
  @Override
  void close();
}
