/* A PAM module whose directory is a folder of small files, so that a test can say who is in it.
 *
 *   /run/directory/users    a line "NAME PASSWORD" for each user; without the file the directory is away
 *   /run/directory/refused  while it exists, every account has expired
 */
#include <stdio.h>
#include <string.h>
#include <unistd.h>

#include <security/pam_ext.h>
#include <security/pam_modules.h>

#define FOLDER "/run/directory/"

/* Finds the user's password; PAM_SUCCESS, or why there is none. */
static int find(pam_handle_t* handle, char password[64]) {
  const char* user = NULL;
  char name[64];
  FILE* users = fopen(FOLDER "users", "r");
  if (users == NULL) {
    return PAM_AUTHINFO_UNAVAIL;
  }
  int result = pam_get_user(handle, &user, NULL) == PAM_SUCCESS ? PAM_USER_UNKNOWN : PAM_SERVICE_ERR;
  while (result == PAM_USER_UNKNOWN && fscanf(users, "%63s %63s", name, password) == 2) {
    if (strcmp(name, user) == 0) {
      result = PAM_SUCCESS;
    }
  }
  fclose(users);
  return result;
}

int pam_sm_authenticate(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)flags;
  (void)count;
  (void)arguments;
  char password[64];
  const char* given = NULL;
  int result = find(handle, password);
  if (result != PAM_SUCCESS) {
    return result;
  }
  if (pam_get_authtok(handle, PAM_AUTHTOK, &given, NULL) != PAM_SUCCESS) {
    return PAM_AUTH_ERR;
  }
  return strcmp(given, password) == 0 ? PAM_SUCCESS : PAM_AUTH_ERR;
}

int pam_sm_acct_mgmt(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)flags;
  (void)count;
  (void)arguments;
  char password[64];
  int result = find(handle, password);
  return result == PAM_SUCCESS && access(FOLDER "refused", F_OK) == 0 ? PAM_ACCT_EXPIRED : result;
}

static int state(pam_handle_t* handle, int flags, int count, const char** arguments) {
  (void)flags;
  (void)count;
  (void)arguments;
  char password[64];
  return find(handle, password);
}

int pam_sm_setcred(pam_handle_t* handle, int flags, int count, const char** arguments) {
  return state(handle, flags, count, arguments);
}

int pam_sm_open_session(pam_handle_t* handle, int flags, int count, const char** arguments) {
  return state(handle, flags, count, arguments);
}

int pam_sm_close_session(pam_handle_t* handle, int flags, int count, const char** arguments) {
  return state(handle, flags, count, arguments);
}

int pam_sm_chauthtok(pam_handle_t* handle, int flags, int count, const char** arguments) {
  return state(handle, flags, count, arguments);
}
