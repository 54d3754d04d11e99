// bitand, bitor and bitxor: entry points and their common body.
