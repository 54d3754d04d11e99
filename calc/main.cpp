// bitcalc: command line of the evaluator.
int main() { return 0; }
