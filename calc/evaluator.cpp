// The evaluator of bitcalc.
