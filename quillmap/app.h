// Entry of the quillmap command line; returns the process exit status.
#pragma once

int QuillmapMain(int argc, char** argv);
