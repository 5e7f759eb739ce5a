#include "application.h"

int main(int argc, char** argv) { return hbctl::run(argc, argv); }
