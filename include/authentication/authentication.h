/// Everything that libvelmor exports in quenix::authentication.
#ifndef AUTHENTICATION_AUTHENTICATION_H
#define AUTHENTICATION_AUTHENTICATION_H

#include "authentication/active_directory_config_store.h"
#include "authentication/active_directory_store.h"
#include "authentication/authentication_store_factory.h"
#include "authentication/cam_thumbprint_store.h"
#include "authentication/configuration.h"
#include "authentication/directory_records.h"
#include "authentication/exception.h"
#include "authentication/library_exceptions.h"
#include "authentication/no_remote_authentication_store.h"
#include "authentication/provider_exceptions.h"
#include "authentication/store.h"
#include "authentication/thread_util.h"

#endif  // AUTHENTICATION_AUTHENTICATION_H
