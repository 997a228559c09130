/**
 * What a toolkit draws to, as this side knows it: a canvas, or a sprite, a depth buffer or both, or nothing. The
 * library holds bare pointers to it, so a part that goes must leave it first.
 */
record Target(za canvas, fa sprite, oa depth, int width, int height) {
  static final Target NOTHING = new Target(null, null, null, 0, 0);

  static Target of(za canvas) {
    return new Target(canvas, null, null, canvas.width(), canvas.height());
  }

  /** Of a sprite, a depth buffer or both; the sprite's size counts where there is one. */
  static Target of(fa sprite, oa depth) {
    return sprite != null
        ? new Target(null, sprite, depth, sprite.width(), sprite.height())
        : new Target(null, null, depth, depth.width(), depth.height());
  }

  boolean has(Peer part) {
    return part == canvas || part == sprite || part == depth;
  }
}
