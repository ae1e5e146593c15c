/* A PAM module that answers what its arguments say, and tells the program that it was called.
 *
 * The argument OPERATION=NUMBER is the answer to an operation; without one it is success. The operations are
 * auth, cred, account, open, close, prepare and change. The program may define the function
 * ScriptedModuleCalled, which gets the operation and all arguments. */
#include <dlfcn.h>
#include <stdlib.h>
#include <string.h>

#include <security/pam_modules.h>

typedef void (*Called)(const char* operation, int count, const char** arguments);

static int Answer(const char* operation, int count, const char** arguments) {
  Called called = NULL;
  void* symbol = dlsym(RTLD_DEFAULT, "ScriptedModuleCalled");
  memcpy(&called, &symbol, sizeof called);
  if (called != NULL) {
    called(operation, count, arguments);
  }
  size_t length = strlen(operation);
  for (int index = 0; index < count; ++index) {
    if (strncmp(arguments[index], operation, length) == 0 && arguments[index][length] == '=') {
      return atoi(arguments[index] + length + 1);
    }
  }
  return PAM_SUCCESS;
}

int pam_sm_authenticate(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)handle;
  (void)flags;
  return Answer("auth", count, arguments);
}

int pam_sm_setcred(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)handle;
  (void)flags;
  return Answer("cred", count, arguments);
}

int pam_sm_acct_mgmt(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)handle;
  (void)flags;
  return Answer("account", count, arguments);
}

int pam_sm_open_session(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)handle;
  (void)flags;
  return Answer("open", count, arguments);
}

int pam_sm_close_session(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)handle;
  (void)flags;
  return Answer("close", count, arguments);
}

int pam_sm_chauthtok(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)handle;
  return Answer((flags & PAM_PRELIM_CHECK) != 0 ? "prepare" : "change", count, arguments);
}
