#include "driver/MainDriver.h"

int main(int argc, char** argv) { return vantor::MainDriver(argc, argv).Run(); }
