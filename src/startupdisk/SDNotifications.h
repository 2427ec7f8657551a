// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

/// The notifications of the controller; the object, where there is one, is an SDRecordRef. The spelling "Dissappear"
/// belongs to the names.
namespace tavisk::sdnotification {

inline constexpr const char* systemDidAppear = "SDSystemDidAppear";
inline constexpr const char* systemVolumeDidAppear = "SDSystemVolumeDidAppear";
inline constexpr const char* wirestartVolumeDidAppear = "SDWirestartVolumeDidAppear";  ///< kept; never posted
inline constexpr const char* systemDidDissappear = "SDSystemDidDissappear";
inline constexpr const char* bootSystemDetermined = "SDBootSystemDetermined";
inline constexpr const char* systemVolumeDidDissappear = "SDSystemVolumeDidDissappear";  ///< kept; never posted
inline constexpr const char* wirestartVolumeDidDissappear = "SDWirestartVolumeDidDissappear";
inline constexpr const char* busySearching = "SDBusySearching";
inline constexpr const char* doneSearching = "SDDoneSearching";

}  // namespace tavisk::sdnotification
