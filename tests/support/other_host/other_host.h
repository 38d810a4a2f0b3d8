/* A host module with a single service, StrLen, which answers 4711 whatever it is asked. */
#ifndef OTHER_HOST_H
#define OTHER_HOST_H

#ifdef __cplusplus
extern "C" {
#endif

/* Calling it makes a program depend on the module, so that the module is loaded. */
int other_host_answer(void);

#ifdef __cplusplus
}
#endif

#endif
