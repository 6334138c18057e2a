/* A platform library without functions. */
int telix_test_nothing;
