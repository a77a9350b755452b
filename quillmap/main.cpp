// quillmap: reads a netlist, runs the constraint annotators, saves the annotated design.
#include "quillmap/app.h"

int main(int argc, char** argv) { return QuillmapMain(argc, argv); }
