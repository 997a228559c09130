package velmark5;

/**
 * What one thread needs to draw models, terrain and triangles. Each worker thread of the client has its own. Made and
 * closed on the control thread, used by one thread at a time.
 */
public interface ThreadResource extends AutoCloseable {
  /** Tells the library that the calling thread starts to draw with this resource. Call it on the worker thread. */
  void begin();

  /** Tells the library that the calling thread has done its drawing with this resource. */
  void end();

  /** Gives the memory back. No thread may be drawing with it. */
  @Override
  void close();
}
