// Entry of the focusing job: takes the host's command string,
// "main_focussing_stripmap#<job file>".
#include "job/focusing_job.h"

int main(int argc, char** argv) { return stripmapFocuserEntry(argc, argv); }
