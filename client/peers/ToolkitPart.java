/** A theme of the toolkit's operations: it has no state of its own, and calls the natives of the toolkit that it is. */
interface ToolkitPart {
  /** The toolkit, which is open, or IllegalStateException. */
  ja live();
}
