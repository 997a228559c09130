/**
 * A software renderer for Java clients: frames are drawn by the processor alone, into windows and into images.
 *
 * <p>Everything starts with {@link velmark5.Toolkit#create()}; the toolkit makes all other objects and draws. Objects
 * hold memory outside the Java heap: close them, or close the toolkit, which closes what is left. A call on a closed
 * object throws {@link IllegalStateException}. No argument may be null unless its description says so: a null where
 * none is allowed is a {@link NullPointerException}.
 *
 * <p>All calls belong to one thread of the client's choice, the <em>control thread</em>, except where a method says
 * otherwise. Nothing here locks.
 *
 * <p>Coordinates are whole pixels, x to the right and y down, with (0, 0) at the top left of the target. Colours are
 * words of the form 0xAARRGGBB; {@link velmark5.Colour} helps to make them.
 */
package velmark5;
