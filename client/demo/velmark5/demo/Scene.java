package velmark5.demo;

/** One part of the picture. Scenes are painted one over the other. Objects of the library go with the toolkit. */
interface Scene {
  /** Lays the scene out for a target of this size: at the start, and whenever the window changes. */
  void resize(int width, int height);

  /** Draws what the scene keeps in images of its own, before the frame is the target. */
  default void prepare(double seconds) {}

  /** Draws the scene into the frame. */
  void paint(double seconds);

  /** Tells how fast the program is. */
  default void showRate(String reading) {}
}
