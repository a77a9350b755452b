#include "quillmap/app.h"

#include <cstdio>

int QuillmapMain(int argc, char** argv) {
    std::puts("quillmap");
    return 0;
}
