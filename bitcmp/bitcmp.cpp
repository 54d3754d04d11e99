// bitcmp: entry point, integer and double paths.
