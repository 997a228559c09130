/** A night at a lake, drawn by velmark5 alone: what the renderer looks like in use. */
package velmark5.demo;
