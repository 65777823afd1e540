#pragma once

// Progress of long loops, told to the host through the progress file.
// An operator stop ends the run fatally with 326400.
int waitbar_open(const char* message);
int waitbar_update(int unused, float percentage);
int waitbar_close();
// Forgets the percentage on record (a new environment starts from 0).
void waitbar_reset();
