// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/EfiDevicePath.h"

#include <algorithm>

#include "base/Text.h"
#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {
namespace {

struct Kind {
  std::uint8_t type;
  std::uint8_t subtype;
};
constexpr Kind hardDrive{4, 1};
constexpr Kind filePath{4, 4};
constexpr Kind hardwareAddress{3, 11};
constexpr Kind ipv4{3, 12};
constexpr Kind uriPath{3, 24};
constexpr Kind legacyBoot{5, 1};
constexpr std::uint8_t endType = 0x7F;
constexpr std::uint8_t endOfPath = 0xFF;
constexpr std::uint8_t endOfInstance = 0x01;

constexpr std::size_t headerSize = 4;
constexpr std::size_t signatureSize = 16;
constexpr std::size_t signatureDigits = 8;  ///< of a disk with an MBR
constexpr std::uint8_t mbrFormat = 1;
constexpr std::uint8_t gptFormat = 2;

bool isOf(const EfiPathNode& node, Kind kind) {
  return node.type == kind.type && node.subtype == kind.subtype;
}

const EfiPathNode* find(const EfiDevicePath& path, Kind kind) {
  const auto node = std::ranges::find_if(path, [kind](const auto& each) { return isOf(each, kind); });
  return node == path.end() ? nullptr : &*node;
}

std::optional<EfiPathNode> takeNode(std::string_view& bytes) {
  const auto type = takeNumber(bytes, 1);
  const auto subtype = takeNumber(bytes, 1);
  const auto length = takeNumber(bytes, 2);
  if (!length || *length < headerSize || *length - headerSize > bytes.size()) return std::nullopt;
  const auto data = bytes.substr(0, *length - headerSize);
  bytes.remove_prefix(data.size());
  return EfiPathNode{static_cast<std::uint8_t>(*type), static_cast<std::uint8_t>(*subtype), std::string(data)};
}

void appendNode(std::string& bytes, const EfiPathNode& node) {
  appendNumber(bytes, node.type, 1);
  appendNumber(bytes, node.subtype, 1);
  appendNumber(bytes, headerSize + node.data.size(), 2);
  bytes += node.data;
}

std::string mbrUuid(std::string_view signature, std::uint32_t number) {
  return hexDigits(*takeNumber(signature, 4), signatureDigits) + "-" + hexDigits(number, 2);
}

/// The disk's signature in "1badd00d-02". A disk whose signature is 0 has none.
std::optional<std::string> mbrSignature(const EfiPartition& partition) {
  const auto digits = partition.uuid.substr(0, partition.uuid.find('-'));
  const auto number = parseNumber<std::uint32_t>(digits, 16).value_or(0);
  if (number == 0 || digits == partition.uuid || digits != hexDigits(number, signatureDigits)) return std::nullopt;
  std::string signature;
  appendNumber(signature, number, signatureSize);
  return signature;
}

std::string joined(std::string_view bytes, const char* separator, std::string (*text)(std::uint8_t)) {
  std::string joined;
  for (const char byte : bytes) {
    if (!joined.empty()) joined += separator;
    joined += text(static_cast<std::uint8_t>(byte));
  }
  return joined;
}

std::string twoDigits(std::uint8_t byte) {
  return hexDigits(byte, 2);
}
std::string decimal(std::uint8_t byte) {
  return std::to_string(byte);
}

/// The remote address follows the local one.
std::optional<std::string> serverOf(const EfiDevicePath& path) {
  const auto* node = find(path, ipv4);
  if (!node || node->data.size() < 8) return std::nullopt;
  const auto address = joined(std::string_view(node->data).substr(4, 4), ".", decimal);
  return address == "0.0.0.0" ? std::nullopt : std::optional(address);
}

std::string textOf(const EfiPathNode& node) {
  if (const auto partition = partitionOf({node})) {
    const bool isGpt = guidBytes(partition->uuid).has_value();
    return "HD(" + std::to_string(partition->number) + (isGpt ? ",GPT," : ",MBR,") + partition->uuid + ",0x" +
           hexDigits(partition->start) + ",0x" + hexDigits(partition->size) + ")";
  }
  if (isOf(node, filePath)) return "File(" + fileOf({node}).value_or("") + ")";
  return "Path(" + std::to_string(node.type) + "," + std::to_string(node.subtype) + "," +
         joined(node.data, "", twoDigits) + ")";
}

}  // namespace

