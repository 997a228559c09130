import velmark5.MemoryPool;

/** Memory pool. */
final class ba extends Peer implements MemoryPool {
  long nativeid;

  /** Objects that live in this pool. */
  int residents;

  native void sa(int unused, int size);

  native void ma();

  native void ha();

  native void u();

  ba(ja toolkit, int bytes) {
    super(toolkit);
    sa(0, bytes);
  }

  @Override
  long id() {
    return nativeid;
  }

  @Override
  String name() {
    return "memory pool";
  }

  @Override
  public void close() {
    if (!isClosed()) {
      toolkit.requireOutsideCollection("a memory pool cannot be closed");
      super.close();
    }
  }

  /**
   * With objects alive, or the toolkit pointing here, only the storage goes: the small rest must outlive them.
   * Otherwise all of it goes.
   */
  @Override
  void destroy() {
    if (residents > 0 || toolkit.uses(this)) {
      ha();
    } else {
      ma();
    }
  }
}
