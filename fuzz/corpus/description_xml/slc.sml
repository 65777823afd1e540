<?xml version="1.0" ?>
<HEADER_INFO
	xmlns="http://schemas.tessivor.org/xml/TessivorHeaderSchema"
	xmlns:xsi="http://www.w3.org/2001/XMLSchema-instance"
	xsi:schemaLocation="http://schemas.tessivor.org/xml/TessivorHeaderSchema
	http://schemas.tessivor.org/xml/TessivorHeaderSchema/TessivorHeaderSchema_version_1.0.xsd">
	<NumberOfElements>8</NumberOfElements>
	<SECTION>
		<NAME>StateVectorData</NAME>
		<NumberOfElements>10</NumberOfElements>
		<FIELD NAME = "nStateVectors" MANDATORY = "0">
			<Integer>
				<Value>5</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "StateVectorReference" MANDATORY = "0">
			<String>
				<Value>EARTH_FIXED</Value>
			</String>
		</FIELD>
		<FIELD NAME = "TimeFirst" MANDATORY = "0">
			<String>
				<Value>18-JAN-2010 17:49:19.902000</Value>
			</String>
		</FIELD>
		<FIELD NAME = "TimeDelta" MANDATORY = "0">
			<Double>
				<Value>5</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "pos_x" MANDATORY = "0">
			<Double>
				<NumberOfElements>5</NumberOfElements>
				<Vector>
					<Value>5530671.73267345</Value>
					<Value>5506643.1000997</Value>
					<Value>5482460.78713648</Value>
					<Value>5458125.47287734</Value>
					<Value>5433637.84078964</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "pos_y" MANDATORY = "0">
			<Double>
				<NumberOfElements>5</NumberOfElements>
				<Vector>
					<Value>-668944.790972842</Value>
					<Value>-675231.110763418</Value>
					<Value>-681481.568609816</Value>
					<Value>-687695.883194446</Value>
					<Value>-693873.774671574</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "pos_z" MANDATORY = "0">
			<Double>
				<NumberOfElements>5</NumberOfElements>
				<Vector>
					<Value>4488989.82370601</Value>
					<Value>4517448.21448245</Value>
					<Value>4545783.68084467</Value>
					<Value>4573995.45012171</Value>
					<Value>4602082.752995</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "vel_x" MANDATORY = "0">
			<Double>
				<NumberOfElements>5</NumberOfElements>
				<Vector>
					<Value>-4790.31342163722</Value>
					<Value>-4821.11711723456</Value>
					<Value>-4851.78543158662</Value>
					<Value>-4882.31748984667</Value>
					<Value>-4912.71241716798</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "vel_y" MANDATORY = "0">
			<Double>
				<NumberOfElements>5</NumberOfElements>
				<Vector>
					<Value>-1260.8313244362</Value>
					<Value>-1253.68716548048</Value>
					<Value>-1246.48659582478</Value>
					<Value>-1239.22990983625</Value>
					<Value>-1231.91740188205</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "vel_z" MANDATORY = "0">
			<Double>
				<NumberOfElements>5</NumberOfElements>
				<Vector>
					<Value>5703.91891770717</Value>
					<Value>5679.41152543663</Value>
					<Value>5654.74926374796</Value>
					<Value>5629.93280311104</Value>
					<Value>5604.9628139958</Value>
				</Vector>
			</Double>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>InitialGeometry</NAME>
		<NumberOfElements>10</NumberOfElements>
		<FIELD NAME = "SlantRange" MANDATORY = "1">
			<Double>
				<Value>832181.4142023067</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "FastTime" MANDATORY = "1">
			<Double>
				<Value>0.00555171680938222</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "AzimuthStartTime" MANDATORY = "0">
			<String>
				<Value>18-JAN-2010 17:49:29.562178</Value>
			</String>
		</FIELD>
		<FIELD NAME = "ACQUISITION_TIME" MANDATORY = "0">
			<String>
				<Value>18-JAN-2010 17:49:29.562178</Value>
			</String>
		</FIELD>
		<FIELD NAME = "AzimuthStopTime" MANDATORY = "0">
			<String>
				<Value>18-JAN-2010 17:49:30.476517</Value>
			</String>
		</FIELD>
		<FIELD NAME = "PixelSpacingRg" MANDATORY = "0">
			<Double>
				<Value>7.904890281159608</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "SceneHeading" MANDATORY = "0">
			<Double>
				<Value>-999</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "Projection" MANDATORY = "0">
			<String>
				<Value>SLANT_RANGE</Value>
			</String>
		</FIELD>
		<FIELD NAME = "TimeDirectionPixel" MANDATORY = "0">
			<String>
				<Value>INCREASE TIME DIRECTION</Value>
			</String>
		</FIELD>
		<FIELD NAME = "TimeDirectionLines" MANDATORY = "0">
			<String>
				<Value>INCREASE TIME DIRECTION</Value>
			</String>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>Processing</NAME>
		<NumberOfElements>11</NumberOfElements>
		<FIELD NAME = "StateVectorSource" MANDATORY = "0">
			<String>
				<Value>SLC_DATA_PRODUCT</Value>
			</String>
		</FIELD>
		<FIELD NAME = "StateVectorReference" MANDATORY = "0">
			<String>
				<Value>EARTH_FIXED</Value>
			</String>
		</FIELD>
		<FIELD NAME = "AzimuthPixelShift" MANDATORY = "0">
			<Double>
				<Value>0</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "NAzimuthLooks" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "SuggestedAzimuthLooks" MANDATORY = "0">
			<Integer>
				<Value>5</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "SuggestedRangeLooks" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "AzimuthGroundPixelSpaceFromSuggestLooks" MANDATORY = "0">
			<Double>
				<Value>20.017205817358324</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "RangeGroundPixelSpaceFromSuggestLooks" MANDATORY = "0">
			<Double>
				<Value>21.48719243779743</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "FromInImageAzimuthLooks" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "FromInImageRangeLooks" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "PixelSpacingAz" MANDATORY = "0">
			<Double>
				<Value>4.003441163471665</Value>
			</Double>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>RasterInfo</NAME>
		<NumberOfElements>21</NumberOfElements>
		<FIELD NAME = "NrOfPixelsPerLine" MANDATORY = "0">
			<Integer>
				<Value>1281</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "NrOfLinesPerImage" MANDATORY = "0">
			<Integer>
				<Value>1536</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "RowPrefix" MANDATORY = "0">
			<Integer>
				<Value>0</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "RowSuffix" MANDATORY = "0">
			<Integer>
				<Value>0</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "HeaderOffset" MANDATORY = "0">
			<Integer>
				<Value>0</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "NullCellValue" MANDATORY = "0">
			<Double>
				<Value>0</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CellType" MANDATORY = "0">
			<String>
				<Value>FLOAT_COMPLEX</Value>
			</String>
		</FIELD>
		<FIELD NAME = "BytesOrder" MANDATORY = "0">
			<String>
				<Value>LSBF</Value>
			</String>
		</FIELD>
		<FIELD NAME = "DataUnits" MANDATORY = "0">
			<String>
				<Value>VOLT</Value>
			</String>
		</FIELD>
		<FIELD NAME = "NAzimuthLooks" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "NRangeLooks" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "ACQUISITION_STATION" MANDATORY = "0">
			<String>
				<Value>SIM-PAF</Value>
			</String>
		</FIELD>
		<FIELD NAME = "PROC_CENTER" MANDATORY = "0">
			<String>
				<Value>Orvane - Lumbrao</Value>
			</String>
		</FIELD>
		<FIELD NAME = "PROC_TIME" MANDATORY = "0">
			<String>
				<Value>Mon Nov 23 20:28:16 2026</Value>
			</String>
		</FIELD>
		<FIELD NAME = "ABS_ORBIT" MANDATORY = "0">
			<Integer>
				<Value>77106</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "SOFTWARE" MANDATORY = "0">
			<String>
				<Value>stripmap_focuser</Value>
			</String>
		</FIELD>
		<FIELD NAME = "CalConstProc" MANDATORY = "0">
			<Double>
				<Value>1</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "SensorName" MANDATORY = "0">
			<String>
				<Value>ERS2</Value>
			</String>
		</FIELD>
		<FIELD NAME = "Description" MANDATORY = "0">
			<String>
				<Value>ERS2_IM</Value>
			</String>
		</FIELD>
		<FIELD NAME = "OrbitConfiguration" MANDATORY = "0">
			<String>
				<Value>ASCENDING</Value>
			</String>
		</FIELD>
		<FIELD NAME = "SceneHeading" MANDATORY = "0">
			<Double>
				<Value>-999</Value>
			</Double>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>sar_processing</NAME>
		<NumberOfElements>12</NumberOfElements>
		<FIELD NAME = "nDopCenDataSet" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "DopCenRefTime" MANDATORY = "0">
			<String>
				<NumberOfElements>1</NumberOfElements>
				<Vector>
					<Value>18-JAN-2010 17:49:28.683000</Value>
				</Vector>
			</String>
		</FIELD>
		<FIELD NAME = "DopCenRgRefTime" MANDATORY = "0">
			<Double>
				<NumberOfElements>1</NumberOfElements>
				<Vector>
					<Value>0.00555003201588988</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "DopCenPol_nCoeff" MANDATORY = "0">
			<Integer>
				<Value>7</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "DopCenRangeCoeff" MANDATORY = "0">
			<Double>
				<Matrix ROWS = "1" COLUMNS = "7">
					<MatrixRow>
						<Value>258.004865603698</Value>
						<Value>-83349.990341817</Value>
						<Value>-3.83730855197092</Value>
						<Value>0</Value>
						<Value>0</Value>
						<Value>0</Value>
						<Value>0</Value>
					</MatrixRow>
				</Matrix>
			</Double>
		</FIELD>
		<FIELD NAME = "nDopRateDataSet" MANDATORY = "0">
			<Integer>
				<Value>1</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "DopRateRangeCoeff" MANDATORY = "0">
			<Double>
				<Matrix ROWS = "1" COLUMNS = "7">
					<MatrixRow>
						<Value>-2150.04824320593</Value>
						<Value>405937.781108797</Value>
						<Value>0</Value>
						<Value>0</Value>
						<Value>-79019708.4548766</Value>
						<Value>0</Value>
						<Value>0</Value>
					</MatrixRow>
				</Matrix>
			</Double>
		</FIELD>
		<FIELD NAME = "DopRateRefTime" MANDATORY = "0">
			<String>
				<NumberOfElements>1</NumberOfElements>
				<Vector>
					<Value>18-JAN-2010 17:49:28.683000</Value>
				</Vector>
			</String>
		</FIELD>
		<FIELD NAME = "DopRateRgRefTime" MANDATORY = "0">
			<Double>
				<NumberOfElements>1</NumberOfElements>
				<Vector>
					<Value>0.00555003201588988</Value>
				</Vector>
			</Double>
		</FIELD>
		<FIELD NAME = "DopRatePol_nCoeff" MANDATORY = "0">
			<Integer>
				<Value>7</Value>
			</Integer>
		</FIELD>
		<FIELD NAME = "PixelSpacingAz" MANDATORY = "0">
			<Double>
				<Value>4.1373250589927775</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "ProcessingVelocity" MANDATORY = "0">
			<Double>
				<Value>6950.30064125208</Value>
			</Double>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>Sensor</NAME>
		<NumberOfElements>6</NumberOfElements>
		<FIELD NAME = "CarrierFrequency" MANDATORY = "1">
			<Double>
				<Value>5.3e+09</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "PRFExtracted" MANDATORY = "1">
			<Double>
				<Value>1679.902</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "Inter_Burst_Time" MANDATORY = "0">
			<Double>
				<Value>-999</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "BandWidth" MANDATORY = "1">
			<Double>
				<Value>15508290.56</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "SamplingRate" MANDATORY = "1">
			<Double>
				<Value>18962468</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "PulseDuration" MANDATORY = "1">
			<Double>
				<Value>3.712e-05</Value>
			</Double>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>RegistrationCoordinates</NAME>
		<NumberOfElements>1</NumberOfElements>
		<FIELD NAME = "Units" MANDATORY = "0">
			<String>
				<Value>DEGREES</Value>
			</String>
		</FIELD>
	</SECTION>
	<SECTION>
		<NAME>CartographicSystem</NAME>
		<NumberOfElements>16</NumberOfElements>
		<FIELD NAME = "CORNER POINT 1  X" MANDATORY = "0">
			<Double>
				<Value>-4.1297448267989</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 1  Y" MANDATORY = "0">
			<Double>
				<Value>40.1970948916897</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 2  X" MANDATORY = "0">
			<Double>
				<Value>-3.81368438476475</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 2  Y" MANDATORY = "0">
			<Double>
				<Value>40.2488762224243</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 3  X" MANDATORY = "0">
			<Double>
				<Value>-3.79839518470599</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 3  Y" MANDATORY = "0">
			<Double>
				<Value>40.1950264371113</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 4  X" MANDATORY = "0">
			<Double>
				<Value>-4.11416835082835</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CORNER POINT 4  Y" MANDATORY = "0">
			<Double>
				<Value>40.1432627838582</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CENTER SCENE POINT X" MANDATORY = "0">
			<Double>
				<Value>-3.96058172709286</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "CENTER SCENE POINT Y" MANDATORY = "0">
			<Double>
				<Value>40.1967421343501</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "RangeLookAngle" MANDATORY = "0">
			<Double>
				<Value>19.1179927792078</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "IncidenceAngle" MANDATORY = "0">
			<Double>
				<Value>21.585452368545</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "LatNorthing" MANDATORY = "0">
			<Double>
				<Value>40.1967421343501</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "LonEasting" MANDATORY = "0">
			<Double>
				<Value>-3.96058172709286</Value>
			</Double>
		</FIELD>
		<FIELD NAME = "UTM_HEMISPHERE" MANDATORY = "0">
			<String>
				<Value>NORTH</Value>
			</String>
		</FIELD>
		<FIELD NAME = "UTM_ZONE" MANDATORY = "0">
			<Integer>
				<Value>30</Value>
			</Integer>
		</FIELD>
	</SECTION>
</HEADER_INFO>
