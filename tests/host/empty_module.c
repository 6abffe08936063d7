// A library that is no module.
int kyvhost_test_nothing(void);
int kyvhost_test_nothing(void) {
    return 0;
}
