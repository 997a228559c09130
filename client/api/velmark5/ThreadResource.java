package velmark5;

import java.util.Optional;

/**
 * What one thread needs to draw models, terrain and triangles. Each worker thread of the client has its own. Made and
 * closed on the control thread, used by one thread at a time.
 */
public interface ThreadResource extends AutoCloseable {
  /** Tells the library that the calling thread starts to draw with this resource. Call it on the worker thread. */
  void begin();

  /** Tells the library that the calling thread has done its drawing with this resource. */
  void end();

  /**
   * Draws a model on the toolkit's target. One thread at a time draws a model, each with its own resource.
   *
   * @param model the model
   * @param matrix from the model to the world: four rows of four numbers, the last row is where it stands
   * @throws IllegalArgumentException if there are not 16 numbers
   */
  void draw(Model model, float[] matrix);

  /**
   * Draws a model and tells where it stands.
   *
   * @param model the model
   * @param matrix from the model to the world, as for {@link #draw}
   * @return its place, or nothing when it is out of view
   */
  Optional<ScreenPlacement> drawPlaced(Model model, float[] matrix);

  /** Gives the memory back. No thread may be drawing with it. */
  @Override
  void close();
}
