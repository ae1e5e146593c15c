/* A shared object that is no CAM proxy plug-in. */
extern int something;
int something = 1;
