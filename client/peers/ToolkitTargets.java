import velmark5.Canvas;
import velmark5.DepthBuffer;
import velmark5.Rect;
import velmark5.Sprite;
import velmark5.Toolkit;

/** The toolkit's target: what it is, what is copied from and to it, and where in it projected points go. */
interface ToolkitTargets extends ToolkitPart, Toolkit {
  @Override
  default void drawTo(Canvas canvas) {
    ja toolkit = live();
    za peer = toolkit.own((za) canvas);
    toolkit.PA(peer);
    toolkit.target = Target.of(peer);
  }

  @Override
  default void drawTo(Sprite sprite, DepthBuffer depth) {
    ja toolkit = live();
    if (sprite == null && depth == null) {
      throw new IllegalArgumentException("sprite, depth: at least one is needed");
    }
    fa image = sprite == null ? null : toolkit.own((fa) sprite);
    oa depths = depth == null ? null : toolkit.own((oa) depth);
    toolkit.d(ja.handleOf(image), ja.handleOf(depths));
    toolkit.target = Target.of(image, depths);
  }

  /** Leaving a canvas alone would leave the primitives drawing to it; no image at all stops them too. */
  @Override
  default void drawToNothing() {
    ja toolkit = live();
    toolkit.PA(null);
    toolkit.d(0, 0);
    toolkit.target = Target.NOTHING;
  }

  @Override
  default int targetWidth() {
    return live().target.width();
  }

  @Override
  default int targetHeight() {
    return live().target.height();
  }

  @Override
  default void copyFromTarget(Sprite sprite, DepthBuffer depth, Rect area, int x, int y) {
    ja toolkit = live();
    toolkit.copies.fromTarget(toolkit, (fa) sprite, (oa) depth, area, x, y);
  }

  @Override
  default void copyToTarget(Sprite sprite, DepthBuffer depth, Rect area, int x, int y) {
    ja toolkit = live();
    toolkit.copies.toTarget(toolkit, (fa) sprite, (oa) depth, area, x, y);
  }

  @Override
  default Rect viewport() {
    int[] box = new int[4];
    live().xa(box);
    return new Rect(box[0], box[1], box[2], box[3]);
  }

  @Override
  default void setViewport(Rect area) {
    live().A(area.x(), area.y(), area.width(), area.height());
  }

  @Override
  default void resetViewport() {
    live().k();
  }

  @Override
  default void setDepthRange(float near, float far) {
    live().GA(near, far);
  }
}
