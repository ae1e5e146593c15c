#include "system_file/backup_manifest.h"

#include <openssl/evp.h>

#include <algorithm>
#include <new>
#include <nlohmann/json.hpp>
#include <stdexcept>

#include "failure.h"
#include "text.h"

namespace velmorctl {

namespace {

using Json = nlohmann::ordered_json;

constexpr char schema[] = "velmor.backup/1";

Json AsJson(const ListedFile& listed) {
  if (!listed.file.existed) {
    return {{"name", listed.file.name}, {"existed", false}};
  }
  return {{"name", listed.file.name},   {"existed", true},
          {"mode", listed.file.mode},   {"owner", listed.file.owner},
          {"group", listed.file.group}, {"copy", listed.copy},
          {"sha256", listed.sha256}};
}

/// The document is UTF-8, and another name would not be found again.
void RequireText(const std::string& name) {
  try {
    static_cast<void>(Json(name).dump());
  } catch (const Json::type_error&) {
    throw Failure(ExitCode::Configuration, "no backup can be made of a file whose name is not UTF-8")
        .Detail("file", Printable(name))
        .Try("rename it");
  }
}

/// The copies lie in the backup's folder, so their names are no paths.
bool IsCopyName(const std::string& name) {
  return !name.empty() && std::all_of(name.begin(), name.end(), [](unsigned char character) {
    return character >= '0' && character <= '9';
  });
}

ListedFile Listed(const Json& entry) {
  ListedFile listed;
  listed.file.name = entry.at("name").get<std::string>();
  listed.file.existed = entry.at("existed").get<bool>();
  if (!listed.file.name.starts_with('/')) {
    throw std::invalid_argument("the name of a file is no absolute path");
  }
  if (listed.file.existed) {
    listed.file.mode = entry.at("mode").get<mode_t>() & 07777;
    listed.file.owner = entry.at("owner").get<uid_t>();
    listed.file.group = entry.at("group").get<gid_t>();
    listed.copy = entry.at("copy").get<std::string>();
    listed.sha256 = entry.at("sha256").get<std::string>();
    if (!IsCopyName(listed.copy)) {
      throw std::invalid_argument("the name of a copy is no number");
    }
  }
  return listed;
}

}  // namespace

std::string Sha256(std::string_view bytes) {
  constexpr char digits[] = "0123456789abcdef";
  unsigned char digest[EVP_MAX_MD_SIZE];
  unsigned int size = 0;
  if (EVP_Digest(bytes.data(), bytes.size(), digest, &size, EVP_sha256(), nullptr) != 1) {
    throw std::bad_alloc();
  }
  std::string text;
  for (unsigned int index = 0; index < size; ++index) {
    text += digits[digest[index] >> 4U];
    text += digits[digest[index] & 0x0FU];
  }
  return text;
}

std::string ManifestText(const BackupManifest& manifest) {
  Json files = Json::array();
  for (const ListedFile& listed : manifest.files) {
    RequireText(listed.file.name);
    files.push_back(AsJson(listed));
  }
  const Json document = {{"schema", schema}, {"command", manifest.command}, {"files", files}};
  return document.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

BackupManifest ParseManifest(const std::string& text) {
  try {
    const Json document = Json::parse(text);
    if (document.at("schema").get<std::string>() != schema) {
      throw std::invalid_argument("it is of another version");
    }
    BackupManifest manifest;
    manifest.command = document.at("command").get<std::string>();
    for (const Json& entry : document.at("files")) {
      manifest.files.push_back(Listed(entry));
    }
    return manifest;
  } catch (const Json::exception& exception) {
    throw std::invalid_argument(exception.what());
  }
}

}  // namespace velmorctl
