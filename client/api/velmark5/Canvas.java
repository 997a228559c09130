package velmark5;

import java.awt.Component;

/**
 * A frame and its depth values, shown in a component of AWT. Make it the target with {@link Toolkit#drawTo(Canvas)},
 * draw, then {@link #present()}.
 *
 * <p>Where the display shares memory with its clients there are two images in turn: after a present the canvas holds
 * the frame before the last one, so each frame starts with a clear.
 */
public interface Canvas extends AutoCloseable {
  /**
   * Columns of the frame.
   *
   * @return the width in pixels
   */
  int width();

  /**
   * Rows of the frame.
   *
   * @return the height in pixels
   */
  int height();

  /**
   * Gives the canvas a new size. Frame and depth start anew; if the canvas is the target it stays so, with a black
   * frame and the clip and viewport of the new size.
   *
   * @param width columns, at least 1
   * @param height rows, at least 1
   * @throws IllegalStateException if the component is not displayable, or after close
   * @throws IllegalArgumentException if a size is less than 1
   */
  void resize(int width, int height);

  /**
   * Moves the canvas to another component, with a new size; else as {@link #resize(int, int)}.
   *
   * @param component a displayable heavyweight component
   * @param width columns, at least 1
   * @param height rows, at least 1
   * @throws IllegalStateException if the component is not displayable, or after close
   * @throws IllegalArgumentException if a size is less than 1
   */
  void resize(Component component, int width, int height);

  /**
   * Shows the whole frame in the component. Does nothing while the component has no surface.
   *
   * @throws IllegalStateException if the canvas is not the toolkit's target, or after close
   */
  void present();

  /**
   * Shows a part of the frame, at the top left of the component.
   *
   * @param area the part, inside the frame
   * @throws IllegalArgumentException if the area is not inside the frame
   * @throws IllegalStateException if the canvas is not the toolkit's target, or after close
   */
  void present(Rect area);

  /** Gives the frame back. If the canvas is the target, the toolkit draws to nothing from then on. */
  @Override
  void close();
}
