/* Runs a command while no other program changes a file through the library. Usage: hold_file FILE COMMAND */
#include <ktfiles.h>

#include <stdio.h>
#include <stdlib.h>

int main(int argc, char** argv)
{
    ktf_access* access = NULL;
    int result;
    if (argc != 3)
        return 2;
    if (ktf_lock(argv[1], KTF_LOCK_READ, 10, &access) != KTF_OK) { /* waits 10 seconds for others */
        fprintf(stderr, "%s\n", ktf_last_error());
        return 1;
    }
    result = system(argv[2]);
    ktf_unlock(&access);
    return result == 0 ? 0 : 1;
}
