package velmark5.demo;

/** Measures how many frames are shown in a second, and how long the program works on each. */
final class Meter {
  private final long interval;
  private long start = System.nanoTime();
  private long busy;
  private int counted;
  private double framesPerSecond;
  private double milliseconds;

  /** A meter with a new reading after each interval of so many seconds. */
  Meter(double seconds) {
    interval = (long) (seconds * 1e9);
  }

  /** Counts a frame, given when work on it began and ended; true when there is a new reading. */
  boolean count(long began, long ended, boolean last) {
    busy += ended - began;
    counted++;
    if (ended - start < interval && !last) {
      return false;
    }
    framesPerSecond = counted * 1e9 / (ended - start);
    milliseconds = busy / 1e6 / counted;
    start = ended;
    busy = 0;
    counted = 0;
    return true;
  }

  double framesPerSecond() {
    return framesPerSecond;
  }

  double milliseconds() {
    return milliseconds;
  }
}
