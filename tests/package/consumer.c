/* A program of somebody else's project: it sees what is installed, and nothing more. */
#include <Qex.h>
#include <stdio.h>

int main(void) {
    QexMatrix m;
    QexVec3 p = {1, 2, 3}, moved;
    QexMatrix_Translate(&m, 10, 20, 30);
    QexMatrix_TransformHomoVec3(&m, &p, &moved, 1);
    printf("%g %g %g\n", (double)moved.x, (double)moved.y, (double)moved.z);
    return 0;
}
