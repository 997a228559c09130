import java.awt.Component;
import java.util.Objects;
import velmark5.Canvas;
import velmark5.Rect;

/** Canvas. */
final class za extends Peer implements Canvas {
  long nativeid;

  private Component component;
  private int width;
  private int height;

  native void n(int unused, Object component, int width, int height);

  native void ma();

  native void wa(Object component, int width, int height);

  native void H(int x, int y, int width, int height);

  native void CA(int a, int b, int c, int d, int e, int f);

  za(ja toolkit, Component component, int width, int height) {
    super(toolkit);
    check(component, width, height);
    n(0, component, width, height);
    remember(component, width, height);
  }

  private static void check(Component component, int width, int height) {
    Objects.requireNonNull(component, "component");
    if (width < 1 || height < 1) {
      throw new IllegalArgumentException("size: " + width + "x" + height + " is less than 1x1");
    }
    if (!component.isDisplayable()) {
      throw new IllegalStateException("The component is not displayable: show its window first");
    }
  }

  private void remember(Component newComponent, int newWidth, int newHeight) {
    component = newComponent;
    width = newWidth;
    height = newHeight;
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "canvas";
  }

  @Override
  void destroy() {
    toolkit.leaveTarget(this);
    ma();
  }

  @Override
  public int width() {
    handle();
    return width;
  }

  @Override
  public int height() {
    handle();
    return height;
  }

  @Override
  public void resize(int newWidth, int newHeight) {
    resize(component, newWidth, newHeight);
  }

  /** The library's target would be freed memory in between, so the toolkit looks away first. */
  @Override
  public void resize(Component newComponent, int newWidth, int newHeight) {
    handle();
    check(newComponent, newWidth, newHeight);
    boolean active = toolkit.isTarget(this);
    toolkit.leaveTarget(this);
    wa(newComponent, newWidth, newHeight);
    remember(newComponent, newWidth, newHeight);
    if (active) {
      toolkit.drawTo(this);
    }
  }

  @Override
  public void present() {
    present(new Rect(0, 0, width, height));
  }

  /** A present redirects the library's target to this canvas, so no other may be in use. */
  @Override
  public void present(Rect area) {
    handle();
    if (!toolkit.isTarget(this)) {
      throw new IllegalStateException("Only the canvas that the toolkit draws to can be presented");
    }
    if (area.isEmpty()) {
      return;
    }
    if (!area.intersect(new Rect(0, 0, width, height)).equals(area)) {
      throw new IllegalArgumentException("area: " + area + " is not inside " + width + "x" + height);
    }
    H(area.x(), area.y(), area.width(), area.height());
  }
}
