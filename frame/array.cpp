// The array layer of the calling frame.
