// The whole public interface of liblodestack in one include.
#ifndef LODESTACK_LODESTACK_H
#define LODESTACK_LODESTACK_H

// core
#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/AsyncCallDispatcherCommon.h"
#include "lodestack/core/Directory.h"
#include "lodestack/core/DirectoryLinux.h"
#include "lodestack/core/Export.h"
#include "lodestack/core/File.h"
#include "lodestack/core/IAsyncCallDispatcher.h"
#include "lodestack/core/IAsyncCallReceiver.h"
#include "lodestack/core/IDirectory.h"
#include "lodestack/core/IFile.h"
#include "lodestack/core/IMutex.h"
#include "lodestack/core/IPollSink.h"
#include "lodestack/core/ISemaphore.h"
#include "lodestack/core/IThread.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/core/LinAsyncCallDispatcher.h"
#include "lodestack/core/LinGlibAsyncCallDispatcher.h"
#include "lodestack/core/LinPollAsyncCallDispatcher.h"
#include "lodestack/core/Lockable.h"
#include "lodestack/core/Status.h"
#include "lodestack/core/Unicode.h"

// gom
#include "lodestack/gom/CharacterData.h"
#include "lodestack/gom/Collection.h"
#include "lodestack/gom/GenericObject.h"
#include "lodestack/gom/ObjectBase.h"
#include "lodestack/gom/ObjectCollection.h"
#include "lodestack/gom/RecordFactory.h"
#include "lodestack/gom/ReferenceCountable.h"
#include "lodestack/gom/SharedPointer.h"
#include "lodestack/gom/ValueCollection.h"
#include "lodestack/gom/Variant.h"

// stream
#include "lodestack/stream/Buffer.h"
#include "lodestack/stream/BufferStream.h"
#include "lodestack/stream/ISerializable.h"
#include "lodestack/stream/IStream.h"

// schema
#include "lodestack/schema/Area.h"
#include "lodestack/schema/Cdma.h"
#include "lodestack/schema/CellDn.h"
#include "lodestack/schema/CellMeasurement.h"
#include "lodestack/schema/CellularObject.h"
#include "lodestack/schema/CellularRecords.h"
#include "lodestack/schema/Coverage.h"
#include "lodestack/schema/EUtra.h"
#include "lodestack/schema/Geran.h"
#include "lodestack/schema/GenericObjectWrapper.h"
#include "lodestack/schema/Gnss.h"
#include "lodestack/schema/Injection.h"
#include "lodestack/schema/InternalUtility.h"
#include "lodestack/schema/MeasurementBase.h"
#include "lodestack/schema/MeasurementContainer.h"
#include "lodestack/schema/ObjectBaseFactory.h"
#include "lodestack/schema/PositionEstimate.h"
#include "lodestack/schema/Record.h"
#include "lodestack/schema/UtraFdd.h"
#include "lodestack/schema/UtraTdd.h"
#include "lodestack/schema/Wlan.h"
#include "lodestack/schema/utility/Utility.h"

// math
#include "lodestack/math/EllipseMath.h"
#include "lodestack/math/Midpoint.h"
#include "lodestack/math/ShapeMatrix.h"
#include "lodestack/math/StateEstimate.h"
#include "lodestack/math/StateEstimateCovariance.h"
#include "lodestack/math/Symmetric2by2Matrix.h"
#include "lodestack/math/Symmetric4by4Matrix.h"

// platform: the interfaces lodestack runs on, implemented by the host build
#include "lodestack/platform/HostPlatform.h"
#include "lodestack/platform/LocationManager.h"
#include "lodestack/platform/RadioMeasurements.h"
#include "lodestack/platform/SecureStorage.h"

// radioadaptation
#include "lodestack/radioadaptation/ConverterOxel.h"
#include "lodestack/radioadaptation/FreeGnssListener.h"
#include "lodestack/radioadaptation/IRadioAdaptation.h"
#include "lodestack/radioadaptation/IRadioAdaptationObserver.h"
#include "lodestack/radioadaptation/LinuxRadioAdaptationOxel.h"
#include "lodestack/radioadaptation/MeasurementTracing.h"
#include "lodestack/radioadaptation/MeasurementTracingOxel.h"
#include "lodestack/radioadaptation/RadioAdaptationFactory.h"
#include "lodestack/radioadaptation/RadioAdaptationCommon.h"

// measurements
#include "lodestack/measurements/IMeasurementsObserver.h"
#include "lodestack/measurements/ISimulationDataProvider.h"
#include "lodestack/measurements/MeasurementsProvider.h"
#include "lodestack/measurements/MeasurementsValidator.h"

// crypto
#include "lodestack/crypto/CryptoFileCommon.h"
#include "lodestack/crypto/CryptoFileLin.h"
#include "lodestack/crypto/CryptoLinux.h"
#include "lodestack/crypto/CryptoUtilityAdaptationCommon.h"
#include "lodestack/crypto/CryptoUtilityVantor.h"
#include "lodestack/crypto/ICryptoFile.h"
#include "lodestack/crypto/ICryptography.h"
#include "lodestack/crypto/ICryptographyUtility.h"

// debug
#include "lodestack/debug/Debug.h"
#include "lodestack/debug/DebugCommon.h"
#include "lodestack/debug/DebugLinux.h"

#endif  // LODESTACK_LODESTACK_H