std::optional<EfiDevicePath> parseDevicePath(std::string_view bytes) {
  EfiDevicePath path;
  while (auto node = takeNode(bytes)) {
    if (node->type == endType && (node->subtype == endOfPath || node->subtype == endOfInstance)) return path;
    path.push_back(std::move(*node));
  }
  return std::nullopt;
}

std::string bytesOf(const EfiDevicePath& path) {
  std::string bytes;
  for (const auto& node : path) appendNode(bytes, node);
  appendNode(bytes, {endType, endOfPath, ""});
  return bytes;
}

std::optional<EfiPathNode> partitionNode(const EfiPartition& partition) {
  const auto guid = guidBytes(partition.uuid);
  const auto signature = guid ? guid : mbrSignature(partition);
  if (!signature) return std::nullopt;
  EfiPathNode node{hardDrive.type, hardDrive.subtype, ""};
  appendNumber(node.data, partition.number, 4);
  appendNumber(node.data, partition.start, 8);
  appendNumber(node.data, partition.size, 8);
  node.data += *signature;
  const auto format = guid ? gptFormat : mbrFormat;
  appendNumber(node.data, format, 1);
  appendNumber(node.data, format, 1);  // the kind of the signature has the same numbers
  return node;
}

std::string withSlashes(std::string file) {
  std::ranges::replace(file, '\\', '/');
  return file;
}

EfiPathNode fileNode(std::string_view path) {
  EfiPathNode node{filePath.type, filePath.subtype, toUtf16(path)};
  appendNumber(node.data, 0, 2);
  return node;
}

std::optional<EfiPartition> partitionOf(const EfiDevicePath& path) {
  const auto* node = find(path, hardDrive);
  if (!node) return std::nullopt;
  std::string_view rest = node->data;
  const auto number = takeNumber(rest, 4);
  const auto start = takeNumber(rest, 8);
  const auto size = takeNumber(rest, 8);
  if (!size || rest.size() != signatureSize + 2) return std::nullopt;
  EfiPartition partition{"", static_cast<std::uint32_t>(*number), *start, *size};
  const auto signature = rest.substr(0, signatureSize);
  const auto kind = static_cast<std::uint8_t>(rest.back());
  if (kind == gptFormat) partition.uuid = guidText(signature);
  if (kind == mbrFormat) partition.uuid = mbrUuid(signature, partition.number);
  return partition.uuid.empty() ? std::nullopt : std::optional(partition);
}

std::optional<std::string> fileOf(const EfiDevicePath& path) {
  std::optional<std::string> file;
  for (const auto& node : path) {
    if (!isOf(node, filePath)) continue;
    const auto text = fromUtf16(node.data);
    const auto part = text.substr(0, text.find('\0'));
    const bool isApart = file && !file->ends_with('\\') && !part.starts_with('\\');
    file = file.value_or("") + (isApart ? "\\" : "") + part;
  }
  return file;
}

std::optional<EfiNetworkPath> networkPathOf(const EfiDevicePath& path) {
  constexpr std::size_t ethernetSize = 6;
  const auto* interface = find(path, hardwareAddress);
  if (!interface || interface->data.size() < ethernetSize || find(path, hardDrive)) return std::nullopt;
  EfiNetworkPath network{joined(std::string_view(interface->data).substr(0, ethernetSize), ":", twoDigits),
                         serverOf(path), std::nullopt};
  const auto* uri = find(path, uriPath);
  if (uri && !uri->data.empty()) network.uri = uri->data;
  return network;
}

bool isLegacyBoot(const EfiDevicePath& path) {
  return find(path, legacyBoot) != nullptr;
}

std::string textOf(const EfiDevicePath& path) {
  std::string text;
  for (const auto& node : path) text += (text.empty() ? "" : "/") + textOf(node);
  return text;
}

}  // namespace tavisk
